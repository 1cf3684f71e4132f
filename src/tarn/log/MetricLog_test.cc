#include "tarn/log/MetricLog.h"

#include <gtest/gtest.h>

#include <chrono>
#include <fstream>
#include <sstream>
#include <string>
#include <utility>
#include <vector>

#include "platform/Log.h"
#include "tarn/log/RecordingSource.h"
#include "tarn/testing/ScriptedMetricSource.h"

namespace tarn::log {
namespace {

using namespace std::chrono_literals;
using platform::Bytes;
using platform::Dictionary;
using service::Metric;

TEST(MetricLog, ReadsTheRecordWithItsPayloadAsBytesAndTheDeliveryTimeApart) {
  const ParsedLine parsed = parseMetricLogLine(
      R"({"kKeyMetricID":3952132,"kKeyPayload":"CAEQAg==","kKeyProfileID":7,"kKeyAppID":2,"t_ms":250})");
  ASSERT_TRUE(parsed.entry) << parsed.error;
  EXPECT_EQ(parsed.entry->record, (Dictionary{{"kKeyMetricID", std::int64_t{3952132}},
                                              {"kKeyPayload", Bytes{0x08, 0x01, 0x10, 0x02}},
                                              {"kKeyProfileID", std::int64_t{7}},
                                              {"kKeyAppID", std::int64_t{2}}}));
  EXPECT_EQ(parsed.entry->deliveryMs, 250);
}

TEST(MetricLog, LeavesJudgingTheMetricIDToTheIntake) {
  const ParsedLine missing = parseMetricLogLine(R"({"kKeyPayload":""})");
  ASSERT_TRUE(missing.entry);
  EXPECT_EQ(missing.entry->record, (Dictionary{{"kKeyPayload", Bytes{}}}));

  const ParsedLine text = parseMetricLogLine(R"({"kKeyMetricID":"3C4E04"})");
  ASSERT_TRUE(text.entry);
  EXPECT_EQ(*text.entry->record.find("kKeyMetricID"), platform::Value("3C4E04"));
  EXPECT_FALSE(text.entry->deliveryMs);
}

// An object of `count` keys: {"k0":0,"k1":0,...}.
std::string objectWithKeys(std::size_t count) {
  std::string text = "{";
  for (std::size_t i = 0; i < count; ++i)
    text += (i > 0 ? ",\"k" : "\"k") + std::to_string(i) + "\":0";
  return text + "}";
}

TEST(MetricLog, RefusesLinesThatBreakTheFormatAndSaysWhy) {
  EXPECT_NE(parseMetricLogLine(R"({"kKeyMetricID":3952132,)").error.find("not JSON"),
            std::string::npos);
  EXPECT_EQ(parseMetricLogLine("[1, 2]").error, "not a JSON object");
  for (const char* line :
       {R"({"kKeyMetricID":1,"kKeyPayload":"CAE"})", R"({"kKeyMetricID":1,"kKeyPayload":"CA E="})",
        R"({"kKeyMetricID":1,"kKeyPayload":8})"}) {
    const ParsedLine parsed = parseMetricLogLine(line);
    EXPECT_FALSE(parsed.entry) << line;
    EXPECT_EQ(parsed.error, "\"kKeyPayload\" is not standard base64 text") << line;
  }
  const struct {
    std::string line;
    std::string error;
  } refused[] = {
      {R"({"kKeyMetricID":true,"kKeyPayload":""})",
       "\"kKeyMetricID\" is a boolean, not a metric ID"},
      {objectWithKeys(64), ""},
      {objectWithKeys(65), "more than 64 keys"},
      {R"({"k":{"a":":","b":"\":"}})", ""},
      {R"({"a":{"b":1,"c":[{"d":2}]}})" + std::string(1024 * 1024, ' '),
       "longer than 1048576 bytes"},
  };
  for (const char* time : {"-1", "-0.5", "\"soon\"", "true", "1e999", "1e19"}) {
    EXPECT_EQ(parseMetricLogLine(std::string(R"({"kKeyMetricID":1,"t_ms":)") + time + "}").error,
              "\"t_ms\" is not a number of milliseconds of at least 0")
        << time;
  }
  for (const auto& [line, error] : refused) {
    const ParsedLine parsed = parseMetricLogLine(line);
    if (error.empty()) {
      EXPECT_TRUE(parsed.entry) << line;
    } else {
      EXPECT_FALSE(parsed.entry) << line.substr(0, 80);
      EXPECT_EQ(parsed.error, error) << line.substr(0, 80);
    }
  }
}

