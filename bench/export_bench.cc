// `norvo export` of a 10-minute drive of the simulated phone, from the metric log's text to the
// output's bytes: reading and parsing each line, reading the record's time, and writing pcapng,
// JSON Lines (decoding every record into its dictionary) or CSV. Output goes to /dev/null, or
// to a temporary folder for CSV.
#include <benchmark/benchmark.h>

#include <cstdlib>
#include <filesystem>
#include <sstream>

#include "app/ExportCommand.h"
#include "export/testing/SimulatedDrive.h"
#include "platform/Log.h"

namespace {

constexpr std::uint64_t kDriveMs = 10 * 60 * 1000;

const std::string& driveLog() {
  static const std::string log = exporting::testing::simulatedDriveLog(1, kDriveMs);
  return log;
}

void exportDrive(benchmark::State& state, std::string_view format, std::string_view target) {
  platform::log::Capture quiet;
  const exporting::ExportFormat& exportFormat = *exporting::exportFormatNamed(format);
  std::size_t metrics = 0;
  for (auto _ : state) {
    std::string error;
    const auto out = exportFormat.open(target, {}, error);
    if (!out) {
      state.SkipWithError(error.c_str());
      return;
    }
    std::istringstream log(driveLog());
    std::ostringstream errors;
    metrics += app::exportMetricLog(log, "drive.jsonl", *out, errors).metrics;
    out->finish(error);
  }
  state.SetItemsProcessed(static_cast<std::int64_t>(metrics));
  state.SetBytesProcessed(
      static_cast<std::int64_t>(driveLog().size() * static_cast<std::size_t>(state.iterations())));
  state.counters["metrics_per_drive"] =
      static_cast<double>(metrics) / static_cast<double>(state.iterations());
}

void BM_ExportPcapng(benchmark::State& state) {
  exportDrive(state, "pcapng", "/dev/null");
}
BENCHMARK(BM_ExportPcapng)->Unit(benchmark::kMillisecond);

void BM_ExportJsonLines(benchmark::State& state) {
  exportDrive(state, "jsonl", "/dev/null");
}
BENCHMARK(BM_ExportJsonLines)->Unit(benchmark::kMillisecond);

void BM_ExportCsv(benchmark::State& state) {
  std::string folder = (std::filesystem::temp_directory_path() / "norvo-bench-XXXXXX").string();
  if (mkdtemp(folder.data()) == nullptr) {
    state.SkipWithError("cannot make a temporary folder");
    return;
  }
  exportDrive(state, "csv", folder);
  std::filesystem::remove_all(folder);
}
BENCHMARK(BM_ExportCsv)->Unit(benchmark::kMillisecond);

}  // namespace

BENCHMARK_MAIN();
