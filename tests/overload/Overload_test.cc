// Norvo as a user runs it, offered more than it can take: a drive replayed without pauses,
// looping, and the simulator at its fastest. The assertions are on what must hold however loaded
// the machine is: nothing lost where the source can be held back, memory within bounds, every
// page answered, and a prompt end on SIGINT or SIGTERM.
#include <gtest/gtest.h>

#include <boost/json/parse.hpp>
#include <csignal>
#include <fstream>

#include "ChildProcess.h"
#include "Eventually.h"
#include "Files.h"
#include "LoopbackHttp.h"
#include "TemporaryFolder.h"
#include "tarn/log/MetricLog.h"
#include "tarn/service/Configuration.h"
#include "tarn/sim/Simulator.h"

namespace {

using namespace std::chrono_literals;
using bustest::ChildProcess;
using bustest::contentsOf;
using bustest::eventually;
using bustest::get;

constexpr std::uint64_t kStartMs = 1'700'000'000'000;
// Three simulated minutes: several of the replay's batches of 200 metrics, written and looped
// over within moments even under AddressSanitizer.
constexpr std::uint64_t kDriveMs = 3 * 60 * 1000;
// The bound that Norvo's resident memory must stay under, whatever the rate offered. Under
// AddressSanitizer freed memory waits in a quarantine of up to 256 MB, with shadow memory
// besides; the bound then still catches growth without end (gigabytes in seconds).
#if defined(__SANITIZE_ADDRESS__)
constexpr std::uint64_t kMostResidentKiB = 400 * 1024;
#else
constexpr std::uint64_t kMostResidentKiB = 100 * 1024;
#endif

// The peak resident memory of a running process, from /proc.
std::uint64_t peakResidentKiB(pid_t pid) {
  std::ifstream status("/proc/" + std::to_string(pid) + "/status");
  for (std::string line; std::getline(status, line);) {
    if (line.starts_with("VmHWM:")) return std::stoull(line.substr(6));
  }
  return 0;
}

class OverloadTest : public ::testing::Test {
 protected:
  static void SetUpTestSuite() {
    folder_ = new bustest::TemporaryFolder;
    lines_ = 0;
  }
  static void TearDownTestSuite() { delete folder_; }

  static std::filesystem::path file(const std::string& name) { return *folder_ / name; }

  // The drive's metrics that the shipped configuration subscribes to, as a metric log with
  // their delivery times; written when first asked for.
  static std::filesystem::path drive() {
    std::filesystem::path path = file("drive.jsonl");
    if (lines_ > 0) return path;
    const auto configuration = tarn::service::Configuration::parse(
        contentsOf(NORVO_RESOURCES_DIR "/fen_test_lte.deviceconfig"));
    tarn::sim::Simulator simulator(11, kStartMs);
    std::ofstream out(path);
    tarn::log::MetricLogWriter writer(out);
    for (const tarn::sim::TimedMetric& timed : simulator.advance(kDriveMs)) {
      if (!configuration.profileOf(timed.metric.metricId)) continue;
      writer.write({{"kKeyMetricID", std::int64_t{timed.metric.metricId}},
                    {"kKeyPayload", timed.metric.payload}},
                   static_cast<std::int64_t>(timed.atMs - kStartMs));
      ++lines_;
    }
    return path;
  }

  static std::unique_ptr<ChildProcess> startNorvo(std::vector<std::string> arguments,
                                                  const std::string& name,
                                                  std::filesystem::path output = "/dev/null") {
    arguments.insert(arguments.begin(), NORVO_VIEWER);
    return std::make_unique<ChildProcess>(
        ChildProcess::Options{.arguments = std::move(arguments),
                              .standardOutput = std::move(output),
                              .standardError = file(name + ".err")});
  }

  // A replay of the drive at full speed, listening on `port`.
  static std::unique_ptr<ChildProcess> replay(int port, std::vector<std::string> more = {}) {
    std::vector<std::string> arguments = {
        "--replay", drive(), "--speed", "max", "--listen", "127.0.0.1:" + std::to_string(port)};
    arguments.insert(arguments.end(), more.begin(), more.end());
    return startNorvo(std::move(arguments), "replay" + std::to_string(port));
  }

