#pragma once

#include <chrono>
#include <cstdint>
#include <memory>
#include <optional>
#include <ostream>
#include <span>
#include <string>
#include <string_view>

#include "app/ServiceOption.h"
#include "client/TarnWrapperDelegate.h"
#include "export/MetricExport.h"
#include "tarn/log/MetricLog.h"

namespace app {

// `norvo record OUT.jsonl [--to FORMAT] [--seconds N] [--seed S] [--speed X] [--service WHERE]`:
// records what the baseband service delivers to the app into a metric log, or live into an
// export format (`--to pcapng -` for Wireshark). Answers the exit status.
int runRecordCommand(std::span<const std::string_view> arguments);

// Writes each metric it receives to a metric log, with "t_ms" counted from its construction, and
// hands it on to `next`, if any.
class MetricRecorder final : public TarnWrapperDelegate {
 public:
  explicit MetricRecorder(std::ostream& log, TarnWrapperDelegate* next = nullptr)
      : writer_(log), next_(next) {}

  void metricsDidUpdate(const platform::Dictionary& metric) override;
  void eventsDidUpdate(const platform::Dictionary&) override {}

 private:
  const std::chrono::steady_clock::time_point began_ = std::chrono::steady_clock::now();
  tarn::log::MetricLogWriter writer_;
  TarnWrapperDelegate* next_;
};

// Hands each metric it receives to an export as it comes, with "t_ms" counted from its
// construction, and stops the main queue when the export's output fails (a reader that went away).
class MetricExporter final : public TarnWrapperDelegate {
 public:
  explicit MetricExporter(exporting::MetricExport& out) : out_(out) {}

  void metricsDidUpdate(const platform::Dictionary& metric) override;
  void eventsDidUpdate(const platform::Dictionary&) override {}
  bool failed() const { return failed_; }

 private:
  const std::chrono::steady_clock::time_point began_ = std::chrono::steady_clock::now();
  exporting::MetricExport& out_;
  exporting::MetricTimes times_;
  bool failed_ = false;
};

struct RecordingRun {
  // With the service inside Norvo, the simulated phone runs the drive `seed` at `speed`.
  ServiceChoice service;
  std::uint64_t seed = 1;
  double speed = 1.0;
  // Until Ctrl-C when empty.
  std::optional<std::chrono::milliseconds> duration;
};

// Opens a session with the chosen service (inside Norvo, with the simulator) that subscribes with
// the configuration at `configurationPath` and asks for the SIM files as the app does, and hands
// every delivered metric to `receiver` on the main queue until the run is over or SIGINT or
// SIGTERM arrives. False when the service refused the configuration.
bool runRecordingSession(const RecordingRun& run, const std::string& configurationPath,
                         const std::shared_ptr<TarnWrapperDelegate>& receiver);

}  // namespace app
