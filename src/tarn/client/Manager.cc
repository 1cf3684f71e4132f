#include "tarn/client/Manager.h"

#include <mutex>
#include <unordered_map>
#include <vector>

namespace tarn::client {

// The session's event handlers, and the events on their way to the session's queue. Events wait
// here and one task at a time on the queue hands them on, so a burst of events costs one hop to
// the queue rather than one per event.
class Manager::Events : public std::enable_shared_from_this<Events> {
 public:
  explicit Events(platform::SerialQueue queue) : queue_(std::move(queue)) {}

  void setHandler(std::string event, EventHandler handler) {
    auto shared = std::make_shared<const EventHandler>(std::move(handler));
    const std::lock_guard lock(mutex_);
    handlers_.insert_or_assign(std::move(event), std::move(shared));
  }

  // Any thread.
  void put(std::string_view event, ipc::Object object) {
    {
      const std::lock_guard lock(mutex_);
      pending_.push_back({std::string(event), std::move(object)});
      if (handOnQueued_) return;
      handOnQueued_ = true;
    }
    queue_.async([weak = weak_from_this()] {
      if (const auto events = weak.lock()) events->handOn();
    });
  }

 private:
  struct Pending {
    std::string event;
    ipc::Object object;
  };

  // On the session's queue. Handlers run outside the lock, so that they may register handlers.
  void handOn() {
    std::vector<Pending> batch;
    {
      const std::lock_guard lock(mutex_);
      batch.swap(pending_);
      handOnQueued_ = false;
    }
    for (const Pending& pending : batch) {
      if (const auto handler = handlerFor(pending.event)) (*handler)(pending.object, {});
    }
  }

  std::shared_ptr<const EventHandler> handlerFor(const std::string& event) {
    const std::lock_guard lock(mutex_);
    const auto found = handlers_.find(event);
    return found != handlers_.end() ? found->second : nullptr;
  }

  const platform::SerialQueue queue_;
  std::mutex mutex_;
  std::unordered_map<std::string, std::shared_ptr<const EventHandler>> handlers_;
  std::vector<Pending> pending_;
  bool handOnQueued_ = false;
};

std::shared_ptr<Manager> Manager::open(const std::string& clientName, platform::SerialQueue queue,
                                       Transport& transport) {
  std::shared_ptr<Manager> manager(new Manager(std::make_shared<Events>(std::move(queue))));
  manager->connection_ = transport.connect(
      clientName,
      [events = std::weak_ptr(manager->events_)](std::string_view event, ipc::Object object) {
        if (const auto live = events.lock()) live->put(event, std::move(object));
      });
  if (!manager->connection_) return nullptr;
  return manager;
}

Manager::Manager(std::shared_ptr<Events> events) : events_(std::move(events)) {}

Manager::~Manager() = default;

CommandResult Manager::perform(std::string_view command, const ipc::Object& input,
                               ipc::Object& output) {
  return connection_->perform(command, input, output);
}

void Manager::registerEventHandler(std::string event, EventHandler handler) {
  events_->setHandler(std::move(event), std::move(handler));
}

void Manager::setEventsOn(bool on) {
  connection_->setEventsOn(on);
}

}  // namespace tarn::client
