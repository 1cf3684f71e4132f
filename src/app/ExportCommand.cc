#include "app/ExportCommand.h"

#include <fcntl.h>
#include <unistd.h>

#include <cstdio>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <optional>
#include <sstream>
#include <string>
#include <variant>

#include "app/ProgressBar.h"
#include "platform/CommandLine.h"
#include "tarn/log/MetricLog.h"

namespace app {

namespace {

constexpr std::string_view kUsage =
    "usage: norvo export LOG.jsonl --to pcapng|jsonl|csv [-o OUT] [--raw]\n"
    "\n"
    "Writes the metric log LOG.jsonl (\"-\" for standard input) out for other tools:\n"
    "  pcapng  one packet per metric, for Wireshark with Norvo's dissector\n"
    "  jsonl   one JSON object per metric with the decoded record, for jq and pandas\n"
    "          (--raw adds the payload in base64)\n"
    "  csv     one file per record kind in the folder -o DIR, for spreadsheets\n"
    "The output goes to OUT, or to standard output without -o. Lines that do not parse are\n"
    "reported and skipped.\n";

// Logs at least this large show a progress bar, when standard error is a terminal.
constexpr std::uint64_t kLargeLogBytes = 16 * 1024 * 1024;
constexpr std::size_t kLinesPerProgressUpdate = 4096;

struct Options {
  std::string logPath;
  const exporting::ExportFormat* format;
  std::string target;
  exporting::ExportOptions exportOptions;
};

std::nullopt_t refuse(std::string_view why) {
  std::cerr << "norvo export: " << why << '\n';
  return std::nullopt;
}

std::string formatNames() {
  std::string names;
  for (const exporting::ExportFormat& format : exporting::exportFormats())
    names += (names.empty() ? "" : "|") + std::string(format.name);
  return names;
}

// Empty, after saying why on standard error, when the arguments make no sense.
std::optional<Options> parseOptions(std::span<const std::string_view> arguments) {
  std::optional<std::string_view> log, to, out;
  bool raw = false;
  const std::string formats = "a format: " + formatNames();
  const platform::CommandLineOption table[] = {
      {"--to", &to, formats},
      {"-o", &out, "a file name, or a folder for csv"},
      {"--raw", &raw},
  };
  const platform::CommandLinePositional logArgument{&log, "metric log",
                                                    "which metric log? (\"-\" for standard input)"};
  if (const std::string error = platform::readCommandLine(arguments, table, logArgument);
      !error.empty()) {
    return refuse(error);
  }
  if (!to) return refuse("--to needs " + formats);
  const exporting::ExportFormat* format = exporting::exportFormatNamed(*to);
  if (format == nullptr) return refuse("--to needs " + formats + ", not " + std::string(*to));
  if (format->writesFolder && (!out || *out == "-"))
    return refuse("--to " + std::string(*to) + " writes one file per record kind: -o DIR");
  if (raw && format->name != "jsonl") return refuse("--raw goes with --to jsonl");
  return Options{.logPath = std::string(*log),
                 .format = format,
                 .target = std::string(out.value_or("-")),
                 .exportOptions = {.raw = raw, .live = false}};
}

// The records' decoding diagnostics ("valid metricId tag"), which `norvo intake` shows, would
// bury the export's own reports; here they go nowhere. The export's output, when it is standard
// output, already has a descriptor of its own.
void discardStandardOutput() {
  std::fflush(stdout);
  const int null = ::open("/dev/null", O_WRONLY | O_CLOEXEC);
  if (null < 0) return;
  dup2(null, STDOUT_FILENO);
  ::close(null);
}

std::optional<std::uint64_t> largeLogSize(const std::string& path) {
  if (path == "-" || isatty(STDERR_FILENO) != 1) return std::nullopt;
  std::error_code error;
  const std::uint64_t size = std::filesystem::file_size(path, error);
  if (error || size < kLargeLogBytes) return std::nullopt;
  return size;
}

}  // namespace

ExportTally exportMetricLog(std::istream& log, std::string_view logName,
                            exporting::MetricExport& out, std::ostream& errors,
                            const std::function<void(std::uint64_t bytesRead)>& onProgress) {
  ExportTally tally;
  tarn::log::MetricLogReader reader(log);
  exporting::MetricTimes times;
  std::size_t lines = 0;
  while (std::optional<tarn::log::MetricLogReader::Line> line = reader.next()) {
    if (onProgress && ++lines % kLinesPerProgressUpdate == 0)
      onProgress(static_cast<std::uint64_t>(std::max<std::streamoff>(log.tellg(), 0)));
    std::string problem = line->parsed.error;
    if (line->parsed.entry) {
      auto metric = times.metricOf(line->parsed.entry->record, line->parsed.entry->deliveryMs);
      if (auto* exported = std::get_if<exporting::ExportedMetric>(&metric)) {
        ++tally.metrics;
        if (!out.write(*exported)) {
          tally.written = false;
          return tally;
        }
        continue;
      }
      problem = std::get<std::string>(metric);
    }
    ++tally.skipped;
    errors << logName << ':' << line->number << ": " << problem << "; line skipped\n";
  }
  tally.readToEnd = !reader.failed();
  return tally;
}

int runExportCommand(std::span<const std::string_view> arguments) {
  if (platform::asksForHelp(arguments)) {
    std::cout << kUsage;
    return 0;
  }
  const std::optional<Options> options = parseOptions(arguments);
  if (!options) {
    std::cerr << kUsage;
    return 2;
  }
  std::ifstream file;
  if (options->logPath != "-") {
    file.open(options->logPath, std::ios::binary);
    if (!file) {
      std::cerr << "norvo export: cannot read " << options->logPath << '\n';
      return 1;
    }
  }
  std::istream& log = options->logPath == "-" ? std::cin : file;
  const std::string logName = options->logPath == "-" ? "<stdin>" : options->logPath;

  std::string error;
  const std::unique_ptr<exporting::MetricExport> out =
      options->format->open(options->target, options->exportOptions, error);
  if (!out) {
    std::cerr << "norvo export: " << error << '\n';
    return 1;
  }
  discardStandardOutput();
  std::optional<ProgressBar> progress;
  std::function<void(std::uint64_t)> onProgress;
  // Under a progress bar, reports of skipped lines wait for its next redraw, so that they
  // never land in the middle of the bar.
  std::ostringstream heldReports;
  const auto showReports = [&] {
    if (heldReports.tellp() <= 0) return;
    progress->wipe();
    std::cerr << heldReports.str();
    heldReports.str("");
  };
  if (const auto size = largeLogSize(options->logPath)) {
    progress.emplace(std::cerr, *size);
    onProgress = [&](std::uint64_t bytesRead) {
      showReports();
      progress->update(bytesRead);
    };
  }
  const ExportTally tally =
      exportMetricLog(log, logName, *out, progress ? heldReports : std::cerr, onProgress);
  if (progress) {
    showReports();
    progress->wipe();
  }
  if (!out->finish(error) || !tally.written) {
    std::cerr << "norvo export: " << (error.empty() ? "cannot write the output" : error) << '\n';
    return 1;
  }
  if (!tally.readToEnd) {
    std::cerr << "norvo export: cannot read " << logName << " to its end\n";
    return 1;
  }
  return 0;
}

}  // namespace app