TEST(MetricLog, RoundsAFractionalDeliveryTimeDown) {
  for (const auto& [text, ms] : {std::pair{"12.5", 12}, {"0.999", 0}, {"3e2", 300}, {"7", 7}}) {
    const ParsedLine parsed =
        parseMetricLogLine(std::string(R"({"kKeyMetricID":1,"t_ms":)") + text + "}");
    ASSERT_TRUE(parsed.entry) << text;
    EXPECT_EQ(parsed.entry->deliveryMs, ms) << text;
  }
}

TEST(MetricLog, RefusesAnOverlongLineWithoutHoldingItAndReadsOn) {
  std::istringstream log(std::string(100, 'x') + "\n{\"kKeyMetricID\":2}\n");
  MetricLogReader reader(log, {.lineBytes = 20, .keys = 4});
  const auto overlong = reader.next();
  ASSERT_TRUE(overlong);
  EXPECT_EQ(overlong->parsed.error, "longer than 20 bytes");
  const auto next = reader.next();
  ASSERT_TRUE(next && next->parsed.entry);
  EXPECT_EQ(next->number, 2u);
  EXPECT_FALSE(reader.next());
  EXPECT_FALSE(reader.failed());
}

TEST(MetricLog, WritesWhatItReadsBack) {
  std::stringstream log;
  MetricLogWriter writer(log);
  const Dictionary record{{"kKeyMetricID", std::int64_t{0x3CD313}},
                          {"kKeyPayload", Bytes{0x08, 0xFF, 0x01}},
                          {"kKeyProfileID", std::int64_t{-1}},
                          {"kKeyAppID", std::int64_t{2}}};
  ASSERT_TRUE(writer.write(record, 1500));
  ASSERT_TRUE(writer.write(Dictionary{{"kKeyMetricID", 19}, {"kKeyPayload", Bytes{}}}));
  // Nothing for a record without an integer ID or a byte payload.
  EXPECT_FALSE(writer.write(Dictionary{{"kKeyPayload", Bytes{1}}}));
  EXPECT_FALSE(writer.write(Dictionary{{"kKeyMetricID", "1"}, {"kKeyPayload", Bytes{1}}}));
  EXPECT_FALSE(writer.write(Dictionary{{"kKeyMetricID", 1}, {"kKeyPayload", "AQ=="}}));
  EXPECT_EQ(log.str(),
            "{\"kKeyMetricID\":3986195,\"kKeyPayload\":\"CP8B\",\"kKeyProfileID\":-1,"
            "\"kKeyAppID\":2,\"t_ms\":1500}\n"
            "{\"kKeyMetricID\":19,\"kKeyPayload\":\"\"}\n");

  MetricLogReader reader(log);
  const auto first = reader.next();
  ASSERT_TRUE(first && first->parsed.entry);
  EXPECT_EQ(first->parsed.entry->record, record);
  EXPECT_EQ(first->parsed.entry->deliveryMs, 1500);
}

TEST(MetricLog, CountsEveryLineButPassesOverBlankOnes) {
  std::istringstream log("{\"kKeyMetricID\":1}\r\n\n   \nnonsense\n{\"kKeyMetricID\":2}");
  MetricLogReader reader(log);
  std::vector<std::size_t> numbers;
  std::vector<bool> parsed;
  while (const auto line = reader.next()) {
    numbers.push_back(line->number);
    parsed.push_back(line->parsed.entry.has_value());
  }
  EXPECT_EQ(numbers, (std::vector<std::size_t>{1, 4, 5}));
  EXPECT_EQ(parsed, (std::vector<bool>{true, false, true}));
  EXPECT_FALSE(reader.failed());
}

using MetricIdAndPayload = std::pair<std::uint32_t, platform::Bytes>;

