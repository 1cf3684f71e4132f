#include "RecordingSession.h"

#include <future>

#include "Records.h"
#include "tarn/Names.h"

namespace bustest {

using tarn::ipc::Object;

RecordingSession::RecordingSession(tarn::client::Transport& transport,
                                   const std::string& clientName)
    : manager_(tarn::client::CreateManager(clientName, queue_, transport)) {
  if (!manager_) return;
  for (const std::string_view name : {tarn::kEventMetric, tarn::kEventTrigger}) {
    tarn::client::RegisterEventHandler(
        manager_, std::string(name),
        [this, name](const Object& record, tarn::client::CompletionGroup) {
          const std::lock_guard lock(mutex_);
          events_.push_back({std::string(name), record});
          arrived_.notify_all();
        });
  }
  tarn::client::EventsOn(manager_);
}

RecordingSession::~RecordingSession() {
  manager_.reset();
  // Handlers may still be on their way through the queue.
  std::promise<void> drained;
  queue_.async([&drained] { drained.set_value(); });
  drained.get_future().wait();
}

tarn::CommandResult RecordingSession::perform(std::string_view command, const Object& input) {
  Object output;
  return tarn::client::PerformCommand(manager_, std::string(command), input, output);
}

tarn::CommandResult RecordingSession::configure(std::string_view text) {
  return perform(tarn::kCommandAddConfiguration,
                 withAppId({entry(tarn::kKeyPayload, bytesOf(text))}));
}

std::vector<ReceivedEvent> RecordingSession::waitFor(std::size_t count,
                                                     std::chrono::milliseconds timeout) {
  std::unique_lock lock(mutex_);
  arrived_.wait_for(lock, timeout, [&] { return events_.size() >= count; });
  return events_;
}

std::vector<ReceivedEvent> RecordingSession::received() const {
  const std::lock_guard lock(mutex_);
  return events_;
}

std::vector<std::int64_t> metricIdsOf(const std::vector<ReceivedEvent>& events) {
  std::vector<std::int64_t> ids;
  for (const ReceivedEvent& event : events) {
    if (event.name == tarn::kEventMetric)
      ids.push_back(integerAt(event.record, tarn::kKeyMetricID));
  }
  return ids;
}

}  // namespace bustest
