#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <map>
#include <string>

#include "alerts/AlertMonitor.h"
#include "alerts/AlertRules.h"

namespace alerts {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::StartsWith;

class AlertMonitorTest : public ::testing::Test {
 protected:
  AlertMonitor make(std::vector<AlertRule> rules) {
    return AlertMonitor(
        std::move(rules),
        [this](std::string_view series) -> std::optional<Reading> {
          const auto found = latest.find(std::string(series));
          if (found == latest.end()) return std::nullopt;
          return found->second;
        },
        ring);
  }

  // A sample of the series and the metric that brought it.
  void sample(AlertMonitor& monitor, std::int64_t timeMs, double value) {
    latest["lte.rsrp"] = {timeMs, value};
    monitor.metricArrived(timeMs);
  }

  // "severity@time text" of each event, oldest first.
  std::vector<std::string> found() const {
    std::vector<std::string> lines;
    ring.forEach([&lines](const events::Event& event) {
      lines.push_back(std::string(events::severityName(event.severity)) + '@' +
                      std::to_string(event.timeMs) + ' ' + event.text);
    });
    return lines;
  }

  std::map<std::string, Reading> latest;
  events::EventRing ring{64};
};

const AlertRule kWeak{"Weak LTE signal", "lte.rsrp", -110.0, std::nullopt, 5000};

TEST_F(AlertMonitorTest, StartsOnceTheLevelHeldForTheHoldTimeAndClearsWhenItRecovers) {
  AlertMonitor monitor = make({kWeak});
  const std::pair<std::int64_t, double> samples[] = {
      {0, -105},    {1000, -112}, {5000, -113},  {6000, -111},  {6500, -115},  {7000, -109},
      {8000, -112}, {9000, -108}, {10000, -112}, {14999, -112}, {15000, -112},
  };
  for (const auto& [time, value] : samples) {
    sample(monitor, time, value);
    if (time == 6500) {
      ASSERT_EQ(monitor.active().size(), 1u);
      EXPECT_EQ(*monitor.active()[0].asDictionary()->find("since_ms"),
                platform::Value(std::int64_t{6000}));
    }
  }
  EXPECT_THAT(found(),
              ElementsAre("warning@6000 Weak LTE signal: lte.rsrp below -110.0 for 5 s (-111.0)",
                          "info@7000 Weak LTE signal cleared: lte.rsrp -109.0",
                          "warning@15000 Weak LTE signal: lte.rsrp below -110.0 for 5 s (-112.0)"));

  // The phone left LTE: other metrics come, the RSRP stays as it was, and goes stale.
  monitor.metricArrived(20000);
  EXPECT_EQ(monitor.active().size(), 1u);
  monitor.metricArrived(25001);
  EXPECT_THAT(monitor.active(), IsEmpty());
  EXPECT_EQ(found().back(), "info@25001 Weak LTE signal cleared: lte.rsrp has no level");

  monitor.reset();
  EXPECT_THAT(monitor.active(), IsEmpty());
}

TEST_F(AlertMonitorTest, SilenceStartsByTheClockOrAfterTheGapAndClearsWithTheNextMetric) {
  AlertMonitor monitor = make({{"No metrics", "", std::nullopt, std::nullopt, 10000}});
  monitor.tick(50000);  // nothing came yet: nothing to miss
  monitor.metricArrived(0);
  monitor.tick(9999);
  EXPECT_THAT(found(), IsEmpty());
  monitor.tick(10000);
  monitor.tick(12000);
  EXPECT_EQ(monitor.active().size(), 1u);
  monitor.metricArrived(15000);
  // A gap no clock saw, as in a replay at full speed.
  monitor.metricArrived(40000);
  EXPECT_THAT(found(), ElementsAre("warning@10000 No metrics: none for 10 s",
                                   "info@15000 No metrics cleared: metrics again",
                                   "warning@25000 No metrics: none for 10 s",
                                   "info@40000 No metrics cleared: metrics again"));
  EXPECT_THAT(monitor.active(), IsEmpty());
}

TEST(AlertRules, ReadsAFileOfAlerts) {
  const LoadedRules loaded = parseRules(R"(# mine
[[alert]]
name = "Strong signal"
series = "lte.rsrp"
above = -60
hold_s = 2.5

[[alert]]
name = "Quiet"
silent_s = 30
)",
                                        "alerts.toml");
  EXPECT_THAT(loaded.errors, IsEmpty());
  ASSERT_EQ(loaded.rules.size(), 2u);
  EXPECT_EQ(loaded.rules[0].series, "lte.rsrp");
  EXPECT_EQ(loaded.rules[0].above, -60.0);
  EXPECT_FALSE(loaded.rules[0].below);
  EXPECT_EQ(loaded.rules[0].holdMs, 2500);
  EXPECT_TRUE(loaded.rules[1].watchesSilence());
  EXPECT_EQ(loaded.rules[1].holdMs, 30000);
}

