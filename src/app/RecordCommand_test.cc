#include "app/RecordCommand.h"

#include <gtest/gtest.h>
#include <unistd.h>

#include <boost/json/parse.hpp>
#include <filesystem>
#include <fstream>
#include <set>
#include <sstream>
#include <string>

#include "app/IntakeCommand.h"
#include "platform/Json.h"
#include "platform/Log.h"
#include "store/MetricValidator.h"
#include "store/StoreDump.h"

using namespace std::chrono_literals;

namespace app {
namespace {

using store::MetricValidator;

constexpr const char* kShippedConfiguration = NORVO_RESOURCES_DIR "/fen_test_lte.deviceconfig";

TEST(RecordCommand, ARecordingFedToTheIntakeFillsTheStoreAsTheLiveMetricsDid) {
  platform::log::Capture log;
  MetricValidator live(nullptr);
  std::stringstream recording;
  const RecordingRun run{.service = {}, .seed = 7, .speed = 30.0, .duration = 1500ms};
  ASSERT_TRUE(runRecordingSession(run, kShippedConfiguration,
                                  std::make_shared<MetricRecorder>(recording, &live)));

  const std::string text = recording.str();
  tarn::log::MetricLogReader reader(recording);
  std::int64_t lastMs = 0;
  std::size_t lines = 0;
  while (const auto line = reader.next()) {
    ASSERT_TRUE(line->parsed.entry) << line->parsed.error;
    const std::int64_t deliveryMs = line->parsed.entry->deliveryMs.value();
    EXPECT_GE(deliveryMs, lastMs);
    lastMs = deliveryMs;
    ++lines;
  }
  // The SIM files answer the query, and 45 s of drive bring many more metrics.
  EXPECT_GT(lines, 10u);
  EXPECT_NE(text.find("\"kKeyMetricID\":3932179,"), std::string::npos);

  MetricValidator replayed(nullptr);
  std::istringstream input(text);
  std::ostringstream errors;
  EXPECT_TRUE(deliverMetricLog(input, "recording.jsonl", replayed, errors));
  EXPECT_EQ(errors.str(), "");
  EXPECT_EQ(platform::toJson(store::dumpStore(replayed)), platform::toJson(store::dumpStore(live)));
}

// Takes metrics until its output "fails" after the first few, like a pipe whose reader went away.
class FailingExport final : public exporting::MetricExport {
 public:
  bool write(const exporting::ExportedMetric&) override { return ++written_ < 3; }
  bool finish(std::string&) override { return true; }
  int written() const { return written_; }

 private:
  int written_ = 0;
};

TEST(RecordCommand, ExportsTheMetricsAsTheyCome) {
  platform::log::Capture log;
  const auto path = std::filesystem::temp_directory_path() /
                    ("norvo-record-" + std::to_string(::getpid()) + ".jsonl");
  std::string error;
  const auto out =
      exporting::exportFormatNamed("jsonl")->open(path.string(), {.live = true}, error);
  ASSERT_TRUE(out) << error;
  const auto exporter = std::make_shared<MetricExporter>(*out);
  const RecordingRun run{.service = {}, .seed = 7, .speed = 30.0, .duration = 1500ms};
  ASSERT_TRUE(runRecordingSession(run, kShippedConfiguration, exporter));
  ASSERT_TRUE(out->finish(error)) << error;
  EXPECT_FALSE(exporter->failed());

  std::ifstream lines(path);
  std::filesystem::remove(path);
  std::int64_t lastMs = 0;
  std::set<std::string> records;
  std::size_t count = 0;
  for (std::string line; std::getline(lines, line); ++count) {
    const boost::json::value json = boost::json::parse(line);
    EXPECT_GE(json.at("t_ms").as_int64(), lastMs);
    lastMs = json.at("t_ms").as_int64();
    // Metrics that no record carries (the LTE radio link failure) have no fields.
    if (json.at("record").is_null()) continue;
    EXPECT_TRUE(json.at("fields").is_object()) << line;
    records.insert(std::string(json.at("record").as_string()));
  }
  EXPECT_GT(count, 10u);
  EXPECT_TRUE(records.contains("KCellularSimCardFiles"));
}

TEST(RecordCommand, StopsWhenTheExportsOutputFails) {
  platform::log::Capture log;
  FailingExport out;
  const auto exporter = std::make_shared<MetricExporter>(out);
  // Far longer than the few metrics it takes: the run ends when the output fails.
  const RecordingRun run{.service = {}, .seed = 7, .speed = 30.0, .duration = 120s};
  ASSERT_TRUE(runRecordingSession(run, kShippedConfiguration, exporter));
  EXPECT_TRUE(exporter->failed());
  EXPECT_EQ(out.written(), 3);
}

TEST(RecordCommand, RefusesArgumentsItCannotUse) {
  for (const auto& arguments : std::vector<std::vector<std::string_view>>{
           {"a.jsonl", "--seconds", "0"},
           {"a.jsonl", "--seed", "-1"},
           {"a.jsonl", "--speed", "0"},
           {"a.jsonl", "--seed", "2", "--service", "dbus"},
           {"a.pcapng", "--to", "pcap"},
           {"-", "--to", "csv"},
       }) {
    EXPECT_EQ(runRecordCommand(arguments), 2) << arguments.back();
  }
}

}  // namespace
}  // namespace app
