#pragma once

#include <cstdint>
#include <map>
#include <mutex>
#include <string>
#include <string_view>

#include "fleet/DeviceSummary.h"

namespace fleet {

// A device whose last metric is older than this shows as silent.
inline constexpr std::int64_t kSilentAfterMs = 30'000;

// Every device seen under one topic prefix, each as a summary, from the messages on
// PREFIX/DEVICE/metrics and PREFIX/DEVICE/status. Times are milliseconds of one clock that the
// caller chooses. Any thread.
class Fleet {
 public:
  explicit Fleet(std::string prefix);

  // Messages on other topics are passed over; messages that do not read are counted against
  // their device.
  void receive(std::string_view topic, std::string_view payload, std::int64_t nowMs);

  // {"prefix": P, "devices": [{"device", "status", "source", "technology", "network", "cell",
  //  "band", "levels", "metrics", "refused", "dropped", "age_ms", "silent"}, ...]} by device name;
  // "age_ms" is null before a device's first metric.
  std::string json(std::int64_t nowMs) const;

  std::size_t size() const;

 private:
  const std::string prefix_;
  mutable std::mutex mutex_;
  std::map<std::string, DeviceSummary, std::less<>> devices_;
};

}  // namespace fleet
