#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <boost/json/parse.hpp>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <set>
#include <sstream>
#include <string>

#include "app/EventsCommand.h"
#include "app/ExportCommand.h"
#include "app/IntakeCommand.h"
#include "app/ProgressBar.h"
#include "app/RecordCommand.h"
#include "app/ServiceOption.h"
#include "app/SharedIntake.h"
#include "client/TarnWrapper.h"
#include "messages/Records.h"
#include "platform/Json.h"
#include "platform/Log.h"
#include "store/MetricValidator.h"
#include "store/StoreDump.h"
#include "tarn/log/MetricLog.h"

using namespace std::chrono_literals;

namespace app {
namespace {

using messages::KCellularLteRrcState;
using store::MetricValidator;
using ::testing::ElementsAre;

std::string rrcLine(KCellularLteRrcState::State state, KCellularLteRrcState::Cause cause,
                    std::uint64_t timestamp) {
  KCellularLteRrcState record;
  record.setTimestamp(timestamp);
  record.setState(state);
  record.setCause(cause);
  return *tarn::log::formatMetricLogLine(
      {{"kKeyMetricID", MetricValidator::K_LTE_RRC_STATE}, {"kKeyPayload", record.data()}});
}

std::vector<std::string> lines(const std::string& text) {
  std::vector<std::string> found;
  std::istringstream stream(text);
  for (std::string line; std::getline(stream, line);)
    found.push_back(line);
  return found;
}

TEST(EventsCommand, PrintsEachEventAndReportsBrokenLinesByNumber) {
  setenv("TZ", "UTC", 1);
  const std::string log =
      rrcLine(KCellularLteRrcState::KLTE_RRC_STATE_CONNECTED,
              KCellularLteRrcState::KLTE_RRC_CAUSE_EST_MO_DATA, 1718100000250) +
      "\n{\"kKeyMetricID\": 3952132,\n"                        // 2: cut short
      "{\"kKeyPayload\":\"CAE=\"}\n"                           // 3: no metric ID
      "{\"kKeyMetricID\":3952132,\"kKeyPayload\":\"/w==\"}\n"  // 4: no record
      "{\"kKeyMetricID\":1,\"kKeyPayload\":\"CAE=\"}\n" +      // 5: not ours
      rrcLine(KCellularLteRrcState::KLTE_RRC_STATE_ATMPT_CONNECTION,
              KCellularLteRrcState::KLTE_RRC_CAUSE_REEST_OTHER_FAIL_T310_EXP, 1718100001000) +
      "\n";

  std::istringstream input(log);
  std::ostringstream out, errors;
  ASSERT_TRUE(writeLogEvents(input, "drive.jsonl", false, out, errors));
  EXPECT_THAT(lines(out.str()),
              ElementsAre("2024-06-11 10:00:00.250 UTC  info     rrc           LTE RRC CONNECTED "
                          "(KLTE_RRC_CAUSE_EST_MO_DATA)",
                          "2024-06-11 10:00:01.000 UTC  failure  radio-link    LTE RRC CONNECTED "
                          "→ ATMPT_CONNECTION: radio link failure, re-establishing "
                          "(KLTE_RRC_CAUSE_REEST_OTHER_FAIL_T310_EXP)"));
  const std::vector<std::string> reported = lines(errors.str());
  ASSERT_EQ(reported.size(), 3u) << errors.str();
  EXPECT_TRUE(reported[0].starts_with("drive.jsonl:2: not JSON")) << reported[0];
  EXPECT_EQ(reported[1], "drive.jsonl:3: no integer \"kKeyMetricID\"; line skipped");
  EXPECT_EQ(reported[2], "drive.jsonl:4: the payload does not decode; line skipped");

  std::istringstream again(log);
  std::ostringstream json, ignored;
  ASSERT_TRUE(writeLogEvents(again, "drive.jsonl", true, json, ignored));
  const std::vector<std::string> objects = lines(json.str());
  ASSERT_EQ(objects.size(), 2u);
  EXPECT_EQ(boost::json::parse(objects[1]),
            boost::json::parse(
                R"j({"id":2,"time_ms":1718100001000,"kind":"radio-link","severity":"failure",)j"
                R"j("text":"LTE RRC CONNECTED → ATMPT_CONNECTION: radio link failure, )j"
                R"j(re-establishing (KLTE_RRC_CAUSE_REEST_OTHER_FAIL_T310_EXP)",)j"
                R"j("metric_id":3952132})j"));
}

