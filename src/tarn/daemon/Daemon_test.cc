#include <gtest/gtest.h>
#include <unistd.h>

#include <filesystem>
#include <fstream>
#include <sstream>
#include <stdexcept>
#include <string>
#include <vector>

#include "tarn/daemon/Options.h"
#include "tarn/daemon/RecordFile.h"

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

TEST(DaemonOptions, ReadsAModemManagerSourceWithItsModemAndRefresh) {
  const struct {
    std::vector<std::string_view> arguments;
    std::string_view modem;
    std::chrono::seconds refresh;
  } cases[] = {
      {{"--source", "modemmanager"}, "", std::chrono::seconds(2)},
      {{"--source", "modemmanager:3", "--refresh", "1"}, "3", std::chrono::seconds(1)},
      {{"--source", "modemmanager:/org/freedesktop/ModemManager1/Modem/0", "--refresh", "5"},
       "/org/freedesktop/ModemManager1/Modem/0",
       std::chrono::seconds(5)},
      {{"--source", "modemmanager:356938035643809", "--bus", "system"},
       "356938035643809",
       std::chrono::seconds(2)},
  };
  for (const auto& each : cases) {
    const ParsedOptions parsed = parse(each.arguments);
    ASSERT_TRUE(parsed.options) << parsed.error;
    const auto& modem = std::get<ModemManagerChoice>(parsed.options->source);
    EXPECT_EQ(modem.modem, each.modem);
    EXPECT_EQ(modem.refresh, each.refresh);
  }
}

TEST(DaemonOptions, ReadsWhereAndHowToPublish) {
  const ParsedOptions parsed =
      parse({"--bus", "none", "--publish", "mqtts://car:s3:cr3t@[::1]:8884/drive/test/",
             "--mqtt-ca", "ca.pem", "--device", "car-7", "--qos", "0", "--mqtt-queue", "12"});
  ASSERT_TRUE(parsed.options) << parsed.error;
  ASSERT_TRUE(parsed.options->publish);
  const PublishChoice& publish = *parsed.options->publish;
  EXPECT_EQ(publish.broker, (mqtt::BrokerAddress{.tls = true,
                                                 .user = "car",
                                                 .password = "s3:cr3t",
                                                 .host = "::1",
                                                 .port = 8884,
                                                 .path = "drive/test"}));
  EXPECT_EQ(publish.broker.shown(), "mqtts://[::1]:8884/drive/test");
  EXPECT_EQ(publish.caFile, "ca.pem");
  EXPECT_EQ(publish.device, "car-7");
  EXPECT_EQ(publish.qos, 0);
  EXPECT_EQ(publish.queueLimit, 12u);

  const ParsedOptions defaults = parse({"--publish", "mqtt://broker.lan/fleet"});
  ASSERT_TRUE(defaults.options && defaults.options->publish) << defaults.error;
  EXPECT_EQ(defaults.options->publish->broker.shown(), "mqtt://broker.lan:1883/fleet");
  EXPECT_FALSE(defaults.options->publish->broker.user);
  EXPECT_FALSE(defaults.options->publish->device);
  EXPECT_EQ(defaults.options->publish->qos, 1);
  EXPECT_EQ(defaults.options->bus, "session");
}

