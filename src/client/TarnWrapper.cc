#include "client/TarnWrapper.h"

#include <array>
#include <condition_variable>
#include <fstream>
#include <mutex>
#include <string>

#include "platform/Log.h"
#include "platform/MainQueue.h"
#include "platform/Once.h"
#include "tarn/Names.h"

namespace {

using tarn::ipc::Object;

constexpr std::int64_t kAppId = 2;
constexpr std::int64_t kPayloadType = 0;
constexpr const char* kQueueLabel = "org.norvo.viewer.serialQ.queue";

constexpr const char* kAddName = "-[TarnWrapper addVelaConfigForAppId:andProtofFilePath:]";
constexpr const char* kRemoveName = "-[TarnWrapper removeVelaConfigForAppid:]";
constexpr const char* kQueryName =
    "-[TarnWrapper querySpecificMetric:triggerRef:triggerType:triggerID:profileID:metricID:]";
constexpr const char* kListenName = "-[TarnWrapper listen]";
constexpr const char* kHandlerName = "-[TarnWrapper listen]_block_invoke";

// Delegate calls posted to the main queue and not yet run. The session's queue waits while this
// many are on their way, so that the main queue, which also answers the pages, never has more
// than a moment's work of metrics ahead of a request; the events then wait in the session, which
// holds their source back or keeps the latest of each kind.
constexpr std::size_t kMostOnTheirWay = 64;

// The events that listen() registers for, and where each goes.
struct Listener {
  std::string_view event;
  const char* logFormat;
  void (TarnWrapperDelegate::*operation)(const platform::Dictionary&);
};

constexpr Listener kListeners[] = {
    {tarn::kEventTrigger, "%s: EventTrigger dict=%@", &TarnWrapperDelegate::eventsDidUpdate},
    {tarn::kEventMetric, "%s: MetricsTrigger dict=%@", &TarnWrapperDelegate::metricsDidUpdate},
};

// The whole file, or nothing when it cannot be read. Read a block at a time: a configuration may
// be as large as a message carries, tens of megabytes.
platform::Bytes readWholeFile(std::string_view path) {
  std::ifstream file{std::string(path), std::ios::binary};
  platform::Bytes bytes;
  std::array<char, std::size_t{1} << 16> block{};
  while (file.read(block.data(), static_cast<std::streamsize>(block.size())) || file.gcount() > 0) {
    bytes.insert(bytes.end(), block.begin(), block.begin() + file.gcount());
  }
  return bytes;
}

Object::Entry entry(std::string_view key, Object value) {
  return {std::string(key), std::move(value)};
}

}  // namespace

TarnWrapper& TarnWrapper::sharedInstance() {
  static TarnWrapper* const instance = new TarnWrapper;
  return *instance;
}

// The hop from the session's queue to the main queue, with at most kMostOnTheirWay calls on
// their way.
class TarnWrapper::MainQueueHop : public std::enable_shared_from_this<MainQueueHop> {
 public:
  // Waits for room, then posts `call`; posts nothing once abandoned.
  void post(std::function<void()> call) {
    {
      std::unique_lock lock(mutex_);
      roomLeft_.wait(lock, [this] { return onTheirWay_ < kMostOnTheirWay || abandoned_; });
      if (abandoned_) return;
      ++onTheirWay_;
    }
    platform::postToMainQueue([hop = shared_from_this(), call = std::move(call)] {
      hop->arrived();
      call();
    });
  }

  // Its wrapper has gone: a wait for room ends.
  void abandon() {
    const std::lock_guard lock(mutex_);
    abandoned_ = true;
    roomLeft_.notify_all();
  }

 private:
  void arrived() {
    const std::lock_guard lock(mutex_);
    --onTheirWay_;
    roomLeft_.notify_one();
  }

  std::mutex mutex_;
  std::condition_variable roomLeft_;
  std::size_t onTheirWay_ = 0;
  bool abandoned_ = false;
};

TarnWrapper::TarnWrapper()
    : delegate_(std::make_shared<DelegateSlot>()), hop_(std::make_shared<MainQueueHop>()) {
  tarnManager_ = tarn::client::CreateManager(std::string(kAppName), queue());
}