// Remembers what it was given, and can fail like a closed pipe.
class Collect final : public exporting::MetricExport {
 public:
  explicit Collect(std::size_t failAfter = SIZE_MAX) : failAfter_(failAfter) {}
  bool write(const exporting::ExportedMetric& metric) override {
    ids.push_back(metric.metricID);
    return ids.size() < failAfter_;
  }
  bool finish(std::string&) override { return true; }

  std::vector<std::uint32_t> ids;

 private:
  const std::size_t failAfter_;
};

constexpr std::string_view kLog = R"({"kKeyMetricID":3952132,"kKeyPayload":"CAE=","t_ms":0})"
                                  "\n"
                                  "{\"kKeyMetricID\": 3952132,\n"  // 2: cut short
                                  R"({"kKeyMetricID":3952132,"kKeyPayload":"not base64!"})"
                                  "\n"
                                  R"({"kKeyPayload":"CAE="})"
                                  "\n"
                                  "\n"  // 5: blank
                                  R"({"kKeyMetricID":4294967296,"kKeyPayload":"CAE="})"
                                  "\n"
                                  R"({"kKeyMetricID":3986195})"
                                  "\r\n"
                                  R"({"kKeyMetricID":3986195,"kKeyPayload":"","t_ms":9})"
                                  "\n";

TEST(ExportMetricLog, ExportsEveryGoodLineAndReportsTheOthersByLine) {
  std::istringstream log{std::string(kLog)};
  std::ostringstream errors;
  Collect out;
  const ExportTally tally = exportMetricLog(log, "drive.jsonl", out, errors);
  EXPECT_EQ(out.ids, (std::vector<std::uint32_t>{0x3C4E04, 0x3CD313}));
  EXPECT_EQ(tally.metrics, 2u);
  EXPECT_EQ(tally.skipped, 5u);
  EXPECT_TRUE(tally.readToEnd);
  EXPECT_TRUE(tally.written);
  std::string report = errors.str();
  // The JSON parser's own words for line 2 are its business.
  const auto detail = report.find("not JSON (");
  ASSERT_NE(detail, std::string::npos) << report;
  report.erase(detail + 10, report.find(')', detail) - detail - 10);
  EXPECT_EQ(report,
            "drive.jsonl:2: not JSON (); line skipped\n"
            "drive.jsonl:3: \"kKeyPayload\" is not standard base64 text; line skipped\n"
            "drive.jsonl:4: no \"kKeyMetricID\" that is a whole number of 32 bits; line skipped\n"
            "drive.jsonl:6: no \"kKeyMetricID\" that is a whole number of 32 bits; line skipped\n"
            "drive.jsonl:7: no \"kKeyPayload\"; line skipped\n");
}

TEST(ExportMetricLog, StopsWhenTheOutputFails) {
  std::istringstream log{std::string(kLog)};
  std::ostringstream errors;
  Collect out(1);
  const ExportTally tally = exportMetricLog(log, "drive.jsonl", out, errors);
  EXPECT_FALSE(tally.written);
  EXPECT_EQ(out.ids.size(), 1u);
}

