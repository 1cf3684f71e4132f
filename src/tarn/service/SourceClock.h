#pragma once

#include <chrono>
#include <condition_variable>
#include <memory>
#include <mutex>
#include <stop_token>

namespace tarn::service {

// The time a metric source paces itself by, and its way of waiting for it. A test hands a
// source a clock that it moves on by hand, so that nothing waits on the wall clock.
class SourceClock {
 public:
  using TimePoint = std::chrono::steady_clock::time_point;

  virtual ~SourceClock() = default;

  virtual TimePoint now() const = 0;
  // Releases `lock`, waits until the clock reaches `deadline` or `stop` is requested, and takes
  // `lock` again. True when stop was requested.
  virtual bool waitUntil(std::unique_lock<std::mutex>& lock, std::stop_token stop,
                         TimePoint deadline) = 0;
};

// The steady clock of the machine.
class SteadyClock final : public SourceClock {
 public:
  static std::shared_ptr<SourceClock> shared() {
    static const auto clock = std::make_shared<SteadyClock>();
    return clock;
  }

  TimePoint now() const override { return std::chrono::steady_clock::now(); }
  bool waitUntil(std::unique_lock<std::mutex>& lock, std::stop_token stop,
                 TimePoint deadline) override {
    std::condition_variable_any stopped;
    return stopped.wait_until(lock, stop, deadline, [&stop] { return stop.stop_requested(); });
  }
};

}  // namespace tarn::service
