#include "tarn/daemon/Options.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace tarn::daemon {
namespace {

ParsedOptions parse(std::vector<std::string_view> arguments) {
  return parseDaemonOptions(arguments);
}

TEST(DaemonOptions, WithoutArgumentsServesTheSimulatorOnTheSessionBus) {
  const ParsedOptions parsed = parse({});
  ASSERT_TRUE(parsed.options) << parsed.error;
  const auto* simulator = std::get_if<SimulatorChoice>(&parsed.options->source);
  ASSERT_TRUE(simulator);
  EXPECT_EQ(simulator->seed, 1u);
  EXPECT_EQ(simulator->speed, 1.0);
  EXPECT_EQ(parsed.options->bus, "session");
  EXPECT_FALSE(parsed.options->recordPath);
  EXPECT_FALSE(parsed.options->help);
}

TEST(DaemonOptions, ReadsTheSimulatorsSeedAndSpeedInAnyOrder) {
  const ParsedOptions parsed = parse({"--speed", "60", "--seed", "18446744073709551615", "--source",
                                      "sim", "--bus", "system", "--record", "out.jsonl"});
  ASSERT_TRUE(parsed.options) << parsed.error;
  const auto& simulator = std::get<SimulatorChoice>(parsed.options->source);
  EXPECT_EQ(simulator.seed, 18446744073709551615u);
  EXPECT_EQ(simulator.speed, 60.0);
  EXPECT_EQ(parsed.options->bus, "system");
  EXPECT_EQ(parsed.options->recordPath, "out.jsonl");
}

TEST(DaemonOptions, ReadsAReplayWithItsPaceAndLoop) {
  struct Case {
    std::vector<std::string_view> arguments;
    std::optional<double> speed;
    bool loop;
  };
  const Case cases[] = {
      {{"--source", "replay:drive.jsonl", "--bus", "unix:path=/run/user/1000/bus"}, 1.0, false},
      {{"--source", "replay:drive.jsonl", "--speed", "0.5", "--loop"}, 0.5, true},
      {{"--as-fast-as-possible", "--source", "replay:drive.jsonl"}, std::nullopt, false},
      {{"--source", "replay:drive.jsonl", "--speed", "max"}, std::nullopt, false},
  };
  for (const Case& each : cases) {
    const ParsedOptions parsed = parse(each.arguments);
    ASSERT_TRUE(parsed.options) << parsed.error;
    const auto& replay = std::get<ReplayChoice>(parsed.options->source);
    EXPECT_EQ(replay.path, "drive.jsonl");
    EXPECT_EQ(replay.options.speed, each.speed);
    EXPECT_EQ(replay.options.loop, each.loop);
  }
  EXPECT_EQ(parse(cases[0].arguments).options->bus, "unix:path=/run/user/1000/bus");
}

TEST(DaemonOptions, HelpWinsOverOtherwiseWrongCombinations) {
  const ParsedOptions parsed = parse({"--seed", "x", "--help"});
  ASSERT_TRUE(parsed.options) << parsed.error;
  EXPECT_TRUE(parsed.options->help);
}

TEST(DaemonOptions, RefusesArgumentsThatMakeNoSenseAndSaysWhich) {
  struct Case {
    std::vector<std::string_view> arguments;
    std::string_view error;
  };
  const Case cases[] = {
      {{"--source"}, "--source needs a value"},
      {{"--source", "replay:"}, "--source wants sim or replay:FILE.jsonl, not replay:"},
      {{"--source", "radio"}, "--source wants sim or replay:FILE.jsonl, not radio"},
      {{"--seed", "-1"}, "--seed wants a whole number of at least 0"},
      {{"--seed", "18446744073709551616"}, "--seed wants a whole number of at least 0"},
      {{"--speed", "0"}, "--speed wants a number above 0"},
      {{"--speed", "fast"}, "--speed wants a number above 0"},
      {{"--loop"}, "--as-fast-as-possible and --loop go with --source replay:FILE"},
      {{"--source", "replay:a.jsonl", "--seed", "2"}, "--seed goes with --source sim"},
      {{"--source", "replay:a.jsonl", "--speed", "2", "--as-fast-as-possible"},
       "--speed and --as-fast-as-possible exclude each other"},
      {{"--bus", "user"},
       "--bus wants session, system or a D-Bus address such as unix:path=/run/user/1000/bus"},
      {{"--record", ""}, "--record needs a file name"},
      {{"--verbose"}, "unknown option --verbose"},
      {{"sim"}, "unexpected argument sim"},
  };
  for (const Case& each : cases) {
    const ParsedOptions parsed = parse(each.arguments);
    EXPECT_FALSE(parsed.options) << each.error;
    EXPECT_EQ(parsed.error, each.error);
  }
}

}  // namespace
}  // namespace tarn::daemon
