#include "ui/Timer.h"

#include <boost/asio/steady_timer.hpp>
#include <utility>

#include "platform/MainQueue.h"

namespace ui {

struct Timer::State {
  State(Interval period, std::function<void()> work, bool repeating)
      : timer(platform::mainQueue()),
        interval(period),
        action(std::move(work)),
        repeats(repeating) {}

  boost::asio::steady_timer timer;
  const Interval interval;
  const std::function<void()> action;
  const bool repeats;
  bool valid = true;
};

namespace {

template <class State>
void arm(const std::shared_ptr<State>& state) {
  state->timer.expires_at(state->timer.expiry() + state->interval);
  // The pending wait keeps the state alive, so a handle may go away at any time.
  state->timer.async_wait([state](const boost::system::error_code& error) {
    if (error || !state->valid) return;
    if (!state->repeats) state->valid = false;
    state->action();
    if (state->valid) arm(state);
  });
}

}  // namespace

Timer::~Timer() {
  invalidate();
}

Timer& Timer::operator=(Timer&& other) noexcept {
  if (this != &other) {
    invalidate();
    state_ = std::move(other.state_);
  }
  return *this;
}

Timer Timer::scheduledTimer(Interval interval, std::function<void()> action, bool repeats) {
  auto state = std::make_shared<State>(interval, std::move(action), repeats);
  state->timer.expires_at(std::chrono::steady_clock::now());
  arm(state);
  return Timer(std::move(state));
}

void Timer::invalidate() {
  if (!state_) return;
  state_->valid = false;
  state_->timer.cancel();
  state_.reset();
}

bool Timer::isValid() const {
  return state_ && state_->valid;
}

}  // namespace ui
