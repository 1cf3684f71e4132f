#pragma once

#include <boost/asio/steady_timer.hpp>
#include <functional>
#include <optional>

#include "platform/Value.h"
#include "player/Player.h"
#include "store/MetricValidator.h"
#include "ui/Application.h"

namespace app {

// A recorded drive played into the viewer on the main queue, with its controls:
//
//   GET  /api/replay           {"playing", "speed" (a number or "max"), "position_ms",
//                               "duration_ms", "loop"}
//   POST /api/replay           a JSON object: {"action": "play"}, {"action": "pause"},
//                               {"action": "speed", "speed": 4 or "max"} or
//                               {"action": "seek", "position_ms": 60000}; answers the state
//   GET  /api/replay/markers   {"markers": [{"position_ms", "kind", "severity", "text"}]}, the
//                               events of the whole drive, for the player bar
//
// Seeking rebuilds the store and the events from the drive's start, at once.
class ReplayControls {
 public:
  // Metrics go to `intake`; `reset` empties what they build (the store, the events, ...) for a
  // seek.
  ReplayControls(player::Drive drive, std::optional<double> speed, bool loop,
                 store::MetricValidator& intake, std::function<void()> reset);
  ReplayControls(const ReplayControls&) = delete;
  ReplayControls& operator=(const ReplayControls&) = delete;

  void addPages(ui::DisplayOptions& display);
  // Starts playing once the main queue runs.
  void start();

  // As GET /api/replay answers it.
  platform::Dictionary stateDictionary() const;

 private:
  void schedule();
  ui::web::Response api(const ui::web::Request& request);
  ui::web::Response control(const ui::web::Request& request);

  player::Player player_;
  platform::List markers_;
  boost::asio::steady_timer timer_;
};

// The events of a whole drive and where in it each comes, found by an intake of its own.
platform::List driveMarkers(const player::Drive& drive);

}  // namespace app
