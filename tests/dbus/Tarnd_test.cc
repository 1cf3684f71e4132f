// tarnd, and Norvo, as programs of their own on buses of the tests' own: sessions that outlive
// them, replays of broken and recorded logs, and a viewer whose bus goes away and comes back.
#include "Tarnd.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <boost/json/parse.hpp>
#include <csignal>
#include <fstream>
#include <set>
#include <sstream>
#include <thread>

#include "ChildProcess.h"
#include "Eventually.h"
#include "Files.h"
#include "LoopbackHttp.h"
#include "Printing.h"
#include "PrivateBus.h"
#include "RecordingSession.h"
#include "Records.h"
#include "TemporaryFolder.h"
#include "app/IntakeCommand.h"
#include "client/TarnWrapper.h"
#include "platform/Json.h"
#include "platform/Log.h"
#include "platform/MainQueue.h"
#include "store/MetricValidator.h"
#include "store/StoreDump.h"
#include "tarn/Names.h"
#include "tarn/client/LinkStatus.h"
#include "tarn/dbus/BusTransport.h"
#include "tarn/dbus/Interface.h"
#include "tarn/log/MetricLog.h"

namespace {

using namespace std::chrono_literals;
using bustest::entry;
using bustest::eventually;
using bustest::integerAt;
using bustest::lineCount;
using bustest::PrivateBus;
using bustest::ReceivedEvent;
using bustest::RecordingSession;
using bustest::startTarnd;
using bustest::TemporaryFolder;
using bustest::withAppId;
using tarn::CommandResult;
using tarn::ipc::Object;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::StartsWith;

const std::string kBusName(tarn::dbus::kBusName);
const std::vector<std::string> kSimulator = {"--source", "sim", "--seed", "3", "--speed", "20"};

// Measurements that the simulated phone reports several times a second on each radio.
constexpr std::string_view kMeasurements = "0x3CD301\n0x3C4F6A\n0x3CD302\n0x3CD102\n0x3CD002\n";
const std::set<std::int64_t> kMeasurementIds = {0x3CD301, 0x3C4F6A, 0x3CD302, 0x3CD102, 0x3CD002};
std::vector<std::string> linesOf(const std::string& text) {
  std::vector<std::string> lines;
  std::istringstream stream(text);
  for (std::string line; std::getline(stream, line);)
    lines.push_back(line);
  return lines;
}

// Opened before the service starts, a session receives what it asked for once the service comes; it
// outlives the service and recovers with its latest configuration when the service returns.
TEST(ASessionWithTarnd, OpenedBeforeTheServiceOutlivesItAndRecoversWithTheLatestConfiguration) {
  TemporaryFolder folder;
  PrivateBus bus;
  tarn::dbus::BusTransport transport(bus.address());
  RecordingSession session(transport);
  ASSERT_TRUE(session.manager());
  EXPECT_EQ(session.configure("profile 1\n" + std::string(kMeasurements)).status,
            tarn::status::kServiceUnavailable);
  auto first = startTarnd(bus.address(), kSimulator, folder / "first");
  const std::vector<ReceivedEvent> before = session.waitFor(5);
  ASSERT_GE(before.size(), 5u) << first->standardError();
  for (const ReceivedEvent& event : before) {
    EXPECT_TRUE(kMeasurementIds.contains(integerAt(event.record, tarn::kKeyMetricID)));
    EXPECT_EQ(integerAt(event.record, tarn::kKeyProfileID), 1);
  }
  // Another tarnd finds the bus name taken.
  auto another = startTarnd(bus.address(), kSimulator, folder / "another");
  EXPECT_EQ(another->wait(10s), 1);
  EXPECT_THAT(another->standardError(), HasSubstr("is another tarnd running?"));

  EXPECT_EQ(first->stop(SIGTERM, 10s), 0) << first->standardError();
  ASSERT_TRUE(bus.waitForName(kBusName, false));
  const CommandResult gone = session.perform(tarn::kCommandQueryMetric, bustest::simFilesQuery(1));
  EXPECT_EQ(gone.status, tarn::status::kServiceUnavailable);
  EXPECT_THAT(gone.message, StartsWith("the baseband manager service has gone away"));
  // Pushed while the service is away, so the returning service must receive it from the client.
  EXPECT_EQ(session.configure("profile 9\n" + std::string(kMeasurements)).status,
            tarn::status::kServiceUnavailable);
  const std::vector<ReceivedEvent> kept = session.received();
  ASSERT_GE(kept.size(), before.size());
  EXPECT_TRUE(std::equal(before.begin(), before.end(), kept.begin()));

  auto second = startTarnd(bus.address(), kSimulator, folder / "second");
  ASSERT_TRUE(bus.waitForName(kBusName, true)) << second->standardError();
  ASSERT_EQ(session.perform(tarn::kCommandQueryMetric, bustest::simFilesQuery(4242)),
            CommandResult{});
  // The metric events after the query's trigger event, which only the second service sent.
  const auto metricsSinceTheQuery = [&session] {
    const std::vector<ReceivedEvent> events = session.received();
    const auto trigger = std::find_if(events.begin(), events.end(), [](const ReceivedEvent& e) {
      return e.name == tarn::kEventTrigger && integerAt(e.record, tarn::kKeyTriggerRef) == 4242;
    });
    std::vector<Object> metrics;
    if (trigger == events.end()) return metrics;
    for (auto event = trigger + 1; event != events.end(); ++event) {
      if (event->name == tarn::kEventMetric) metrics.push_back(event->record);
    }
    return metrics;
  };
  ASSERT_TRUE(eventually([&] { return metricsSinceTheQuery().size() >= 4; }));

  for (const Object& metric : metricsSinceTheQuery()) {
    const std::int64_t metricId = integerAt(metric, tarn::kKeyMetricID);
    if (metricId == bustest::kSimFiles) continue;  // the query's answer
    EXPECT_TRUE(kMeasurementIds.contains(metricId)) << metricId;
    EXPECT_EQ(integerAt(metric, tarn::kKeyProfileID), 9);
  }
  EXPECT_EQ(second->stop(SIGTERM, 10s), 0) << second->standardError();
}

// Log lines that start with `start`.
std::size_t linesStarting(const std::vector<std::string>& lines, std::string_view start) {
  return static_cast<std::size_t>(
      std::count_if(lines.begin(), lines.end(),
                    [start](const std::string& line) { return line.starts_with(start); }));
}

TEST(ASessionOverABus, ReachesTheBusOnceItAppearsAndAgainEachTimeItComesBack) {
  TemporaryFolder folder;
  const std::filesystem::path socket = folder / "bus";
  const platform::log::Capture log;
  const auto link = std::make_shared<tarn::client::LinkStatus>();
  tarn::dbus::BusTransport transport("unix:path=" + socket.string(),
                                     {.first = 5ms, .longest = 40ms}, link);
  RecordingSession session(transport);
  ASSERT_TRUE(session.manager());
  EXPECT_EQ(session.configure("profile 4\n" + std::string(kMeasurements)).status,
            tarn::status::kServiceUnavailable);
  EXPECT_FALSE(link->get().connected);
  EXPECT_THAT(link->get().text, HasSubstr("cannot reach the bus"));
  // Time for several attempts, each of which fails.
  std::this_thread::sleep_for(100ms);

  for (const std::string round : {"first", "second"}) {
    auto bus = std::make_unique<PrivateBus>(socket);
    auto tarnd = startTarnd(bus->address(), kSimulator, folder / round);
    const std::size_t before = session.received().size();
    const std::vector<ReceivedEvent> events = session.waitFor(before + 3);
    ASSERT_GE(events.size(), before + 3) << round << ": " << tarnd->standardError();
    for (auto event = events.begin() + static_cast<std::ptrdiff_t>(before); event != events.end();
         ++event) {
      EXPECT_TRUE(kMeasurementIds.contains(integerAt(event->record, tarn::kKeyMetricID)));
      EXPECT_EQ(integerAt(event->record, tarn::kKeyProfileID), 4);
    }
    EXPECT_TRUE(eventually([&] { return link->get().connected; })) << link->get().text;

    bus.reset();
    EXPECT_EQ(tarnd->wait(10s), 1) << "tarnd leaves with its bus";
    EXPECT_THAT(tarnd->standardError(), HasSubstr("tarnd: lost the connection to the bus at"));
    EXPECT_TRUE(eventually([&] { return !link->get().connected; })) << round;
  }
  // Said once per outage, not once per attempt.
  const std::vector<std::string> problems = log.systemLines();
  EXPECT_EQ(linesStarting(problems, "tarn::client: cannot reach the bus unix:path="), 1u);
  EXPECT_EQ(linesStarting(problems, "tarn::client: lost the bus unix:path="), 2u);
  EXPECT_EQ(linesStarting(log.plainLines(), "tarn::client: reached the bus unix:path="), 2u);
}

TEST(ATarnd, ReplaysALogReportingEachBrokenLineWithItsNumber) {
  TemporaryFolder folder;
  PrivateBus bus;
  const std::string log = (folder / "broken.jsonl").string();
  // An RRC state and a CA status around broken lines, and an empty one that is skipped quietly.
  std::ofstream(log)
      << R"({"kKeyMetricID":3952132,"kKeyPayload":"CID69bWAMhAD","kKeyProfileID":0,"kKeyAppID":2,"t_ms":0}
not json

[1,2]
{"kKeyMetricID":3952132,"kKeyPayload":"!!!"}
{"kKeyPayload":"CID69bWAMhAD"}
{"kKeyMetricID":3952132,"kKeyPayload":"CID69bWAMhAD","t_ms":-5}
{"kKeyMetricID":3986195,"kKeyPayload":"CPr79bWAMhITCAAQAhitAjACWJ+kAWCtEnCrZg==","t_ms":250}
)";
  const std::filesystem::path recording = folder / "replayed.jsonl";

