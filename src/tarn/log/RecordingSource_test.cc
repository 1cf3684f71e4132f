#include "tarn/log/RecordingSource.h"

#include <gtest/gtest.h>
#include <unistd.h>

#include <chrono>
#include <filesystem>
#include <fstream>
#include <future>
#include <mutex>
#include <sstream>
#include <string>
#include <utility>
#include <vector>

#include "platform/Log.h"
#include "tarn/replay/ReplaySource.h"
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
  // Emits `metrics` through a recording source, started `ago` before now, and answers what was
  // handed on to the service.
  std::vector<Metric> recordThrough(const std::vector<Metric>& metrics,
                                    std::chrono::milliseconds ago = 0ms) {
    RecordingSource recorder(scripted_, log_, "the log", RecordingSource::Clock::now() - ago);
    std::vector<Metric> handedOn;
    recorder.start([&handedOn](Metric metric) { handedOn.push_back(std::move(metric)); });
    for (const Metric& metric : metrics)
      scripted_->emit(metric);
    scripted_->flush();
    recorder.stop();
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

TEST_F(RecordingSourceTest, ReplayingTheRecordingDeliversTheSameMetricsInTheSameOrder) {
  recordThrough(kMetrics);
  const std::filesystem::path path = std::filesystem::temp_directory_path() /
                                     ("norvo-recording-" + std::to_string(::getpid()) + ".jsonl");
  std::ofstream(path, std::ios::binary | std::ios::trunc) << log_.str();

  std::ostringstream errors;
  replay::ReplaySource replay(path.string(), {.speed = std::nullopt, .loop = false}, errors);
  std::filesystem::remove(path);
  EXPECT_TRUE(errors.str().empty()) << errors.str();

  std::mutex mutex;
  std::vector<Metric> replayed;
  std::promise<void> done;
  replay.start([&](Metric metric) {
    const std::lock_guard lock(mutex);
    replayed.push_back(std::move(metric));
    if (replayed.size() == kMetrics.size()) done.set_value();
  });
  ASSERT_EQ(done.get_future().wait_for(5s), std::future_status::ready);
  replay.stop();
  EXPECT_EQ(plain(replayed), plain(kMetrics));
}

TEST(ARecordingSource, StopsRecordingAtOnceWithAWarningWhenTheLogCannotBeWritten) {
  platform::log::Capture log;
  const auto scripted = std::make_shared<testing::ScriptedMetricSource>();
  std::ofstream full("/dev/full");
  RecordingSource recorder(scripted, full, "/dev/full");
  std::vector<Metric> handedOn;
  recorder.start([&handedOn](Metric metric) { handedOn.push_back(std::move(metric)); });
  for (const Metric& metric : kMetrics)
    scripted->emit(metric);
  scripted->flush();
  recorder.stop();

  EXPECT_TRUE(recorder.writeFailed());
  EXPECT_EQ(plain(handedOn), plain(kMetrics));
  EXPECT_EQ(log.systemLines(),
            std::vector<std::string>{"cannot write /dev/full (No space left on device); recording "
                                     "stopped"});
}

}  // namespace
}  // namespace tarn::log
