#include "export/MetricExport.h"

#include "export/CsvExport.h"
#include "export/JsonLinesExport.h"
#include "export/PcapngExport.h"

namespace exporting {

namespace {

constexpr ExportFormat kFormats[] = {
    {"pcapng", false, &openPcapngExport},
    {"jsonl", false, &openJsonLinesExport},
    {"csv", true, &openCsvExport},
};

}  // namespace

std::span<const ExportFormat> exportFormats() {
  return kFormats;
}

const ExportFormat* exportFormatNamed(std::string_view name) {
  for (const ExportFormat& format : kFormats) {
    if (format.name == name) return &format;
  }
  return nullptr;
}

}  // namespace exporting