  auto tarnd = startTarnd(
      bus.address(),
      {"--source", "replay:" + log, "--as-fast-as-possible", "--record", recording.string()},
      folder / "tarnd");
  ASSERT_TRUE(bus.waitForName(kBusName, true)) << tarnd->standardError();
  // The replay waits for its first subscriber: a session with its events on and a configuration.
  EXPECT_EQ(lineCount(recording), 0u);
  tarn::dbus::BusTransport transport(bus.address());
  RecordingSession listener(transport);
  EXPECT_EQ(lineCount(recording), 0u);
  ASSERT_EQ(listener.configure("0x3C4E04").status, tarn::status::kSuccess);
  ASSERT_TRUE(eventually([&] { return lineCount(recording) == 2; }));
  EXPECT_EQ(tarnd->stop(SIGTERM, 10s), 0);

  std::vector<int> reported;
  for (const std::string& line : linesOf(tarnd->standardError())) {
    EXPECT_THAT(line, StartsWith(log + ":"));
    EXPECT_THAT(line, ::testing::EndsWith("; line skipped"));
    reported.push_back(std::atoi(line.c_str() + log.size() + 1));
  }
  EXPECT_THAT(reported, ElementsAre(2, 4, 5, 6, 7));

  std::ifstream replayed(recording);
  tarn::log::MetricLogReader reader(replayed);
  std::vector<std::int64_t> metricIds;
  while (const auto line = reader.next()) {
    ASSERT_TRUE(line->parsed.entry) << line->parsed.error;
    const platform::Value* id = line->parsed.entry->record.find("kKeyMetricID");
    metricIds.push_back(id != nullptr ? id->asInteger().value_or(-1) : -1);
  }
  EXPECT_THAT(metricIds, ElementsAre(3952132, 3986195));
}