TarnWrapper::TarnWrapper(tarn::client::Transport& transport)
    : delegate_(std::make_shared<DelegateSlot>()), hop_(std::make_shared<MainQueueHop>()) {
  tarnManager_ = tarn::client::CreateManager(std::string(kAppName), queue(), transport);
}

TarnWrapper::~TarnWrapper() {
  delegate_->store({});
  hop_->abandon();
}

platform::SerialQueue TarnWrapper::queue() {
  // One queue for the process: every wrapper's session delivers on it.
  static platform::Once once;
  static platform::SerialQueue* shared = nullptr;
  once([] { shared = new platform::SerialQueue(kQueueLabel); });
  if (!queue_) queue_ = *shared;
  return *queue_;
}

bool TarnWrapper::addVelaConfigForAppId(std::string_view appId, std::string_view path) {
  if (appId != kAppName) return false;
  Object payload = Object::bytes(readWholeFile(path));
  if (payload.isNull()) return false;
  return perform(kAddName, tarn::kCommandAddConfiguration,
                 {entry(tarn::kKeyAppID, Object::integer(kAppId)),
                  entry(tarn::kKeyPayload, std::move(payload)),
                  entry(tarn::kKeyPayloadType, Object::integer(kPayloadType))});
}

bool TarnWrapper::removeVelaConfigForAppid(std::string_view appId) {
  if (appId != kAppName) return false;
  return perform(kRemoveName, tarn::kCommandClearConfiguration,
                 {entry(tarn::kKeyAppID, Object::integer(kAppId))});
}

bool TarnWrapper::querySpecificMetric(std::string_view appId, std::int32_t triggerRef,
                                      std::int32_t triggerType, std::int32_t triggerID,
                                      std::int32_t profileID, std::int32_t metricID) {
  if (appId != kAppName) return false;
  return perform(kQueryName, tarn::kCommandQueryMetric,
                 {entry(tarn::kKeyAppID, Object::integer(kAppId)),
                  entry(tarn::kKeyPayloadType, Object::integer(kPayloadType)),
                  entry(tarn::kKeyTriggerRef, Object::integer(triggerRef)),
                  entry(tarn::kKeyTriggerType, Object::integer(triggerType)),
                  entry(tarn::kKeyTriggerID, Object::integer(triggerID)),
                  entry(tarn::kKeyProfileID, Object::integer(profileID)),
                  entry(tarn::kKeyMetricID, Object::integer(metricID))});
}

bool TarnWrapper::perform(const char* logName, std::string_view command, Object::Entries entries) {
  const Object input = Object::dictionary(std::move(entries));
  Object output;
  const tarn::client::CommandResult result =
      tarn::client::PerformCommand(tarnManager_, std::string(command), input, output);
  platform::log::systemf("%s: error=%d msg=%s", logName, result.status, result.message);
  return result.status == 0;
}

void TarnWrapper::listen() {
  for (const Listener& listener : kListeners) {
    tarn::client::RegisterEventHandler(
        tarnManager_, std::string(listener.event),
        [delegate = delegate_, hop = hop_, listener](const Object& object,
                                                     tarn::client::CompletionGroup) {
          platform::Value plain = tarn::ipc::toPlainDictionary(object);
          platform::log::systemf(listener.logFormat, kHandlerName, plain);
          // The delegate operations take dictionaries; anything else is only logged.
          if (delegate->load().expired() || !plain.isDictionary()) return;
          // The task holds the delegate slot rather than the wrapper, which may be gone by then.
          hop->post([delegate, operation = listener.operation,
                     dictionary = std::move(*plain.asDictionary())] {
            if (const auto receiver = delegate->load().lock()) ((*receiver).*operation)(dictionary);
          });
        });
  }
  tarn::client::EventsOff(tarnManager_);
  tarn::client::EventsOn(tarnManager_);
  platform::log::systemf("%s: listening for events", kListenName);
}

std::weak_ptr<TarnWrapperDelegate> TarnWrapper::delegate() const {
  return delegate_->load();
}

void TarnWrapper::setDelegate(std::weak_ptr<TarnWrapperDelegate> delegate) {
  delegate_->store(std::move(delegate));
}
