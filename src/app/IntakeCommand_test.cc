#include "app/IntakeCommand.h"

#include <gtest/gtest.h>

#include <boost/json/parse.hpp>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <sstream>
#include <string>

#include "messages/Records.h"
#include "platform/Log.h"
#include "store/MetricValidator.h"
#include "tarn/log/MetricLog.h"

namespace app {
namespace {

using store::MetricValidator;

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

// The one test of this program that uses the shared intake.
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

}  // namespace
}  // namespace app