  static inline bustest::TemporaryFolder* folder_ = nullptr;
  static inline std::size_t lines_ = 0;
};

TEST_F(OverloadTest, AReplayWithoutPausesFillsTheStoreAsTheIntakeOfTheSameLogDoes) {
  auto intake = startNorvo({"intake", drive(), "--dump-store", file("intake.json")}, "intake");
  ASSERT_GT(lines_, 800u);
  ASSERT_EQ(intake->wait(60s), 0) << intake->standardError();
  std::string expected = contentsOf(file("intake.json"));
  ASSERT_TRUE(expected.ends_with('\n'));
  expected.pop_back();

  const int port = bustest::freePort();
  auto norvo = replay(port);
  std::optional<std::string> store;
  EXPECT_TRUE(eventually([&] { return (store = get(port, "/api/store")) == expected; }, 60s))
      << norvo->standardError();
  const std::optional<std::string> status = get(port, "/api/status");
  ASSERT_TRUE(status);
  EXPECT_EQ(boost::json::parse(*status).at("dropped_events"), 0) << *status;
  EXPECT_EQ(norvo->stop(SIGINT, 10s), 0) << norvo->standardError();
}

TEST_F(OverloadTest, TheIntakeFailsWhenItsLogLinesCannotBeWritten) {
  auto intake = startNorvo({"intake", drive()}, "full", "/dev/full");
  EXPECT_EQ(intake->wait(60s), 1);
  EXPECT_NE(intake->standardError().find("norvo intake: cannot write the log lines to standard "
                                         "output: No space left on device"),
            std::string::npos)
      << intake->standardError();
}

// Whether the replay on `port` is seen to start over `count` times: asked again and again, its
// position comes back before where it was.
bool startsOver(int port, int count) {
  int passes = 0;
  std::int64_t last = 0;
  return eventually(
      [&] {
        const std::optional<std::string> state = get(port, "/api/replay");
        const std::int64_t at =
            state ? boost::json::parse(*state).at("position_ms").as_int64() : last;
        passes += at < last;
        last = at;
        return passes >= count;
      },
      60s);
}

TEST_F(OverloadTest, ALoopingReplayWithoutPausesStaysSmallAnswersEveryPageAndEndsOnASignal) {
  for (const int signal : {SIGINT, SIGTERM}) {
    const int port = bustest::freePort();
    auto norvo = replay(port, {"--loop"});
    ASSERT_TRUE(eventually([&] { return get(port, "/").has_value(); }, 20s))
        << norvo->standardError();
    // One run is enough to see it loop, stay small and answer every page meanwhile.
    if (signal == SIGINT) {
      ASSERT_TRUE(startsOver(port, 3));
      for (const char* page : {"/", "/LTE", "/api/screens/LTE/CA%20Status", "/api/store",
                               "/LTE/Serving%20Cell%20Info"})
        EXPECT_TRUE(get(port, page)) << page;
      EXPECT_LT(peakResidentKiB(norvo->pid()), kMostResidentKiB);
    }
    EXPECT_EQ(norvo->stop(signal, 10s), 0) << norvo->standardError();
  }
}

TEST_F(OverloadTest, TheSimulatorAtItsFastestRecordsForTheTimeAskedAndStaysSmall) {
  auto absurd = startNorvo({"record", file("absurd.jsonl"), "--speed", "1e9"}, "absurd");
  auto record =
      startNorvo({"record", file("fast.jsonl"), "--seconds", "1", "--speed", "10000"}, "record");
  std::uint64_t peak = 0;
  EXPECT_TRUE(eventually(
      [&] {
        peak = std::max(peak, peakResidentKiB(record->pid()));
        return record->wait(0ms).has_value();
      },
      20s));
  EXPECT_LT(peak, kMostResidentKiB);
  EXPECT_EQ(record->wait(0ms), 0) << record->standardError();
  // How far the simulator gets in a second depends on the machine: the promise is a recording,
  // ended on time and small.
  EXPECT_GT(bustest::lineCount(file("fast.jsonl")), 0u);

  EXPECT_EQ(absurd->wait(10s), 2);
  EXPECT_NE(absurd->standardError().find("--speed of the simulator is at most 10000, not 1e9"),
            std::string::npos)
      << absurd->standardError();
}

}  // namespace
