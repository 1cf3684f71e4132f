#include "tarn/replay/ReplaySource.h"

#include <gtest/gtest.h>
#include <unistd.h>

#include <chrono>
#include <condition_variable>
#include <filesystem>
#include <fstream>
#include <memory>
#include <mutex>
#include <sstream>
#include <stdexcept>
#include <string>
#include <vector>

#include "tarn/testing/ManualClock.h"

using namespace std::chrono_literals;
using tarn::replay::ReplayOptions;
using tarn::replay::ReplaySource;
using tarn::service::Metric;

namespace {

// "AQI=" is the payload {1, 2}.
std::string line(std::uint32_t metricId, std::int64_t deliveryMs) {
  return "{\"kKeyMetricID\":" + std::to_string(metricId) +
         ",\"kKeyPayload\":\"AQI=\",\"t_ms\":" + std::to_string(deliveryMs) + "}\n";
}

class ReplaySourceTest : public ::testing::Test {
 protected:
  ReplaySourceTest()
      : directory_(std::filesystem::temp_directory_path() /
                   ("norvo-replay-" + std::to_string(::getpid()))) {
    std::filesystem::create_directories(directory_);
  }
  ~ReplaySourceTest() override { std::filesystem::remove_all(directory_); }

  std::string writeLog(const std::string& contents) {
    std::string path = (directory_ / "metrics.jsonl").string();
    std::ofstream(path, std::ios::binary | std::ios::trunc) << contents;
    return path;
  }

  // A source over a log of `contents`, started on the test's clock.
  std::unique_ptr<ReplaySource> started(const std::string& contents, ReplayOptions options) {
    auto source = std::make_unique<ReplaySource>(writeLog(contents), options, errors_, clock);
    startRecording(*source);
    return source;
  }

  // The metric IDs delivered, with the clock's time since start() at each.
  struct Delivered {
    std::uint32_t metricId;
    std::chrono::nanoseconds after;
  };

  void startRecording(ReplaySource& source) {
    const auto began = clock->now();
    source.start([this, began](const Metric& metric) {
      const std::lock_guard lock(mutex_);
      delivered_.push_back({metric.metricId, clock->now() - began});
      arrived_.notify_all();
    });
  }

  // Waits for `count` metrics (a stuck source fails by the test's timeout).
  std::vector<Delivered> waitFor(std::size_t count) {
    std::unique_lock lock(mutex_);
    arrived_.wait(lock, [this, count] { return delivered_.size() >= count; });
    return delivered_;
  }

  std::vector<std::uint32_t> ids(const std::vector<Delivered>& delivered) {
    std::vector<std::uint32_t> result;
    for (const Delivered& one : delivered)
      result.push_back(one.metricId);
    return result;
  }

