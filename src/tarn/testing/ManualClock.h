#pragma once

#include <algorithm>
#include <chrono>
#include <condition_variable>
#include <mutex>
#include <set>
#include <stop_token>

#include "tarn/service/SourceClock.h"

namespace tarn::testing {

// A source clock that stands still until a test moves it on.
class ManualClock final : public service::SourceClock {
 public:
  TimePoint now() const override {
    const std::lock_guard lock(mutex_);
    return now_;
  }

  bool waitUntil(std::unique_lock<std::mutex>& lock, std::stop_token stop,
                 TimePoint deadline) override {
    lock.unlock();
    bool reached = false;
    {
      std::unique_lock own(mutex_);
      const auto waiting = deadlines_.insert(deadline);
      changed_.notify_all();
      reached = changed_.wait(own, stop, [this, deadline] { return now_ >= deadline; });
      deadlines_.erase(waiting);
    }
    lock.lock();
    return !reached;
  }

  void advance(std::chrono::nanoseconds by) {
    const std::lock_guard lock(mutex_);
    now_ += by;
    changed_.notify_all();
  }

  // Returns once a source waits for a time still to come: it has done all that was due.
  void awaitWaiter() {
    std::unique_lock lock(mutex_);
    changed_.wait(lock, [this] {
      return std::any_of(deadlines_.begin(), deadlines_.end(),
                         [this](TimePoint deadline) { return deadline > now_; });
    });
  }

 private:
  mutable std::mutex mutex_;
  std::condition_variable_any changed_;
  TimePoint now_{};
  std::multiset<TimePoint> deadlines_;
};

}  // namespace tarn::testing