TEST(AlertRules, NamesTheLineOfEachFaultAndFallsBackToTheDefaults) {
  const struct {
    const char* text;
    const char* error;
  } files[] = {
      {"name = 1\n", "alerts.toml:1: only [[alert]] tables belong here, not \"name\""},
      {"[[alert]\nname = \"x\"\n", "alerts.toml:1: "},
      {"\n[[alert]]\nname = \"x\"\nseries = \"lte.rsrp\"\nbelow = \"low\"\n",
       "alerts.toml:5: below wants a number"},
      {"[[alert]]\nname = \"x\"\nseries = \"lte.rsrp\"\n",
       "alerts.toml:1: an alert needs one of below and above"},
      {"[[alert]]\nname = \"x\"\nseries = \"a\"\nbelow = 1\nabove = 2\n",
       "alerts.toml:1: an alert needs one of below and above"},
      {"[[alert]]\nname = \"x\"\nsilent_s = 10\nseries = \"a\"\n",
       "alerts.toml:3: silent_s goes alone, without series, below, above or hold_s"},
      {"[[alert]]\nname = \"x\"\nseries = \"a\"\nabove = 3\nhold_s = -1\n",
       "alerts.toml:5: hold_s wants seconds from 0 to 86400"},
      {"[[alert]]\nname = \"x\"\nseries = \"a\"\nabove = 3\nhold_s = nan\n",
       "alerts.toml:5: hold_s wants seconds from 0 to 86400"},
      {"[[alert]]\nname = \"x\"\nseries = \"a\"\nbelow = -inf\n",
       "alerts.toml:4: below wants a number"},
      {"[[alert]]\nname = \"x\"\nsilent_s = 0\n",
       "alerts.toml:3: silent_s wants seconds from above 0 to 86400"},
      {"[[alert]]\nseries = \"a\"\nabove = 3\n", "alerts.toml:1: an alert needs a name"},
      {"[[alert]]\nname = \"x\"\nseries = \"a\"\nabove = 3\ncolour = \"red\"\n",
       "alerts.toml:5: unknown key \"colour\""},
  };
  const std::size_t defaults = defaultRules().size();
  for (const auto& file : files) {
    const LoadedRules loaded = parseRules(file.text, "alerts.toml");
    ASSERT_FALSE(loaded.errors.empty()) << file.text;
    EXPECT_THAT(loaded.errors[0], StartsWith(file.error)) << file.text;
    EXPECT_EQ(loaded.rules.size(), defaults) << file.text;
  }

  EXPECT_THAT(loadRules("/nonexistent/alerts.toml", false).errors, IsEmpty());
  EXPECT_THAT(loadRules("/nonexistent/alerts.toml", true).errors,
              ElementsAre("/nonexistent/alerts.toml: cannot read the file"));
}

}  // namespace
}  // namespace alerts