std::vector<MetricIdAndPayload> plain(const std::vector<Metric>& metrics) {
  std::vector<MetricIdAndPayload> result;
  for (const Metric& metric : metrics)
    result.emplace_back(metric.metricId, metric.payload);
  return result;
}

const std::vector<Metric> kMetrics = {
    {0x3C4E04, {0x08, 0x01, 0x10, 0x03}},
    {0x3CD313, {}},
    {0x3C0013, {0xFF, 0x00, 0x7F}},
    {0x3C4E04, {0x08, 0x02, 0x10, 0x00}},
};

std::vector<MetricLogEntry> entriesOf(const std::string& log) {
  std::istringstream input(log);
  MetricLogReader reader(input);
  std::vector<MetricLogEntry> entries;
  while (const auto line = reader.next()) {
    EXPECT_TRUE(line->parsed.entry) << line->parsed.error;
    if (line->parsed.entry) entries.push_back(*line->parsed.entry);
  }
  return entries;
}

class RecordingSourceTest : public ::testing::Test {
 protected:
  // Emits `metrics` through a recording source into `log` (or log_), started `ago` before now, and
  // answers what was handed on to the service; a log that cannot be written must have stopped it.
  std::vector<Metric> recordThrough(const std::vector<Metric>& metrics,
                                    std::chrono::milliseconds ago = 0ms,
                                    std::ostream* log = nullptr, const char* name = "the log") {
    std::ostream& into = log != nullptr ? *log : log_;
    RecordingSource recorder(scripted_, into, name, RecordingSource::Clock::now() - ago);
    std::vector<Metric> handedOn;
    recorder.start([&handedOn](Metric metric) { handedOn.push_back(std::move(metric)); });
    for (const Metric& metric : metrics)
      scripted_->emit(metric);
    scripted_->flush();
    recorder.stop();
    EXPECT_EQ(recorder.writeFailed(), into.fail());
    return handedOn;
  }

  std::shared_ptr<testing::ScriptedMetricSource> scripted_ =
      std::make_shared<testing::ScriptedMetricSource>();
  std::ostringstream log_;
};

TEST_F(RecordingSourceTest, HandsEveryMetricOnAndRecordsItWithNonDecreasingTimes) {
  EXPECT_EQ(plain(recordThrough(kMetrics, 1500ms)), plain(kMetrics));

  const std::vector<MetricLogEntry> entries = entriesOf(log_.str());
  ASSERT_EQ(entries.size(), kMetrics.size());
  std::int64_t lastMs = 1500;
  for (std::size_t i = 0; i < entries.size(); ++i) {
    EXPECT_EQ(entries[i].record.find("kKeyMetricID")->asInteger(), kMetrics[i].metricId);
    EXPECT_EQ(*entries[i].record.find("kKeyPayload")->asBytes(), kMetrics[i].payload);
    ASSERT_TRUE(entries[i].deliveryMs);
    EXPECT_GE(*entries[i].deliveryMs, lastMs);
    lastMs = *entries[i].deliveryMs;
  }
}

TEST_F(RecordingSourceTest, PassesQueriesThroughWithoutRecordingThem) {
  scripted_->answerQueriesWith(kMetrics[2]);
  RecordingSource recorder(scripted_, log_);
  const std::optional<Metric> simFiles = recorder.query(0x3C0013);
  ASSERT_TRUE(simFiles);
  EXPECT_EQ(simFiles->payload, kMetrics[2].payload);
  EXPECT_FALSE(recorder.query(0x3C0001));
  EXPECT_TRUE(log_.str().empty());
}

TEST_F(RecordingSourceTest, StopsRecordingAtOnceWithAWarningWhenTheLogCannotBeWritten) {
  platform::log::Capture log;
  std::ofstream full("/dev/full");
  EXPECT_EQ(plain(recordThrough(kMetrics, 0ms, &full, "/dev/full")), plain(kMetrics));
  EXPECT_EQ(log.systemLines(),
            std::vector<std::string>{"cannot write /dev/full (No space left on device); recording "
                                     "stopped"});
}

}  // namespace
}  // namespace tarn::log