TEST(ProgressBar, RedrawsOnlyWhenTheWholePercentageMovesAndWipesItself) {
  std::ostringstream terminal;
  ProgressBar bar(terminal, 1000);
  for (const std::uint64_t done : {0u, 4u, 9u, 10u, 500u, 2000u})
    bar.update(done);
  const std::string bar0 = "\r[" + std::string(40, ' ') + "] 0%";
  const std::string bar1 = "\r[" + std::string(40, ' ') + "] 1%";
  const std::string bar50 = "\r[" + std::string(20, '#') + std::string(20, ' ') + "] 50%";
  const std::string bar100 = "\r[" + std::string(40, '#') + "] 100%";
  EXPECT_EQ(terminal.str(), bar0 + bar1 + bar50 + bar100);
  terminal.str("");
  bar.wipe();
  bar.update(1000);
  EXPECT_EQ(terminal.str(), "\r" + std::string(48, ' ') + "\r" + bar100)
      << "a wiped bar comes back with the next update";
}

TEST(ExportCommand, RefusesArgumentsThatMakeNoSense) {
  const std::vector<std::vector<std::string_view>> cases = {
      {},
      {"drive.jsonl"},
      {"drive.jsonl", "--to", "xml"},
      {"drive.jsonl", "--to", "csv"},
      {"drive.jsonl", "--to", "csv", "-o", "-"},
      {"drive.jsonl", "--to", "pcapng", "--raw"},
      {"drive.jsonl", "--to"},
      {"drive.jsonl", "other.jsonl", "--to", "jsonl"},
  };
  for (const auto& arguments : cases) {
    testing::internal::CaptureStderr();
    EXPECT_EQ(runExportCommand(arguments), 2);
    EXPECT_NE(testing::internal::GetCapturedStderr().find("usage: norvo export"),
              std::string::npos);
  }
}

std::string lineFor(std::int64_t metricID, const codec::Codable& record) {
  return *tarn::log::formatMetricLogLine(
      {{"kKeyMetricID", metricID}, {"kKeyPayload", record.data()}, {"kKeyAppID", 2}});
}

std::string sampleLog() {
  messages::KCellularLteScellInfo cell;
  cell.setDlBw(100);
  messages::KCellularLteRrcState state;
  state.setState(messages::KCellularLteRrcState::KLTE_RRC_STATE_IDLE);
  return lineFor(MetricValidator::K_LTE_SCELL_INFO, cell) + "\n" +
         "{\"kKeyMetricID\": 3952132,\n" +  // 2: cut short
         R"({"kKeyMetricID":3952132,"kKeyPayload":"not base64!"})"
         "\n" +  // 3
         R"({"kKeyPayload":"CAE="})"
         "\n" +  // 4: no metric ID
         "\n" +  // 5: blank
         lineFor(MetricValidator::K_LTE_RRC_STATE, state) +
         "\n";  // 6
}

TEST(IntakeCommand, RefusesArgumentsItCannotUseAndLogsItCannotRead) {
  const std::string_view noLog[] = {"--dump-store", "out.json"};
  EXPECT_EQ(runIntakeCommand(noLog), 2);
  const std::string_view missing[] = {"/nonexistent/metrics.jsonl"};
  EXPECT_EQ(runIntakeCommand(missing), 1);
  const std::string_view unwritable[] = {"-", "--dump-store", "/nonexistent/store.json"};
  EXPECT_EQ(runIntakeCommand(unwritable), 1);
}

