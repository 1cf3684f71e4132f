#include "tarn/daemon/Options.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace tarn::daemon {
namespace {

ParsedOptions parse(std::vector<std::string_view> arguments) {
  return parseDaemonOptions(arguments);
}

TEST(DaemonOptions, ServesTheSimulatorOnTheSessionBusUnlessToldOtherwise) {
  const ParsedOptions defaults = parse({});
  ASSERT_TRUE(defaults.options) << defaults.error;
  EXPECT_EQ(std::get<SimulatorChoice>(defaults.options->source).seed, 1u);
  EXPECT_EQ(std::get<SimulatorChoice>(defaults.options->source).speed, 1.0);
  EXPECT_EQ(defaults.options->bus, "session");
  EXPECT_FALSE(defaults.options->recordPath);

  const ParsedOptions parsed = parse({"--speed", "60", "--seed", "18446744073709551615", "--source",
                                      "sim", "--bus", "system", "--record", "out.jsonl"});
  ASSERT_TRUE(parsed.options) << parsed.error;
  EXPECT_EQ(std::get<SimulatorChoice>(parsed.options->source).seed, 18446744073709551615u);
  EXPECT_EQ(std::get<SimulatorChoice>(parsed.options->source).speed, 60.0);
  EXPECT_EQ(parsed.options->bus, "system");
  EXPECT_EQ(parsed.options->recordPath, "out.jsonl");
}

TEST(DaemonOptions, ReadsAReplayWithItsPaceAndLoop) {
  const struct {
    std::vector<std::string_view> arguments;
    std::optional<double> speed;
    bool loop;
  } cases[] = {
      {{"--source", "replay:drive.jsonl", "--bus", "unix:path=/run/user/1000/bus"}, 1.0, false},
      {{"--source", "replay:drive.jsonl", "--speed", "0.5", "--loop"}, 0.5, true},
      {{"--as-fast-as-possible", "--source", "replay:drive.jsonl"}, std::nullopt, false},
      {{"--source", "replay:drive.jsonl", "--speed", "max"}, std::nullopt, false},
  };
  for (const auto& each : cases) {
    const ParsedOptions parsed = parse(each.arguments);
    ASSERT_TRUE(parsed.options) << parsed.error;
    const auto& replay = std::get<ReplayChoice>(parsed.options->source);
    EXPECT_EQ(replay.path, "drive.jsonl");
    EXPECT_EQ(replay.options.speed, each.speed);
    EXPECT_EQ(replay.options.loop, each.loop);
  }
  EXPECT_EQ(parse(cases[0].arguments).options->bus, "unix:path=/run/user/1000/bus");
}

TEST(DaemonOptions, RefusesArgumentsThatMakeNoSenseAndSaysWhyUnlessAskedForHelp) {
  const struct {
    std::vector<std::string_view> arguments;
    std::string_view error;
  } cases[] = {
      {{"--source", "replay:"}, "--source wants sim or replay:FILE.jsonl, not replay:"},
      {{"--seed", "-1"}, "--seed wants a whole number of at least 0"},
      {{"--seed", "18446744073709551616"}, "--seed wants a whole number of at least 0"},
      {{"--speed", "0"}, "--speed wants a number above 0"},
      {{"--speed", "100000"}, "--speed of the simulator is at most 10000, not 100000"},
      {{"--speed", "1e9"}, "--speed of the simulator is at most 10000, not 1e9"},
      {{"--speed", "fast"}, "--speed wants a number above 0"},
      {{"--loop"}, "--as-fast-as-possible and --loop go with --source replay:FILE"},
      {{"--source", "replay:a.jsonl", "--seed", "2"}, "--seed goes with --source sim"},
      {{"--source", "replay:a.jsonl", "--speed", "2", "--as-fast-as-possible"},
       "--speed and --as-fast-as-possible exclude each other"},
      {{"--bus", "user"},
       "--bus wants session, system or a D-Bus address such as unix:path=/run/user/1000/bus"},
      {{"--record", ""}, "--record needs a file name"},
      {{"sim"}, "unexpected argument sim"},
  };
  for (auto [arguments, error] : cases) {
    const ParsedOptions parsed = parse(arguments);
    EXPECT_FALSE(parsed.options) << error;
    EXPECT_EQ(parsed.error, error);
    arguments.push_back("--help");
    EXPECT_TRUE(parse(arguments).options.value_or(DaemonOptions{}).help) << error;
  }
}

}  // namespace
}  // namespace tarn::daemon