TEST(DaemonOptions, RefusesArgumentsThatMakeNoSenseAndSaysWhyUnlessAskedForHelp) {
  const struct {
    std::vector<std::string_view> arguments;
    std::string_view error;
  } cases[] = {
      {{"--source", "replay:"},
       "--source wants sim, replay:FILE.jsonl or modemmanager[:MODEM], not replay:"},
      {{"--refresh", "2"}, "--refresh goes with --source modemmanager"},
      {{"--source", "modemmanager", "--refresh", "6"}, "--refresh wants whole seconds from 1 to 5"},
      {{"--source", "modemmanager", "--refresh", "0"}, "--refresh wants whole seconds from 1 to 5"},
      {{"--source", "modemmanager", "--seed", "2"},
       "--seed, --speed, --as-fast-as-possible and --loop do not go with a modem"},
      {{"--seed", "-1"}, "--seed wants a whole number of at least 0"},
      {{"--seed", "18446744073709551616"}, "--seed wants a whole number of at least 0"},
      {{"--speed", "0"}, "--speed wants a number above 0"},
      {{"--speed", "100000"}, "--speed of the simulator is at most 10000, not 100000"},
      {{"--speed", "fast"}, "--speed wants a number above 0"},
      {{"--loop"}, "--as-fast-as-possible and --loop go with --source replay:FILE"},
      {{"--source", "replay:a.jsonl", "--seed", "2"}, "--seed goes with --source sim"},
      {{"--source", "replay:a.jsonl", "--speed", "2", "--as-fast-as-possible"},
       "--speed and --as-fast-as-possible exclude each other"},
      {{"--bus", "user"},
       "--bus wants session, system, none or a D-Bus address such as "
       "unix:path=/run/user/1000/bus"},
      {{"--bus", "none"}, "--bus none serves nobody: it goes with --publish"},
      {{"--publish", "tcp://broker/fleet"},
       "--publish: a broker address starts with mqtt:// or mqtts://"},
      {{"--publish", "mqtt://broker"},
       "--publish: the broker address needs a topic prefix after the host"},
      {{"--publish", "mqtt://broker/fleet/#"},
       "--publish: topic levels are not empty and hold no \"+\" or \"#\""},
      {{"--publish", "mqtt://broker:0/fleet"},
       "--publish: the broker's port is a number from 1 to 65535"},
      {{"--publish", "mqtt://broker/fleet", "--mqtt-ca", "ca.pem"},
       "--mqtt-ca goes with an mqtts:// broker"},
      {{"--publish", "mqtt://broker/fleet", "--device", "car/1"},
       "--device wants a name without \"/\", \"+\" or \"#\""},
      {{"--publish", "mqtt://broker/fleet", "--qos", "2"}, "--qos wants 0 or 1"},
      {{"--publish", "mqtt://broker/fleet", "--mqtt-queue", "-5"},
       "--mqtt-queue wants a number of metrics"},
      {{"--device", "car"}, "--mqtt-ca, --device, --qos and --mqtt-queue go with --publish"},
      {{"--record", ""}, "--record needs a file name"},
      {{"sim"}, "unexpected argument sim"},
  };
  for (auto [arguments, error] : cases) {
    const ParsedOptions parsed = parse(arguments);
    EXPECT_FALSE(parsed.options) << error;
    EXPECT_EQ(parsed.error, error);
    arguments.emplace_back("--help");
    EXPECT_TRUE(parse(arguments).options.value_or(DaemonOptions{}).help) << error;
  }
}

std::string contentsOf(const std::filesystem::path& path) {
  std::ifstream file(path, std::ios::binary);
  std::ostringstream contents;
  contents << file.rdbuf();
  return contents.str();
}

class RecordFileTest : public ::testing::Test {
 protected:
  ~RecordFileTest() override { std::filesystem::remove(path_); }

  const std::filesystem::path path_ = std::filesystem::temp_directory_path() /
                                      ("norvo-record-" + std::to_string(::getpid()) + ".jsonl");
};

TEST_F(RecordFileTest, EmptiesTheFileAndWritesIt) {
  std::ofstream(path_) << "an older recording\n";
  RecordFile record(path_.string());
  record.stream() << "{}\n";
  EXPECT_TRUE(record.close());
  EXPECT_EQ(contentsOf(path_), "{}\n");
}

TEST_F(RecordFileTest, ASecondRecorderOfTheSameFileFailsWithoutTouchingIt) {
  RecordFile first(path_.string());
  first.stream() << "{}\n" << std::flush;
  try {
    RecordFile second(path_.string());
    FAIL() << "a second recorder took the file";
  } catch (const std::runtime_error& error) {
    EXPECT_NE(std::string(error.what()).find("another process"), std::string::npos) << error.what();
  }
  EXPECT_EQ(contentsOf(path_), "{}\n");
}

}  // namespace
}  // namespace tarn::daemon
