#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <istream>
#include <ostream>
#include <span>
#include <string_view>

#include "export/MetricExport.h"

namespace app {

// `norvo export LOG.jsonl --to pcapng|jsonl|csv [-o OUT] [--raw]`: writes a metric log out for
// Wireshark, jq and pandas, or spreadsheets. Answers the exit status.
int runExportCommand(std::span<const std::string_view> arguments);

struct ExportTally {
  std::size_t metrics = 0;
  std::size_t skipped = 0;
  // Whether reading and writing went to the end.
  bool readToEnd = true;
  bool written = true;
};

// Hands every metric of the log, in order, to `out`. A line that does not parse, or holds no
// metric to export, is reported on `errors` as "LOG:LINE: what is wrong; line skipped", and the
// rest still goes out. `onProgress`, when given, learns how far the log has been read, in bytes,
// every few thousand lines. Stops early when writing fails.
ExportTally exportMetricLog(std::istream& log, std::string_view logName,
                            exporting::MetricExport& out, std::ostream& errors,
                            const std::function<void(std::uint64_t bytesRead)>& onProgress = {});

}  // namespace app