  std::shared_ptr<tarn::testing::ManualClock> clock =
      std::make_shared<tarn::testing::ManualClock>();
  std::filesystem::path directory_;
  std::ostringstream errors_;
  std::mutex mutex_;
  std::condition_variable arrived_;
  std::vector<Delivered> delivered_;
};

TEST_F(ReplaySourceTest, DeliversTheLogInOrderAtItsTimesScaledBySpeed) {
  // 2000 ms of log at speed 20: 100 ms on the clock.
  const auto source = started(line(1, 0) + line(2, 1000) + line(3, 2000), {.speed = 20.0});
  clock->awaitWaiter();
  EXPECT_EQ(ids(waitFor(0)), (std::vector<std::uint32_t>{1}));
  clock->advance(49ms);
  clock->awaitWaiter();
  EXPECT_EQ(ids(waitFor(0)), (std::vector<std::uint32_t>{1}));
  clock->advance(1ms);
  clock->awaitWaiter();
  EXPECT_EQ(ids(waitFor(0)), (std::vector<std::uint32_t>{1, 2}));
  clock->advance(50ms);
  const std::vector<Delivered> delivered = waitFor(3);
  ASSERT_EQ(ids(delivered), (std::vector<std::uint32_t>{1, 2, 3}));
  EXPECT_EQ(delivered[0].after, 0ms);
  EXPECT_EQ(delivered[1].after, 50ms);
  EXPECT_EQ(delivered[2].after, 100ms);
  EXPECT_TRUE(errors_.str().empty());
}

TEST_F(ReplaySourceTest, WithoutSpeedDeliversEverythingAtOnceIgnoringTheGapsAndOnlyOnce) {
  const auto source =
      started(line(1, 0) + line(2, 3'600'000) + line(3, 7'200'000), {.speed = std::nullopt});
  EXPECT_EQ(ids(waitFor(3)), (std::vector<std::uint32_t>{1, 2, 3}));
  source->stop();  // the worker has ended on its own, or ends now
  EXPECT_EQ(waitFor(0).size(), 3u);
}

TEST_F(ReplaySourceTest, LoopingStartsOverAfterTheLastMetricAndStopsOnlyWhenAsked) {
  const auto source = started(line(1, 0) + line(2, 10), {.speed = 10.0, .loop = true});
  // Each pass carries on 1 ms after the last: 1 at 0, 2 at 1, 1 at 1, 2 at 2, 1 at 2...
  for (int ms = 0; ms < 3; ++ms) {
    clock->awaitWaiter();
    clock->advance(1ms);
  }
  const std::vector<Delivered> delivered = waitFor(5);
  source->stop();
  EXPECT_EQ(ids(delivered).at(2), 1u);
  EXPECT_EQ(ids(delivered).at(3), 2u);
  EXPECT_EQ(ids(delivered).at(4), 1u);
  EXPECT_EQ(delivered.at(2).after, delivered.at(1).after);

  const std::size_t afterStop = waitFor(0).size();
  clock->advance(1h);
  EXPECT_EQ(waitFor(0).size(), afterStop);
}

TEST_F(ReplaySourceTest, ReportsBrokenLinesWithTheirNumbersAndReplaysTheRest) {
  const std::string path = writeLog(line(1, 0) + "{\"kKeyMetricID\": 7,\n" +  // 2: cut short
                                    "\n" +                                    // 3: blank
                                    R"({"kKeyPayload":"AQI="})"
                                    "\n" +  // 4: no metric ID
                                    R"({"kKeyMetricID":-1,"kKeyPayload":"AQI="})"
                                    "\n" +  // 5
                                    R"({"kKeyMetricID":7})"
                                    "\n" +  // 6: no payload
                                    R"({"kKeyMetricID":7,"kKeyPayload":"AQI=","t_ms":-3})"
                                    "\n" +
                                    line(2, 5));
  std::ostringstream errors;
  ReplaySource source(path, {.speed = std::nullopt, .loop = false}, errors);
  const std::string report = errors.str();
  for (const char* at : {":2: ", ":4: ", ":5: ", ":6: ", ":7: "})
    EXPECT_NE(report.find(path + at), std::string::npos) << at << " in\n" << report;
  EXPECT_EQ(report.find(path + ":1: "), std::string::npos);
  EXPECT_EQ(report.find(path + ":3: "), std::string::npos);
  EXPECT_EQ(report.find(path + ":8: "), std::string::npos);

  startRecording(source);
  EXPECT_EQ(ids(waitFor(2)), (std::vector<std::uint32_t>{1, 2}));
}

// The clock never reaches the second metric: stop() must not wait for it.
TEST_F(ReplaySourceTest, StopsInTheMiddleOfALongGap) {
  const auto source = started(line(1, 0) + line(2, 3'600'000), {.speed = 1.0});
  clock->awaitWaiter();
  source->stop();
  EXPECT_EQ(ids(waitFor(0)), (std::vector<std::uint32_t>{1}));
}

TEST_F(ReplaySourceTest, AnswersTheSimFileQueryWithTheLastSimFilesOfTheLog) {
  constexpr std::uint32_t kSimFiles = 0x3C0013;
  const std::string path = writeLog(line(kSimFiles, 0) +
                                    R"({"kKeyMetricID":3932179,"kKeyPayload":"Aw=="})"
                                    "\n" +
                                    line(1, 5));
  std::ostringstream errors;
  ReplaySource source(path, {}, errors);
  const std::optional<Metric> simFiles = source.query(kSimFiles);
  ASSERT_TRUE(simFiles);
  EXPECT_EQ(simFiles->payload, (platform::Bytes{3}));
  EXPECT_FALSE(source.query(1));

  ReplaySource withoutSimFiles(writeLog(line(1, 0)), {}, errors);
  EXPECT_FALSE(withoutSimFiles.query(kSimFiles));
}

TEST_F(ReplaySourceTest, RefusesAMissingFileAndASpeedThatIsNotAboveZero) {
  std::ostringstream errors;
  EXPECT_THROW(ReplaySource((directory_ / "missing.jsonl").string(), {}, errors),
               std::runtime_error);
  const std::string path = writeLog(line(1, 0));
  EXPECT_THROW(ReplaySource(path, {.speed = 0.0, .loop = false}, errors), std::invalid_argument);
}

}  // namespace
