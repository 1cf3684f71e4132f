// An exported drive of the simulated phone, opened by Debian's tshark with Norvo's dissector and
// the record schemas: every packet shows its metric ID, record name, device and time, and a field
// of each record kind holds what the intake decodes.
#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <fstream>
#include <map>
#include <set>
#include <sstream>

#include "ChildProcess.h"
#include "Files.h"
#include "TemporaryFolder.h"
#include "export/ExportedMetric.h"
#include "export/testing/SimulatedDrive.h"
#include "platform/Log.h"
#include "store/Dispatch.h"
#include "tarn/log/MetricLog.h"

namespace {

using namespace std::chrono_literals;

// Five minutes of the drive already show 28 of the record kinds.
constexpr std::uint64_t kDriveMs = 5 * 60 * 1000;

std::vector<std::string> split(const std::string& text, char separator) {
  std::vector<std::string> parts;
  std::istringstream stream(text);
  for (std::string part; std::getline(stream, part, separator);)
    parts.push_back(part);
  if (!text.empty() && text.back() == separator) parts.emplace_back();
  return parts;
}

// Runs a program to its end; answers its standard output, failing the test when it fails.
std::string run(const bustest::TemporaryFolder& folder, std::vector<std::string> arguments) {
  bustest::ChildProcess program({.arguments = std::move(arguments),
                                 .standardOutput = folder / "out.txt",
                                 .standardError = folder / "errors.txt"});
  const std::optional<int> status = program.wait(120s);
  EXPECT_EQ(status, 0) << program.standardError();
  return program.standardOutput();
}

struct Metric {
  std::uint32_t id;
  std::string record;
  std::int64_t timeMs;
  std::optional<platform::Dictionary> intake;  // as the intake decodes it
};

std::vector<Metric> metricsOf(const std::string& log) {
  platform::log::Capture quiet;
  std::istringstream input(log);
  tarn::log::MetricLogReader reader(input);
  exporting::MetricTimes times;
  std::vector<Metric> metrics;
  while (const auto line = reader.next()) {
    const auto metric = std::get<exporting::ExportedMetric>(
        times.metricOf(line->parsed.entry->record, line->parsed.entry->deliveryMs));
    const store::Handler* handler = store::handlerFor(metric.metricID);
    metrics.push_back(
        {metric.metricID,
         metric.known && metric.known->record ? std::string(metric.known->record->name) : "",
         metric.timeMs, handler != nullptr ? handler->decode(metric.payload) : std::nullopt});
  }
  return metrics;
}

// Per record kind, a field that tshark shows as the intake's dictionary does: the first whole
// number after the timestamp in the kind's first metric, else the timestamp (enumerations show
// as names in the dictionary but as numbers in tshark's fields).
std::map<std::string, std::string> fieldPerKind(const std::vector<Metric>& metrics) {
  std::map<std::string, std::string> fields;
  for (const Metric& metric : metrics) {
    if (!metric.intake || fields.contains(metric.record)) continue;
    fields[metric.record] = "timestamp";
    for (const auto& [key, value] : *metric.intake) {
      if (key != "timestamp" && value.asInteger()) {
        fields[metric.record] = key;
        break;
      }
    }
  }
  return fields;
}

TEST(Wireshark, TsharkDecodesAnExportedDriveAsTheIntakeDoes) {
  bustest::TemporaryFolder folder;
  const std::string log = exporting::testing::simulatedDriveLog(1, kDriveMs, "car-7");
  std::ofstream(folder / "drive.jsonl") << log;
  run(folder, {NORVO_PROGRAM, "export", (folder / "drive.jsonl").string(), "--to", "pcapng", "-o",
               (folder / "drive.pcapng").string()});

  const std::vector<Metric> metrics = metricsOf(log);
  const std::string summary = run(folder, {"capinfos", (folder / "drive.pcapng").string()});
  EXPECT_NE(summary.find("File type:           Wireshark/... - pcapng"), std::string::npos)
      << summary;
  EXPECT_NE(summary.find("File encapsulation:  Wireshark Upper PDU export"), std::string::npos);
  EXPECT_NE(summary.find("Number of packets:   " + std::to_string(metrics.size()) + "\n"),
            std::string::npos);

  const std::map<std::string, std::string> fields = fieldPerKind(metrics);
  ASSERT_GE(fields.size(), 28u) << "the drive should show nearly every record kind";
  std::vector<std::string> tshark = {
      "tshark", "-r",    (folder / "drive.pcapng").string(), "-X", ("lua_script:" NORVO_DISSECTOR),
      "-T",     "fields"};
  const auto each = [&tshark](std::string_view flag, std::vector<std::string> values) {
    for (std::string& value : values)
      tshark.insert(tshark.end(), {std::string(flag), std::move(value)});
  };
  each("-o", {"protobuf.preload_protos:TRUE", "protobuf.pbf_as_hf:TRUE",
              "uat:protobuf_search_paths:\"" NORVO_PROTO_DIR "\",\"TRUE\"",
              "uat:protobuf_search_paths:\"" PROTOBUF_INCLUDE_DIR "\",\"FALSE\""});
  each("-E", {"separator=/t", "occurrence=f"});
  each("-e", {"frame.time_epoch", "norvo.metric_id", "norvo.record", "norvo.device"});
  std::vector<std::string> kinds;
  for (const auto& [record, key] : fields) {
    kinds.push_back(record);
    std::string field = "pbf.norvo.metrics." + record;
    field.append(".").append(key);
    tshark.insert(tshark.end(), {"-e", std::move(field)});
  }
  std::string table = run(folder, tshark);
  if (!table.empty() && table.back() == '\n') table.pop_back();
  const std::vector<std::string> rows = split(table, '\n');
  ASSERT_EQ(rows.size(), metrics.size());

  std::set<std::string> checked;
  for (std::size_t i = 0; i < rows.size(); ++i) {
    const Metric& metric = metrics[i];
    const std::vector<std::string> cells = split(rows[i], '\t');
    ASSERT_EQ(cells.size(), 4 + kinds.size()) << rows[i];
    EXPECT_EQ(std::stoul(cells[1], nullptr, 16), metric.id) << rows[i];
    EXPECT_EQ(cells[2], metric.record) << rows[i];
    EXPECT_EQ(cells[3], "car-7");
    EXPECT_EQ(std::llround(std::stod(cells[0]) * 1000), metric.timeMs) << rows[i];
    const auto kind = std::ranges::find(kinds, metric.record);
    if (kind == kinds.end() || !metric.intake) continue;
    const std::string& key = fields.at(metric.record);
    const std::string& shown = cells[4 + static_cast<std::size_t>(kind - kinds.begin())];
    const platform::Value* value = metric.intake->find(key);
    EXPECT_EQ(shown, value != nullptr ? std::to_string(*value->asInteger()) : "")
        << metric.record << "." << key << " in packet " << i + 1;
    checked.insert(metric.record);
  }
  EXPECT_EQ(checked.size(), fields.size());
}

}  // namespace
