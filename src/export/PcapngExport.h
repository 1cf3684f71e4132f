#pragma once

#include "export/MetricExport.h"
#include "export/OutputFile.h"

namespace exporting {

// A pcapng file for Wireshark: a section header, one interface of Wireshark's upper-PDU link
// type, and one Enhanced Packet Block per metric (MetricPacket.h), stamped with the metric's
// time. `target` is a file name or "-".
std::unique_ptr<MetricExport> openPcapngExport(std::string_view target,
                                               const ExportOptions& options, std::string& error);

}  // namespace exporting
