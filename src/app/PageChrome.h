#pragma once

#include <functional>
#include <optional>

#include "platform/Value.h"
#include "ui/Application.h"

namespace app {

// What the chrome beside every page's table shows, read by its script:
//
//   GET /api/chrome   {"alerts": [{"text", ...} for each active alert],
//                      "replay": the replay's state (see ReplayControls), or null}
struct PageChrome {
  std::function<platform::List()> activeAlerts;
  // Empty, or answering nothing, when no replay runs.
  std::function<std::optional<platform::Dictionary>()> replayState;

  void addReading(ui::DisplayOptions& display) const;
};

}  // namespace app
