#include "tarn/log/RecordingSource.h"

#include <gtest/gtest.h>

#include <chrono>
#include <fstream>
#include <sstream>
#include <string>
#include <utility>
#include <vector>

#include "platform/Log.h"
#include "tarn/testing/ScriptedMetricSource.h"

namespace tarn::log {
namespace {

using namespace std::chrono_literals;
using service::Metric;

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
