#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace app {

// Where the live viewer writes its plain log lines, and whether standard output shows the
// status line instead.
struct LogDestination {
  std::optional<std::string> file;  // empty: standard output
  bool statusLine = false;

  bool operator==(const LogDestination&) const = default;
};

// `--log FILE` writes the lines to FILE and `--log -` to standard output. Without --log, a
// terminal shows the status line and the lines go to `defaultFile` (to standard output when there
// is none); a file or a pipe gets the lines as before.
LogDestination chooseLogDestination(std::optional<std::string_view> option, bool terminal,
                                    const std::optional<std::string>& defaultFile);

// norvo/norvo.log under $XDG_STATE_HOME, or under ~/.local/state when that is unset or not an
// absolute path; empty without either.
std::optional<std::string> defaultLogFile(const char* xdgStateHome, const char* home);

}  // namespace app
