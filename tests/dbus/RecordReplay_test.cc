#include <gtest/gtest.h>

#include <csignal>
#include <fstream>
#include <sstream>

#include "Eventually.h"
#include "Files.h"
#include "PrivateBus.h"
#include "Tarnd.h"
#include "TemporaryFolder.h"
#include "app/IntakeCommand.h"
#include "client/TarnWrapper.h"
#include "platform/Json.h"
#include "platform/Log.h"
#include "platform/MainQueue.h"
#include "store/MetricValidator.h"
#include "store/StoreDump.h"
#include "tarn/dbus/BusTransport.h"
#include "tarn/dbus/Interface.h"
#include "tarn/log/MetricLog.h"

namespace {

using namespace std::chrono_literals;
using bustest::contentsOf;
using bustest::eventually;
using bustest::lineCount;
using bustest::startTarnd;

// tarnd starts its source before it takes its bus name, so no client can have subscribed before a
// replay begins. The replay loops instead, and this metric begins each pass, so that the client
// can tell a whole pass from the tail of one it joined late. Nothing on the phone reports it.
constexpr std::int64_t kPassMarker = 0x3CFFFF;
constexpr std::int64_t kPauseBeforeEachPassMs = 300;

// The recording as a replay of its records alone, without pauses, each pass led by the marker
// after a pause. Answers how many records it holds.
std::size_t writePasses(const std::filesystem::path& recording, const std::filesystem::path& out) {
  std::ifstream input(recording);
  std::ofstream output(out);
  tarn::log::MetricLogReader reader(input);
  tarn::log::MetricLogWriter writer(output);
  writer.write({{"kKeyMetricID", kPassMarker}, {"kKeyPayload", platform::Bytes{0}}},
               kPauseBeforeEachPassMs);
  std::size_t records = 0;
  while (const auto line = reader.next()) {
    if (line->parsed.entry && writer.write(line->parsed.entry->record)) ++records;
  }
  return records;
}

// Hands on to the store the metrics of the first whole pass that arrives.
class OnePass final : public TarnWrapperDelegate {
 public:
  explicit OnePass(TarnWrapperDelegate& store) : store_(store) {}

  void metricsDidUpdate(const platform::Dictionary& metric) override {
    const platform::Value* metricId = metric.find("kKeyMetricID");
    if (metricId != nullptr && metricId->asInteger() == kPassMarker) {
      ++markers_;
    } else if (markers_ == 1) {
      store_.metricsDidUpdate(metric);
      ++handedOn_;
    }
  }
  void eventsDidUpdate(const platform::Dictionary&) override {}

  bool complete() const { return markers_ >= 2; }
  std::size_t handedOn() const { return handedOn_; }

 private:
  TarnWrapperDelegate& store_;
  int markers_ = 0;
  std::size_t handedOn_ = 0;
};

TEST(ARecordingReplayedByTarnd, FillsAClientsStoreAsTheIntakeOfTheRecordingDoes) {
  platform::log::Capture log;
  bustest::TemporaryFolder folder;
  bustest::PrivateBus bus;
  const std::string busName(tarn::dbus::kBusName);

  const std::filesystem::path recording = folder / "recording.jsonl";
  auto recorder = startTarnd(
      bus.address(), {"--source", "sim", "--seed", "5", "--speed", "60", "--record", recording},
      folder / "recorder");
  ASSERT_TRUE(bus.waitForName(busName, true)) << recorder->standardError();
  ASSERT_TRUE(eventually([&] { return lineCount(recording) >= 400; }));
  ASSERT_EQ(recorder->stop(SIGTERM, 10s), 0) << recorder->standardError();
  ASSERT_TRUE(bus.waitForName(busName, false));

  const std::filesystem::path passes = folder / "passes.jsonl";
  const std::size_t records = writePasses(recording, passes);
  const std::filesystem::path configuration = folder / "with-marker.deviceconfig";
  std::ofstream(configuration) << contentsOf(NORVO_RESOURCES_DIR "/fen_test_lte.deviceconfig")
                               << "\n0x" << std::hex << kPassMarker << "\n";
  auto replay = startTarnd(bus.address(), {"--source", "replay:" + passes.string(), "--loop"},
                           folder / "replay");
  ASSERT_TRUE(bus.waitForName(busName, true)) << replay->standardError();

  store::MetricValidator received(nullptr);
  const auto pass = std::make_shared<OnePass>(received);
  tarn::dbus::BusTransport transport(bus.address());
  {
    TarnWrapper session(transport);
    session.setDelegate(pass);
    ASSERT_TRUE(session.addVelaConfigForAppId("vexmora", configuration.string()));
    session.listen();
    platform::runMainQueueUntil([&] { return pass->complete(); }, 20s);
  }
  EXPECT_EQ(replay->stop(SIGTERM, 10s), 0) << replay->standardError();
  ASSERT_TRUE(pass->complete());
  EXPECT_EQ(pass->handedOn(), records);

  store::MetricValidator intake(nullptr);
  std::ifstream recorded(recording);
  std::ostringstream errors;
  ASSERT_TRUE(app::deliverMetricLog(recorded, "recording.jsonl", intake, errors));
  EXPECT_EQ(errors.str(), "");
  const platform::Dictionary dump = store::dumpStore(received);
  ASSERT_FALSE(dump.find("metricID")->isNull());
  ASSERT_FALSE(dump.find("myLTERRCStateDict")->isNull());
  EXPECT_EQ(platform::toJson(dump), platform::toJson(store::dumpStore(intake)));
}

}  // namespace
