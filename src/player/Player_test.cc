#include "player/Player.h"

#include <gtest/gtest.h>

#include <map>
#include <sstream>
#include <string>
#include <vector>

#include "events/EventDetector.h"
#include "platform/Format.h"
#include "platform/Json.h"
#include "platform/Log.h"
#include "series/SeriesStore.h"
#include "store/MetricValidator.h"
#include "store/StoreDump.h"
#include "tarn/sim/Simulator.h"

namespace player {
namespace {

using namespace std::chrono_literals;
using Clock = Player::Clock;

// A drive of numbered records at the given times.
Drive numbered(const std::vector<std::int64_t>& times) {
  Drive drive;
  for (std::size_t i = 0; i < times.size(); ++i)
    drive.metrics.push_back({times[i], {{"n", static_cast<std::int64_t>(i)}}});
  return drive;
}

class PlayerPacing : public ::testing::Test {
 protected:
  Player make(const std::vector<std::int64_t>& times, std::optional<double> speed,
              bool loop = false) {
    return Player(numbered(times),
                  {[this] {
                     delivered.clear();
                     ++resets;
                   },
                   [this](const platform::Dictionary& record) {
                     delivered.push_back(*record.find("n")->asInteger());
                   }},
                  speed, loop, [this] { return now; });
  }

