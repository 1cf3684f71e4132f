#include "tarn/client/Manager.h"

#include <mutex>
#include <unordered_map>
#include <vector>

#include "platform/Log.h"
#include "tarn/client/Drops.h"
#include "tarn/flow/DropTally.h"
#include "tarn/flow/KindQueue.h"

namespace tarn::client {

namespace {

// Events that wait for the session's queue. Past kFallingBehind the sender is told to hold back;
// past kMostWaiting the oldest event of the most frequent kind is dropped for each new one.
constexpr std::size_t kMostWaiting = 4096;
constexpr std::size_t kFallingBehind = 512;

}  // namespace

// The session's event handlers, and the events on their way to the session's queue. Events wait
// here and one task at a time on the queue hands them on, so a burst of events costs one hop to
// the queue rather than one per event.
class Manager::Events : public std::enable_shared_from_this<Events> {
 public:
  explicit Events(const platform::SerialQueue& queue) : queue_(queue) {}

  void setHandler(std::string event, EventHandler handler) {
    auto shared = std::make_shared<const EventHandler>(std::move(handler));
    const std::lock_guard lock(mutex_);
    handlers_.insert_or_assign(std::move(event), std::move(shared));
  }

  // Any thread. Answers false when the session is falling behind.
  bool put(std::string_view event, ipc::Object object) {
    bool keepingUp = true;
    {
      const std::lock_guard lock(mutex_);
      const std::uint64_t kind = flow::kindOfEvent(event, object);
      if (const auto dropped = pending_.push(kind, {std::string(event), std::move(object)})) {
        drops_.count(*dropped);
        countDroppedEvent(*dropped);
      }
      keepingUp = pending_.size() < kFallingBehind;
      if (handOnQueued_) return keepingUp;
      handOnQueued_ = true;
    }
    queue_.async([weak = weak_from_this()] {
      if (const auto events = weak.lock()) events->handOn();
    });
    return keepingUp;
  }

 private:
  struct Pending {
    std::string event;
    ipc::Object object;
  };

  // On the session's queue. Handlers run outside the lock, so that they may register handlers.
  void handOn() {
    std::vector<Pending> batch;
    std::optional<std::string> dropReport;
    {
      const std::lock_guard lock(mutex_);
      batch = pending_.takeAll();
      handOnQueued_ = false;
      dropReport = drops_.report(flow::DropTally::Clock::now());
    }
    if (dropReport) platform::log::warning(*dropReport);
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
  flow::KindQueue<Pending> pending_{kMostWaiting};
  flow::DropTally drops_{"tarn::client"};
  bool handOnQueued_ = false;
};

std::shared_ptr<Manager> Manager::open(const std::string& clientName,
                                       const platform::SerialQueue& queue, Transport& transport) {
  std::shared_ptr<Manager> manager(new Manager(std::make_shared<Events>(queue)));
  manager->connection_ = transport.connect(
      clientName,
      [events = std::weak_ptr(manager->events_)](std::string_view event, ipc::Object object) {
        const auto live = events.lock();
        return live == nullptr || live->put(event, std::move(object));
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
