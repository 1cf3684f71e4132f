#include "tarn/flow/DropTally.h"

#include "platform/Format.h"

namespace tarn::flow {

std::optional<std::string> DropTally::report(Clock::time_point now) {
  if (sinceReport_.empty()) return std::nullopt;
  if (lastReport_ && now - *lastReport_ < std::chrono::seconds(1)) return std::nullopt;
  std::uint64_t total = 0;
  std::string kinds;
  for (const auto& [kind, count] : sinceReport_) {
    total += count;
    if (!kinds.empty()) kinds += ", ";
    kinds += platform::format("%s \u00D7%llu", kindName(kind), count);
  }
  sinceReport_.clear();
  lastReport_ = now;
  return platform::format("%s: fell behind; dropped %llu event(s), the oldest of their kind: %s",
                          who_, total, kinds);
}

std::string kindName(std::uint64_t kind) {
  return kind == 0 ? std::string("events") : platform::format("0x%llX", kind);
}

}  // namespace tarn::flow