  Clock::time_point now = Clock::time_point(1h);
  std::vector<std::int64_t> delivered;
  int resets = 0;
};

TEST_F(PlayerPacing, DeliversEachMetricWhenItsScaledTimeComes) {
  Player player = make({0, 1000, 2500}, 2.0);
  EXPECT_EQ(player.deliverDue(100), std::nullopt) << "paused until asked to play";
  player.play();
  EXPECT_EQ(player.deliverDue(100), now + 500ms);
  EXPECT_EQ(delivered, (std::vector<std::int64_t>{0}));
  now += 499ms;
  EXPECT_EQ(player.deliverDue(100), now + 1ms);
  EXPECT_EQ(delivered.size(), 1u);
  now += 1ms;
  EXPECT_EQ(player.deliverDue(100), now + 750ms);
  EXPECT_EQ(delivered, (std::vector<std::int64_t>{0, 1}));
  EXPECT_EQ(player.state().positionMs, 1000);

  // Paused, time stands still; at another speed it goes on from where it stood.
  now += 100ms;
  player.pause();
  now += 10s;
  EXPECT_EQ(player.state().positionMs, 1200);
  EXPECT_EQ(player.deliverDue(100), std::nullopt);
  player.setSpeed(1.0);
  player.play();
  EXPECT_EQ(player.deliverDue(100), now + 1300ms);
  now += 1300ms;
  // The last metric: the drive ends and the player pauses at its end.
  EXPECT_EQ(player.deliverDue(100), std::nullopt);
  EXPECT_EQ(delivered, (std::vector<std::int64_t>{0, 1, 2}));
  EXPECT_FALSE(player.state().playing);
  EXPECT_EQ(player.state().positionMs, 2500);

  // Playing at the end starts over from a fresh state.
  player.play();
  EXPECT_EQ(resets, 1);
  EXPECT_EQ(delivered, (std::vector<std::int64_t>{0}));
}

TEST_F(PlayerPacing, SeeksByRebuildingFromTheStart) {
  Player player = make({0, 1000, 1000, 2500, 4000}, 1.0);
  const struct {
    std::int64_t seekTo;
    std::vector<std::int64_t> expected;
    std::int64_t position;
  } seeks[] = {
      {2500, {0, 1, 2, 3}, 2500},    {999, {0}, 999}, {1000, {0, 1, 2}, 1000}, {-5, {0}, 0},
      {9000, {0, 1, 2, 3, 4}, 4000},
  };
  int expectedResets = 0;
  for (const auto& seek : seeks) {
    player.seek(seek.seekTo);
    EXPECT_EQ(resets, ++expectedResets);
    EXPECT_EQ(delivered, seek.expected) << seek.seekTo;
    EXPECT_EQ(player.state().positionMs, seek.position) << seek.seekTo;
    EXPECT_FALSE(player.state().playing);
  }
  // Playing on after a seek delivers only what comes after it.
  player.seek(1000);
  player.play();
  now += 1499ms;
  player.deliverDue(100);
  EXPECT_EQ(delivered, (std::vector<std::int64_t>{0, 1, 2}));
  now += 1ms;
  player.deliverDue(100);
  EXPECT_EQ(delivered, (std::vector<std::int64_t>{0, 1, 2, 3}));
}

TEST_F(PlayerPacing, AtMaximumSpeedDeliversInBatchesAndLoopsWithoutAReset) {
  Player player = make({0, 10, 20, 30, 40}, std::nullopt, true);
  player.play();
  EXPECT_EQ(player.deliverDue(2), now);
  EXPECT_EQ(delivered, (std::vector<std::int64_t>{0, 1}));
  EXPECT_EQ(player.state().positionMs, 10);
  EXPECT_EQ(player.deliverDue(2), now);
  EXPECT_EQ(player.deliverDue(2), now);
  EXPECT_EQ(delivered, (std::vector<std::int64_t>{0, 1, 2, 3, 4}));
  // Looping carries on from the first metric, keeping what was built.
  EXPECT_EQ(player.deliverDue(2), now);
  EXPECT_EQ(delivered, (std::vector<std::int64_t>{0, 1, 2, 3, 4, 0, 1}));
  EXPECT_EQ(resets, 0);
  EXPECT_THROW(player.setSpeed(0.0), std::invalid_argument);
}

TEST_F(PlayerPacing, AnEmptyDriveNeverDelivers) {
  Player player = make({}, 1.0, true);
  player.play();
  EXPECT_EQ(player.deliverDue(10), std::nullopt);
  player.seek(100);
  EXPECT_EQ(player.state().positionMs, 0);
}

// The store, the events and the series after a seek to a time equal those of an intake of the
// log's metrics up to that time.
TEST(PlayerSeek, RebuildsWhatAnIntakeOfTheLogUpToThatTimeBuilds) {
  setenv("TZ", "UTC", 1);
  platform::log::Capture quiet;
  constexpr std::uint64_t kStartMs = 1718100000000;
  tarn::sim::Simulator simulator(7, kStartMs);
  Drive drive;
  // LTE, then UMTS from 155 s, GSM from 217 s, and LTE again from 403 s.
  for (tarn::sim::TimedMetric& timed : simulator.advance(410 * 1000)) {
    drive.metrics.push_back({static_cast<std::int64_t>(timed.atMs - kStartMs),
                             {{"kKeyMetricID", std::int64_t{timed.metric.metricId}},
                              {"kKeyPayload", std::move(timed.metric.payload)}}});
  }
  const Drive copy = drive;

  // The store, the events and the series, as the viewer keeps them.
  struct Viewer {
    Viewer() {
      intake.addAcceptedMetricObserver([this](std::int64_t id, const platform::Bytes* payload,
                                              const platform::Dictionary& decoded) {
        detector.observe(id, payload, decoded);
        const platform::Value* time = decoded.find("timestamp");
        if (time != nullptr && time->asInteger()) recordTimeMs = *time->asInteger();
      });
      intake.addStoreObserver(
          [this](store::DisplayDictionary replaced, const store::MetricValidator& converted) {
            levels.storeDidUpdate(replaced, converted);
          });
    }
    // The store, the event texts and the samples, as text.
    std::vector<std::string> seen() const {
      std::string events;
      ring.forEach([&events](const events::Event& event) { events += event.text + '\n'; });
      std::string samples;
      for (const auto& series : levels.definitions()) {
        const std::optional<series::SampleRange> held = levels.since(series.name, 0);
        for (const series::Sample sample : *held)
          samples += platform::format("%s %d %g\n", series.name, sample.timeMs, sample.value);
      }
      return {platform::toJson(store::dumpStore(intake)), events, samples};
    }
    store::MetricValidator intake{nullptr};
    events::EventRing ring;
    events::EventDetector detector{ring};
    std::int64_t recordTimeMs = 0;
    series::SeriesStore levels{[this] { return recordTimeMs; }};
  };
  Viewer seeking;
  Player player(
      std::move(drive),
      {[&seeking] {
         seeking.intake.clearStore();
         seeking.ring.clear();
         seeking.detector.reset();
         seeking.levels.clear();
       },
       [&seeking](const platform::Dictionary& record) { seeking.intake.metricsDidUpdate(record); }},
      1.0, false, [] { return Clock::now(); });
  player.play();
  player.deliverDue(100000);

  // Each seek rebuilds from the start: forward onto GSM, back onto LTE, to the start, to the end
  // back on LTE, and back onto UMTS.
  const std::int64_t seeks[] = {300'000, 42'000, 0, 409'900, 180'500};
  // What an intake of the log up to each time holds, taken in one pass over the log.
  std::map<std::int64_t, std::vector<std::string>> upTo;
  for (const std::int64_t seekTo : seeks)
    upTo[seekTo];
  Viewer fresh;
  auto next = copy.metrics.begin();
  for (auto& [seekTo, seen] : upTo) {
    for (; next != copy.metrics.end() && next->atMs <= seekTo; ++next)
      fresh.intake.metricsDidUpdate(next->record);
    seen = fresh.seen();
    if (seekTo > 0) {
      EXPECT_FALSE(seen[1].empty()) << seekTo;
    }
  }

  for (const std::int64_t seekTo : seeks) {
    player.seek(seekTo);
    EXPECT_EQ(seeking.seen(), upTo[seekTo]) << seekTo;
  }
}

}  // namespace
}  // namespace player
