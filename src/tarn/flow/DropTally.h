#pragma once

#include <chrono>
#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <string_view>

#include "tarn/Ipc.h"

namespace tarn::flow {

// Counts the items a bounded queue dropped, by kind, and words them for a log line at most once
// a second. Not thread-safe.
class DropTally {
 public:
  using Clock = std::chrono::steady_clock;

  // `who` starts the line, such as "tarnd".
  explicit DropTally(std::string who) : who_(std::move(who)) {}

  void count(std::uint64_t kind) { ++sinceReport_[kind]; }

  // The line that reports the drops counted since the last one, when there are some and the
  // last line is at least a second old at `now`:
  //   "tarnd: fell behind; dropped 12 event(s), the oldest of their kind: 0x3C4E04 ×10, 0x3CD313
  //   ×2"
  std::optional<std::string> report(Clock::time_point now);

 private:
  const std::string who_;
  std::map<std::uint64_t, std::uint64_t> sinceReport_;
  std::optional<Clock::time_point> lastReport_;
};

// The kind of an event: its metric ID for a metric, 0 for any other event.
std::uint64_t kindOfEvent(std::string_view event, const ipc::Object& object);

// The name of an event kind in reports: a metric ID in hex, or "events" for the events that are
// no metric (kind 0).
std::string kindName(std::uint64_t kind);

}  // namespace tarn::flow
