#pragma once

#include "export/MetricExport.h"

namespace exporting {

// Decoded JSON Lines, one object per metric, as docs/export.md describes them:
//
//   {"time":"2026-11-23T16:27:46.123Z","t_ms":250,"metric_id":3952132,
//    "record":"KCellularLteRrcState","device":"...","fields":{"timestamp":...,"state":...}}
//
// "fields" is the record's dictionary with enumerations by name. `target` is a file name or "-".
std::unique_ptr<MetricExport> openJsonLinesExport(std::string_view target,
                                                  const ExportOptions& options, std::string& error);

// Appends the line of one metric, without its newline.
void appendJsonLine(std::string& out, const ExportedMetric& metric, bool withPayload);

}  // namespace exporting
