#pragma once

#include <chrono>
#include <cstdint>
#include <optional>

#include "store/MetricValidator.h"

namespace app {

// The time of the latest record the intake accepted, in milliseconds since 1970: the series and
// the alerts go by it, so that a replay shows the drive's own times, at any speed, and a seek
// rebuilds them as they were. Before the first record, the wall clock.
class RecordClock {
 public:
  explicit RecordClock(store::MetricValidator& intake) {
    intake.addAcceptedMetricObserver(
        [this](std::int64_t, const platform::Bytes*, const platform::Dictionary& decoded) {
          const platform::Value* timestamp = decoded.find("timestamp");
          if (const auto ms = timestamp != nullptr ? timestamp->asInteger() : std::nullopt)
            latestMs_ = *ms;
        });
  }
  RecordClock(const RecordClock&) = delete;
  RecordClock& operator=(const RecordClock&) = delete;

  std::int64_t nowMs() const { return latestMs_.value_or(wallClockMs()); }
  void reset() { latestMs_.reset(); }

  static std::int64_t wallClockMs() {
    return std::chrono::duration_cast<std::chrono::milliseconds>(
               std::chrono::system_clock::now().time_since_epoch())
        .count();
  }

 private:
  std::optional<std::int64_t> latestMs_;
};

}  // namespace app