// This test and TheSharedIntake below are the ones that use the process's shared intake.
TEST(IntakeCommand, DeliversEveryRecordInOrderReportsTheLinesItSkipsAndDumpsTheStore) {
  const auto directory =
      std::filesystem::temp_directory_path() / ("norvo-intake-" + std::to_string(::getpid()));
  std::filesystem::create_directories(directory);
  const std::string logPath = (directory / "metrics.jsonl").string();
  const std::string dumpPath = (directory / "store.json").string();
  std::ofstream(logPath) << sampleLog();

  platform::log::Capture log;
  std::ostringstream errors;
  std::streambuf* const standardError = std::cerr.rdbuf(errors.rdbuf());
  const std::string_view arguments[] = {logPath, "--dump-store", dumpPath};
  EXPECT_EQ(runIntakeCommand(arguments), 0);
  std::cerr.rdbuf(standardError);
  EXPECT_EQ(log.count("Received Valid Metric"), 2u);
  EXPECT_EQ(log.count("The metric record has no integer \"kKeyMetricID\"; nothing to do"), 1u);
  EXPECT_EQ(errors.str().rfind(logPath + ":2: not JSON", 0), 0u) << errors.str();
  EXPECT_NE(errors.str().find(logPath + ":3: \"kKeyPayload\" is not standard base64 text; line "
                                        "skipped\n"),
            std::string::npos);

  std::ifstream dumpFile(dumpPath);
  const std::string dump((std::istreambuf_iterator<char>(dumpFile)), {});
  const boost::json::object store = boost::json::parse(dump).as_object();
  EXPECT_EQ(store.size(), 1u + 31u + 4u);
  EXPECT_EQ(store.at("metricID").as_int64(), MetricValidator::K_LTE_RRC_STATE);
  EXPECT_EQ(store.at("myLTESCellInfoDict"), (boost::json::object{{"dl_bw", 50}}));
  EXPECT_EQ(store.at("myLTERRCStateDict"), (boost::json::object{{"state", "KLTE_RRC_STATE_IDLE"}}));
  EXPECT_TRUE(store.at("myUMTSTxPowerDict").is_null());
  EXPECT_EQ(store.at("myLTE").at("IMSI").as_string(), "Come Back Later");
  EXPECT_EQ(store.at("myCommon").at("simContents").at(0).at("Waiting for Update").as_string(),
            "Waiting for Update");
  std::filesystem::remove_all(directory);
}

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

TEST(AServiceOption, NamesTheServiceInsideNorvoOrTheBusToFindTarndOn) {
  const struct {
    std::string_view text;
    std::optional<app::ServiceChoice> choice;
  } cases[] = {
      {"builtin", app::ServiceChoice{}},
      {"dbus", app::ServiceChoice{.bus = "session"}},
      {"dbus:session", app::ServiceChoice{.bus = "session"}},
      {"dbus:system", app::ServiceChoice{.bus = "system"}},
      {"dbus:unix:path=/tmp/bus", app::ServiceChoice{.bus = "unix:path=/tmp/bus"}},
      {"mqtt://broker.lan/fleet/car-7",
       app::ServiceChoice{.bus = {},
                          .broker = tarn::mqtt::BrokerAddress{.tls = false,
                                                              .user = {},
                                                              .password = {},
                                                              .host = "broker.lan",
                                                              .port = 1883,
                                                              .path = "fleet/car-7"},
                          .caFile = {}}},
      {"mqtts://u:p@[::1]/a/b/car-7/",
       app::ServiceChoice{.bus = {},
                          .broker = tarn::mqtt::BrokerAddress{.tls = true,
                                                              .user = "u",
                                                              .password = "p",
                                                              .host = "::1",
                                                              .port = 8883,
                                                              .path = "a/b/car-7"},
                          .caFile = {}}},
      {"mqtt://broker.lan/fleet", std::nullopt},  // which device?
      {"mqtt://broker.lan/fleet/+", std::nullopt},
      {"dbus:", std::nullopt},
      {"DBus", std::nullopt},
      {"", std::nullopt},
  };
  for (const auto& [text, choice] : cases)
    EXPECT_EQ(app::parseServiceChoice(text), choice) << text;
}

TEST(TheSharedIntake, ListensOnTheSharedSessionAndIsItsDelegate) {
  store::MetricValidator& intake = sharedIntake();
  EXPECT_EQ(&intake, &store::MetricValidator::sharedInstance());
  EXPECT_EQ(&sharedIntake(), &intake);
  ASSERT_NE(intake.mySharedTarnInstance(), nullptr);
  EXPECT_EQ(TarnWrapper::sharedInstance().delegate().lock().get(), &intake);
}

}  // namespace
}  // namespace app
