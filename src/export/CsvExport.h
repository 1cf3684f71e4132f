#pragma once

#include "export/MetricExport.h"

namespace exporting {

// CSV for spreadsheets and pandas: one file per record kind in the folder `target` (created when
// missing), as docs/export.md describes them. Columns follow the record's schema, so every file
// of a kind has the same header whatever the drive:
//
//   KIND.csv         layout,row,time,t_ms,metric_id,device, then the record's fields; a nested
//                    record's fields as "key.field"; a list of numbers in one cell
//   KIND.LIST.csv    one row per element of the record's list LIST (a list inside an element
//                    gets a file of its own in turn): layout,row,parent_row,position,time,t_ms,
//                    metric_id,device, then the element's fields; time and the rest are the
//                    parent metric's
//   undecoded.csv    the metrics no record decodes: layout,row,time,t_ms,metric_id,device,
//                    reason,payload
//
// "layout" is the version of this layout, 1, in every row.
std::unique_ptr<MetricExport> openCsvExport(std::string_view target, const ExportOptions& options,
                                            std::string& error);

}  // namespace exporting