using bustest::contentsOf;

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

  const std::filesystem::path recording = folder / "recording.jsonl";
  auto recorder = startTarnd(
      bus.address(), {"--source", "sim", "--seed", "5", "--speed", "600", "--record", recording},
      folder / "recorder");
  ASSERT_TRUE(bus.waitForName(kBusName, true)) << recorder->standardError();
  ASSERT_TRUE(eventually([&] { return lineCount(recording) >= 400; }));
  ASSERT_EQ(recorder->stop(SIGTERM, 10s), 0) << recorder->standardError();
  ASSERT_TRUE(bus.waitForName(kBusName, false));

  const std::filesystem::path passes = folder / "passes.jsonl";
  const std::size_t records = writePasses(recording, passes);
  const std::filesystem::path configuration = folder / "with-marker.deviceconfig";
  std::ofstream(configuration) << contentsOf(NORVO_RESOURCES_DIR "/fen_test_lte.deviceconfig")
                               << "\n0x" << std::hex << kPassMarker << "\n";
  auto replay = startTarnd(bus.address(), {"--source", "replay:" + passes.string(), "--loop"},
                           folder / "replay");
  ASSERT_TRUE(bus.waitForName(kBusName, true)) << replay->standardError();

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

struct ServiceStatus {
  bool connected = false;
  std::string text;
};

