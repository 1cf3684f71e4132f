#pragma once

#include <memory>
#include <span>
#include <string>
#include <string_view>

#include "export/ExportedMetric.h"

namespace exporting {

// One export in progress: metrics go in one at a time, in log order.
class MetricExport {
 public:
  virtual ~MetricExport() = default;
  // False once the output has failed (a full disk, a reader that went away).
  virtual bool write(const ExportedMetric& metric) = 0;
  // Writes out whatever is held back; false, with `error` saying why, when output failed.
  virtual bool finish(std::string& error) = 0;
};

struct ExportOptions {
  // JSON Lines: add each metric's payload in base64.
  bool raw = false;
  // Hand each metric to the output as it comes, for a reader that follows a live recording.
  bool live = false;
};

// An export format is a row: its name, what its target is, and how it opens one.
struct ExportFormat {
  std::string_view name;
  // A folder to fill with files (created when missing), rather than a file or "-" for
  // standard output.
  bool writesFolder;
  // Empty, with `error` saying why, when the target cannot be written.
  std::unique_ptr<MetricExport> (*open)(std::string_view target, const ExportOptions& options,
                                        std::string& error);
};

std::span<const ExportFormat> exportFormats();
const ExportFormat* exportFormatNamed(std::string_view name);

}  // namespace exporting
