#pragma once

#include <chrono>
#include <functional>
#include <memory>

namespace ui {

// A timer on the main queue. The handle owns it: destroying or invalidating the handle stops it,
// so a screen's timer ends with the screen.
class Timer {
 public:
  using Interval = std::chrono::steady_clock::duration;

  Timer() = default;
  ~Timer();
  Timer(Timer&& other) noexcept = default;
  Timer& operator=(Timer&& other) noexcept;

  // Calls `action` on the main queue one `interval` from now, and every `interval` after that if
  // `repeats`. Firings are spaced from the scheduled times, so they do not drift.
  static Timer scheduledTimer(Interval interval, std::function<void()> action, bool repeats);

  // No firing starts after this; one that is running finishes.
  void invalidate();
  bool isValid() const;

 private:
  struct State;

  explicit Timer(std::shared_ptr<State> state) : state_(std::move(state)) {}

  std::shared_ptr<State> state_;
};

}  // namespace ui
