#pragma once

#include <cstdint>
#include <iosfwd>
#include <string>
#include <vector>

#include "platform/Value.h"

namespace player {

// One metric of a recorded drive: the record as the session hands it over, and when it was
// delivered, in milliseconds from the start of the log.
struct DriveMetric {
  std::int64_t atMs;
  platform::Dictionary record;
};

// A metric log read whole, in delivery order.
struct Drive {
  std::vector<DriveMetric> metrics;

  // The time of the last metric: the drive runs from 0 to here.
  std::int64_t durationMs() const { return metrics.empty() ? 0 : metrics.back().atMs; }
};

// Reads the log at `path`. A line that does not parse, or whose record lacks an integer
// "kKeyMetricID" or a payload, is reported on `errors` as "PATH:LINE: ...; line skipped". A line
// without "t_ms" comes at the time of the line before it; a "t_ms" earlier than that one's is
// taken as the same time, so the drive's times never go back. Throws std::runtime_error when the
// file cannot be read.
Drive readDrive(const std::string& path, std::ostream& errors);

// The same from a stream, reported under `name`.
Drive readDrive(std::istream& log, const std::string& name, std::ostream& errors);

}  // namespace player
