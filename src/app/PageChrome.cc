#include "app/PageChrome.h"

#include "platform/Json.h"

namespace app {

void PageChrome::addReading(ui::DisplayOptions& display) const {
  display.readings.emplace("chrome", [chrome = *this] {
    std::optional<platform::Dictionary> replay;
    if (chrome.replayState) replay = chrome.replayState();
    return platform::toJson(platform::Dictionary{
        {"alerts", chrome.activeAlerts ? chrome.activeAlerts() : platform::List()},
        {"replay", replay ? platform::Value(std::move(*replay)) : platform::Value()}});
  });
}

}  // namespace app
