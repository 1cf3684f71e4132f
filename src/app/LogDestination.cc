#include "app/LogDestination.h"

namespace app {

LogDestination chooseLogDestination(std::optional<std::string_view> option, bool terminal,
                                    const std::optional<std::string>& defaultFile) {
  if (option == "-") return {std::nullopt, false};
  if (option) return {std::string(*option), terminal};
  if (terminal && defaultFile) return {*defaultFile, true};
  return {std::nullopt, false};
}

std::optional<std::string> defaultLogFile(const char* xdgStateHome, const char* home) {
  constexpr std::string_view kFile = "/norvo/norvo.log";
  if (xdgStateHome != nullptr && xdgStateHome[0] == '/') return xdgStateHome + std::string(kFile);
  if (home != nullptr && home[0] == '/')
    return home + std::string("/.local/state") + std::string(kFile);
  return std::nullopt;
}

}  // namespace app
