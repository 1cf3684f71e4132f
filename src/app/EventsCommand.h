#pragma once

#include <istream>
#include <ostream>
#include <span>
#include <string_view>

namespace app {

// `norvo events LOG.jsonl [--json]`: runs the event detection over a metric log, offline, and
// prints each event as it is found. Answers the exit status.
int runEventsCommand(std::span<const std::string_view> arguments);

// Hands each record of the log to an intake of its own with the event detection behind it, and
// writes the events, oldest first, to `out`: one line each, or one JSON object each. A line
// that does not parse, has no integer "kKeyMetricID", or whose payload does not decode, is
// reported on `errors` with `logName` and its line number. False when reading the log failed.
bool writeLogEvents(std::istream& log, std::string_view logName, bool json, std::ostream& out,
                    std::ostream& errors);

}  // namespace app