// The service's part of /api/status; empty while the page does not answer.
std::optional<ServiceStatus> serviceStatus(int port) {
  const std::optional<std::string> body = bustest::get(port, "/api/status");
  if (!body) return std::nullopt;
  const boost::json::value status = boost::json::parse(*body);
  const boost::json::object& service = status.at("service").as_object();
  return ServiceStatus{service.at("connected").as_bool(),
                       std::string(service.at("status").as_string())};
}

// Metrics the viewer took in so far, as its log lines count them.
std::size_t metricsLogged(const bustest::ChildProcess& norvo) {
  const std::string log = norvo.standardOutput();
  std::size_t count = 0;
  for (std::size_t at = 0; (at = log.find("Received Valid Metric", at)) != std::string::npos; ++at)
    ++count;
  return count;
}

// Norvo as a user runs it against tarnd on a bus that is not there yet, and that goes away and
// comes back: the viewer reaches it each time, says so in /api/status, and shows its metrics.
TEST(AViewerOnABus, ReachesTarndOnceTheBusAppearsAndAgainAfterTheBusIsRestarted) {
  bustest::TemporaryFolder folder;
  const std::filesystem::path socket = folder / "bus";
  const int port = bustest::freePort();
  bustest::ChildProcess norvo(
      {.arguments = {NORVO_VIEWER, "--service", "dbus:unix:path=" + socket.string(), "--listen",
                     "127.0.0.1:" + std::to_string(port), "--log", "-"},
       .standardOutput = folder / "norvo.out",
       .standardError = folder / "norvo.err"});
  std::optional<ServiceStatus> status;
  ASSERT_TRUE(eventually([&] { return (status = serviceStatus(port)).has_value(); }))
      << norvo.standardError();
  EXPECT_FALSE(status->connected);
  EXPECT_NE(status->text.find("cannot reach the bus"), std::string::npos) << status->text;

  for (const std::string round : {"first", "second"}) {
    auto bus = std::make_unique<bustest::PrivateBus>(socket);
    const std::size_t before = metricsLogged(norvo);
    auto tarnd =
        bustest::startTarnd(bus->address(), {"--source", "sim", "--speed", "20"}, folder / round);
    EXPECT_TRUE(eventually([&] { return serviceStatus(port).value_or(ServiceStatus{}).connected; }))
        << round << ": " << norvo.standardError();
    EXPECT_TRUE(eventually([&] { return metricsLogged(norvo) >= before + 5; }))
        << round << ": " << tarnd->standardError();

    bus.reset();
    EXPECT_EQ(tarnd->wait(10s), 1) << "tarnd leaves with its bus";
    EXPECT_TRUE(eventually([&] {
      return !serviceStatus(port).value_or(ServiceStatus{true, {}}).connected;
    })) << round;
  }
  EXPECT_EQ(norvo.stop(SIGINT, 10s), 0) << norvo.standardError();
  const std::string errors = norvo.standardError();
  EXPECT_EQ(errors.find("cannot reach the bus"), errors.rfind("cannot reach the bus"))
      << "said once: " << errors;
}

}  // namespace
