#include "app/PageChrome.h"

#include "app/ApiResponses.h"

namespace app {

void PageChrome::addRoute(ui::DisplayOptions& display) const {
  display.routes.emplace("/api/chrome", [chrome = *this](const ui::web::Request& request) {
    if (!isRead(request)) return methodNotAllowed(request, "GET, HEAD");
    std::optional<platform::Dictionary> replay;
    if (chrome.replayState) replay = chrome.replayState();
    return jsonResponse(
        request, platform::Dictionary{
                     {"alerts", chrome.activeAlerts ? chrome.activeAlerts() : platform::List()},
                     {"replay", replay ? platform::Value(std::move(*replay)) : platform::Value()}});
  });
}

}  // namespace app
