#pragma once

#include <chrono>
#include <condition_variable>
#include <cstdint>
#include <memory>
#include <mutex>
#include <string>
#include <string_view>
#include <vector>

#include "platform/SerialQueue.h"
#include "tarn/client/Client.h"
#include "tarn/client/Transport.h"

namespace bustest {

struct ReceivedEvent {
  std::string name;
  tarn::ipc::Object record;

  bool operator==(const ReceivedEvent&) const = default;
};

// A client library session over `transport`, with its events on, that keeps every event it
// receives.
class RecordingSession {
 public:
  // The session is empty when the service could not be reached.
  explicit RecordingSession(tarn::client::Transport& transport,
                            const std::string& clientName = "vexmora");
  ~RecordingSession();
  RecordingSession(const RecordingSession&) = delete;
  RecordingSession& operator=(const RecordingSession&) = delete;

  const std::shared_ptr<tarn::client::Manager>& manager() const { return manager_; }

  tarn::CommandResult perform(std::string_view command, const tarn::ipc::Object& input);
  // Pushes `text` as the configuration of the app "vexmora".
  tarn::CommandResult configure(std::string_view text);

  // Waits up to `timeout` until `count` events have arrived in all; answers every event so far.
  std::vector<ReceivedEvent> waitFor(std::size_t count,
                                     std::chrono::milliseconds timeout = std::chrono::seconds(10));
  std::vector<ReceivedEvent> received() const;

 private:
  platform::SerialQueue queue_{"org.norvo.test.session"};
  mutable std::mutex mutex_;
  std::condition_variable arrived_;
  std::vector<ReceivedEvent> events_;
  std::shared_ptr<tarn::client::Manager> manager_;
};

// The "kKeyMetricID" of each metric event, in order.
std::vector<std::int64_t> metricIdsOf(const std::vector<ReceivedEvent>& events);

}  // namespace bustest
