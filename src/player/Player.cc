#include "player/Player.h"

#include <algorithm>
#include <limits>
#include <stdexcept>

namespace player {

namespace {

std::optional<double> checked(std::optional<double> speed) {
  if (speed && !(*speed > 0.0)) throw std::invalid_argument("the replay speed must be above 0");
  return speed;
}

}  // namespace

Player::Player(Drive drive, Target target, std::optional<double> speed, bool loop,
               std::function<Clock::time_point()> now)
    : drive_(std::move(drive)),
      target_(std::move(target)),
      loop_(loop),
      now_(std::move(now)),
      speed_(checked(speed)),
      anchorTime_(now_()) {}

std::int64_t Player::positionAt(Clock::time_point time) const {
  if (!playing_ || !speed_) return anchorMs_;
  const double elapsedMs = std::chrono::duration<double, std::milli>(time - anchorTime_).count();
  const double position = static_cast<double>(anchorMs_) + elapsedMs * *speed_;
  return std::clamp(static_cast<std::int64_t>(position), anchorMs_, drive_.durationMs());
}

void Player::anchor(std::int64_t positionMs) {
  anchorMs_ = positionMs;
  anchorTime_ = now_();
}

void Player::play() {
  if (playing_) return;
  if (next_ == drive_.metrics.size() && !loop_) seek(0);
  anchor(anchorMs_);
  playing_ = true;
}

void Player::pause() {
  if (!playing_) return;
  anchor(positionAt(now_()));
  playing_ = false;
}

void Player::setSpeed(std::optional<double> speed) {
  checked(speed);
  anchor(positionAt(now_()));
  speed_ = speed;
}

void Player::seek(std::int64_t positionMs) {
  positionMs = std::clamp<std::int64_t>(positionMs, 0, drive_.durationMs());
  target_.reset();
  next_ = 0;
  while (next_ < drive_.metrics.size() && drive_.metrics[next_].atMs <= positionMs)
    target_.deliver(drive_.metrics[next_++].record);
  anchor(positionMs);
}

std::optional<Player::Clock::time_point> Player::deliverDue(std::size_t maxBatch) {
  if (!playing_ || drive_.metrics.empty()) return std::nullopt;
  const Clock::time_point now = now_();
  const std::int64_t dueBy = speed_ ? positionAt(now) : std::numeric_limits<std::int64_t>::max();
  for (std::size_t taken = 0; next_ < drive_.metrics.size() && drive_.metrics[next_].atMs <= dueBy;
       ++taken) {
    if (taken == maxBatch) return now;
    const DriveMetric& metric = drive_.metrics[next_++];
    target_.deliver(metric.record);
    if (!speed_) anchorMs_ = metric.atMs;
  }
  if (next_ == drive_.metrics.size()) {
    if (loop_) {
      next_ = 0;
      anchor(0);
      return now;
    }
    anchor(drive_.durationMs());
    playing_ = false;
    return std::nullopt;
  }
  if (!speed_) return now;
  const double untilMs = static_cast<double>(drive_.metrics[next_].atMs - anchorMs_) / *speed_;
  return anchorTime_ + std::chrono::duration_cast<Clock::duration>(
                           std::chrono::duration<double, std::milli>(untilMs));
}

PlayerState Player::state() const {
  return {playing_, speed_, positionAt(now_()), drive_.durationMs(), loop_};
}

}  // namespace player
