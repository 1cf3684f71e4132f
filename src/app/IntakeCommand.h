#pragma once

#include <istream>
#include <ostream>
#include <span>
#include <string_view>

#include "client/TarnWrapperDelegate.h"

namespace app {

// `norvo intake LOG.jsonl [--dump-store OUT.json]`: feeds a metric log to the shared intake as
// the session would, with no service behind it, and writes the whole store as JSON. Answers the
// exit status.
int runIntakeCommand(std::span<const std::string_view> arguments);

// Hands each record of the log, in order, to receiver.metricsDidUpdate as a task of the main
// queue, and runs the main queue until the log is done. A line that does not parse is reported
// on `errors` with `logName` and its line number, and skipped. False when reading the log failed.
bool deliverMetricLog(std::istream& log, std::string_view logName, TarnWrapperDelegate& receiver,
                      std::ostream& errors);

}  // namespace app
