#pragma once

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <optional>

#include "player/Drive.h"

namespace player {

struct PlayerState {
  bool playing = false;
  std::optional<double> speed;  // empty: as fast as the metrics are taken
  std::int64_t positionMs = 0;
  std::int64_t durationMs = 0;
  bool loop = false;
};

// Plays a recorded drive into the app's state at the pace of its times, scaled by a speed, and
// seeks by rebuilding that state from the drive's start. Everything runs on one thread (the
// main queue); time comes from the clock it is given, so tests need no waiting.
class Player {
 public:
  using Clock = std::chrono::steady_clock;

  // Where the metrics go.
  struct Target {
    // Back to the state before the first metric: store, series, events.
    std::function<void()> reset;
    // One metric record, as the session hands it over.
    std::function<void(const platform::Dictionary& record)> deliver;
  };

  // Paused at the start, with nothing delivered. `speed` must be above 0 when given
  // (std::invalid_argument otherwise).
  Player(Drive drive, Target target, std::optional<double> speed, bool loop,
         std::function<Clock::time_point()> now);

  // Playing at the end of a drive that does not loop starts it over.
  void play();
  void pause();
  // From the current position on; empty delivers as fast as the metrics are taken.
  void setSpeed(std::optional<double> speed);
  // Rebuilds the state as it was at `positionMs` (held within the drive): resets the target
  // and hands it every metric up to and including that time, at once. Playing or paused stays
  // as it was.
  void seek(std::int64_t positionMs);

  // Hands over the metrics that are due by now, at most `maxBatch` of them. Answers when to
  // call again: when the next metric falls due (now, when more are due than the batch took or
  // the speed is unbounded), or nothing while paused. At the end of the drive it pauses, or
  // with `loop` carries on from the start without a reset.
  std::optional<Clock::time_point> deliverDue(std::size_t maxBatch);

  PlayerState state() const;
  const Drive& drive() const { return drive_; }

 private:
  std::int64_t positionAt(Clock::time_point time) const;
  void anchor(std::int64_t positionMs);

  const Drive drive_;
  const Target target_;
  const bool loop_;
  const std::function<Clock::time_point()> now_;
  std::optional<double> speed_;
  bool playing_ = false;
  std::size_t next_ = 0;  // the first metric not handed over yet
  // The position at anchorTime_; while playing the position moves on from there.
  std::int64_t anchorMs_ = 0;
  Clock::time_point anchorTime_;
};

}  // namespace player
