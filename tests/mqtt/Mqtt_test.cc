#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <boost/json/parse.hpp>
#include <csignal>
#include <fstream>

#include "Broker.h"
#include "Eventually.h"
#include "PrivateBus.h"
#include "RecordingSession.h"
#include "Records.h"
#include "Subscriber.h"
#include "Tarnd.h"
#include "TemporaryFolder.h"
#include "platform/Log.h"
#include "tarn/dbus/BusTransport.h"
#include "tarn/dbus/Interface.h"
#include "tarn/log/MetricLog.h"
#include "tarn/mqtt/MqttTransport.h"
#include "tarn/mqtt/Publisher.h"
#include "tarn/mqtt/PublishingSource.h"
#include "tarn/testing/ScriptedMetricSource.h"

namespace {

using namespace std::chrono_literals;
using bustest::eventually;
using bustest::integerAt;
using bustest::RecordingSession;
using bustest::TemporaryFolder;
using mqtttest::Broker;
using mqtttest::Subscriber;
using tarn::mqtt::LinkOptions;
using tarn::mqtt::Publisher;
using ::testing::ElementsAreArray;
using ::testing::HasSubstr;

constexpr std::string_view kMetrics = "fleet/car-1/metrics";
constexpr std::string_view kStatus = "fleet/car-1/status";

tarn::mqtt::PublisherOptions publisherOptions(const Broker& broker, int qos, std::size_t queueLimit,
                                              std::string device = "car-1",
                                              std::string source = "sim, seed 1") {
  return {.broker = broker.linkAddress("fleet"),
          .caFile = std::nullopt,
          .device = std::move(device),
          .qos = qos,
          .queueLimit = queueLimit,
          .source = std::move(source),
          .name = "tarnd"};
}

LinkOptions watching(const Broker& broker, std::string pattern) {
  LinkOptions options;
  options.broker = broker.linkAddress("fleet");
  options.subscriptions = {std::move(pattern)};
  return options;
}

// Lines numbered from `first`, as a publisher would send them.
std::vector<std::string> numberedLines(int first, int count) {
  std::vector<std::string> lines;
  for (int n = first; n < first + count; ++n)
    lines.push_back(R"({"kKeyMetricID":3952132,"kKeyPayload":"CAM=","t_ms":)" + std::to_string(n) +
                    "}");
  return lines;
}

// The messages in order of first arrival: QoS 1 may bring one twice after a reconnection.
std::vector<std::string> firstArrivals(const std::vector<std::string>& payloads) {
  std::vector<std::string> seen;
  for (const std::string& payload : payloads) {
    if (std::find(seen.begin(), seen.end(), payload) == seen.end()) seen.push_back(payload);
  }
  return seen;
}

boost::json::object lastStatus(const Subscriber& subscriber) {
  const std::vector<std::string> statuses = subscriber.payloadsOn(kStatus);
  if (statuses.empty()) return {};
  return boost::json::parse(statuses.back()).as_object();
}

TEST(APublisher, DeliversEachLineByteForByteInOrderAtEitherQualityOfService) {
  TemporaryFolder folder;
  Broker broker(folder.path(), {});
  for (const int qos : {0, 1}) {
    SCOPED_TRACE(qos);
    Subscriber subscriber(watching(broker, "fleet/#"));
    Publisher publisher(publisherOptions(broker, qos, 1000));
    ASSERT_TRUE(eventually([&] { return publisher.counts().linked; }));

    std::vector<std::string> lines = numberedLines(0, 200);
    lines.emplace_back(R"({"device":"Zürich ☎ \"quoted\" \\ back","x":[1,2.5,null]})");
    lines.emplace_back(100'000, 'x');
    for (const std::string& line : lines)
      publisher.publish(line);

    ASSERT_TRUE(eventually([&] { return subscriber.payloadsOn(kMetrics).size() >= lines.size(); }))
        << subscriber.payloadsOn(kMetrics).size() << " arrived, " << publisher.counts().sent
        << " sent, " << publisher.counts().queued << " queued, " << publisher.counts().dropped
        << " dropped";
    EXPECT_THAT(subscriber.payloadsOn(kMetrics), ElementsAreArray(lines));
    const boost::json::object status = lastStatus(subscriber);
    EXPECT_EQ(status.at("status"), "online");
    EXPECT_EQ(status.at("device"), "car-1");
    EXPECT_EQ(status.at("source"), "sim, seed 1");
    EXPECT_EQ(status.at("dropped"), 0);
    EXPECT_TRUE(eventually([&] { return publisher.counts().sent == lines.size(); }));
  }
}

TEST(APublisher, HoldsMetricsWhileTheBrokerIsAwayAndDropsTheOldestPastItsBound) {
  TemporaryFolder folder;
  Broker broker(folder.path(), {.account = std::nullopt, .tls = std::nullopt, .persistent = true});
  LinkOptions options = watching(broker, "fleet/#");
  options.clientId = "watcher";
  options.cleanSession = false;
  Subscriber subscriber(std::move(options));
  platform::log::Capture log;
  constexpr std::size_t kBound = 50;
  Publisher publisher(publisherOptions(broker, 1, kBound));
  ASSERT_TRUE(eventually([&] { return publisher.counts().linked; }));

  const auto publishAll = [&](const std::vector<std::string>& lines) {
    for (const std::string& line : lines)
      publisher.publish(line);
  };
  const auto whileTheBrokerIsAway = [&](const std::vector<std::string>& lines) {
    broker.stop(SIGTERM);  // saves the watcher's session for its return
    ASSERT_TRUE(eventually([&] { return !publisher.counts().linked; }));
    publishAll(lines);
    broker.start();
    ASSERT_TRUE(eventually([&] { return publisher.counts().linked; }));
  };

  std::vector<std::string> expected = numberedLines(0, 10);
  publishAll(expected);
  ASSERT_TRUE(eventually([&] { return subscriber.payloadsOn(kMetrics).size() >= 10; }));

  // Within the bound, nothing is lost.
  const std::vector<std::string> within = numberedLines(10, kBound);
  whileTheBrokerIsAway(within);
  expected.insert(expected.end(), within.begin(), within.end());
  ASSERT_TRUE(eventually(
      [&] { return firstArrivals(subscriber.payloadsOn(kMetrics)).size() >= expected.size(); }));
  EXPECT_THAT(firstArrivals(subscriber.payloadsOn(kMetrics)), ElementsAreArray(expected));
  EXPECT_EQ(publisher.counts().dropped, 0u);

  // Past it, the oldest go, counted.
  const std::vector<std::string> beyond = numberedLines(100, kBound + 30);
  whileTheBrokerIsAway(beyond);
  expected.insert(expected.end(), beyond.end() - kBound, beyond.end());
  ASSERT_TRUE(eventually(
      [&] { return firstArrivals(subscriber.payloadsOn(kMetrics)).size() >= expected.size(); }));
  EXPECT_THAT(firstArrivals(subscriber.payloadsOn(kMetrics)), ElementsAreArray(expected));
  EXPECT_EQ(publisher.counts().dropped, 30u);
  ASSERT_TRUE(eventually([&] { return lastStatus(subscriber).at("dropped") == 30; }));
  EXPECT_EQ(log.count("tarnd: the broker is back; 30 metric(s) dropped while it was away (30 in "
                      "all)"),
            1u);
}

TEST(APublisher, ReachesATlsBrokerThroughTheAuthorityItIsGivenOnly) {
  TemporaryFolder folder;
  const mqtttest::TestCertificates certificates = mqtttest::makeTestCertificates(folder.path());
  Broker broker(folder.path(), {.account = std::nullopt, .tls = certificates, .persistent = false});
  LinkOptions watcher = watching(broker, "fleet/#");
  watcher.caFile = certificates.authority.string();
  Subscriber subscriber(std::move(watcher));

  tarn::mqtt::PublisherOptions options = publisherOptions(broker, 1, 10);
  options.caFile = certificates.authority.string();
  {
    Publisher publisher(options);
    publisher.publish("over TLS");
    ASSERT_TRUE(eventually([&] { return subscriber.payloadsOn(kMetrics).size() == 1; }));
  }
  EXPECT_EQ(subscriber.payloadsOn(kMetrics).front(), "over TLS");

  // Another authority's certificates are not trusted.
  TemporaryFolder other;
  options.caFile = mqtttest::makeTestCertificates(other.path()).authority.string();
  platform::log::Capture log;
  {
    Publisher publisher(options);
    publisher.publish("must not pass");
    EXPECT_TRUE(eventually([&] { return log.systemLines().size() > 0; }));
    EXPECT_FALSE(publisher.counts().linked);
  }
  EXPECT_EQ(subscriber.payloadsOn(kMetrics).size(), 1u);
  EXPECT_THAT(log.systemLines(), ::testing::Contains(HasSubstr("certificate verify failed")));
}

using bustest::kCaStatus;
using bustest::kRrcState;
using bustest::kSimFiles;

// The query a viewer sends for the SIM files.
tarn::CommandResult querySimFiles(RecordingSession& session) {
  return session.perform(tarn::kCommandQueryMetric, bustest::simFilesQuery());
}

tarn::service::Metric metric(std::uint32_t metricId, std::uint8_t mark) {
  return {metricId, platform::Bytes{0x08, mark}};
}

// The viewer's session reaches the device through the broker as if its service ran here.
TEST(ARemoteDevice, ServesItsMetricsToSessionsAndRefusesWhatDoesNotRead) {
  TemporaryFolder folder;
  Broker broker(folder.path(), {});
  platform::log::Capture log;
  auto transport = std::make_shared<tarn::mqtt::MqttTransport>(
      tarn::mqtt::RemoteDevice{broker.linkAddress("fleet/car-3"), std::nullopt, "norvo"});
  RecordingSession session(*transport);
  ASSERT_EQ(session.configure("0x3C4E04\n0x3CD313\n"), tarn::CommandResult{});

  auto publisher =
      std::make_unique<Publisher>(publisherOptions(broker, 1, 100, "car-3", "sim, seed 3"));
  ASSERT_TRUE(eventually([&] { return transport->device().status().status == "online"; }));

  // Messages that do not read, among good ones, from a client that is no tarnd.
  tarn::mqtt::LinkOptions rogueOptions;
  rogueOptions.broker = broker.linkAddress("fleet");
  rogueOptions.name = "rogue";
  tarn::mqtt::Link rogue(rogueOptions, {});
  rogue.start();
  const auto line = [](std::uint32_t metricId, std::uint8_t mark) {
    return tarn::mqtt::metricMessage(metric(metricId, mark), 0, "car-3", 1);
  };
  const std::string topic = "fleet/car-3/metrics";
  const std::vector<std::string> messages = {
      line(kRrcState, 1),
      "{\"kKeyMetricID\": 3952132, oops",
      R"([3952132,"CAM="])",
      line(kSimFiles, 2),
      R"({"kKeyMetricID":3952132,"kKeyPayload":"not base64!"})",
      R"({"kKeyMetricID":"0x3C4E04","kKeyPayload":"CAM="})",
      line(0x3C4F6A, 3),  // not subscribed
      R"({"kKeyMetricID":4660,"kKeyPayload":"CAM="})",
      R"({"kKeyMetricID":3952132})",
      std::string(10 << 20, '{'),
      line(kCaStatus, 4),
  };
  for (const std::string& message : messages) {
    ASSERT_TRUE(eventually([&] { return rogue.publish(topic, message, 1, false).has_value(); }));
  }
  ASSERT_TRUE(eventually([&] { return transport->device().refused() == 7; }));
  const auto metricIds = [&] { return bustest::metricIdsOf(session.received()); };
  ASSERT_TRUE(eventually([&] { return metricIds().size() >= 2; }));
  EXPECT_EQ(metricIds(), (std::vector<std::int64_t>{kRrcState, kCaStatus}));
  for (const std::string_view reason :
       {"not JSON (", "not a JSON object", "\"kKeyPayload\" is not standard base64 text",
        "no integer \"kKeyMetricID\"", "unknown metric ID 4660", "no \"kKeyPayload\"",
        "too large (10485760 bytes)"})
    EXPECT_THAT(log.plainLines(), ::testing::Contains(HasSubstr(reason)));

  // A query is answered with the last metric of its kind that the device published.
  EXPECT_EQ(querySimFiles(session), tarn::CommandResult{});
  ASSERT_TRUE(eventually([&] { return metricIds().size() >= 3; }));
  EXPECT_EQ(metricIds().back(), kSimFiles);

  // The device goes: the session keeps what it has, and the status says so.
  publisher.reset();
  ASSERT_TRUE(eventually([&] { return transport->device().status().status == "offline"; }));
  EXPECT_EQ(log.count("norvo: fleet/car-3 is offline (source: sim, seed 3)"), 1u);
}

// The SIM files come once, at power-on: a viewer that comes later has them from the broker.
TEST(ARemoteDevice, AnswersTheSimFilesQueryOfAViewerThatJoinsLate) {
  TemporaryFolder folder;
  Broker broker(folder.path(), {});
  Publisher publisher(publisherOptions(broker, 1, 100, "car-4", "scripted"));
  auto scripted = std::make_shared<tarn::testing::ScriptedMetricSource>();
  tarn::mqtt::PublishingSource source(scripted, publisher, "fleet", "car-4");
  source.start([](const tarn::service::Metric&) {});
  scripted->emit(metric(kSimFiles, 1));
  scripted->emit(metric(kRrcState, 2));
  scripted->emit(metric(kSimFiles, 3));  // the newer one counts
  scripted->flush();
  ASSERT_TRUE(eventually([&] { return publisher.counts().sent == 3; }));

  platform::log::Capture log;
  tarn::mqtt::MqttTransport transport(
      tarn::mqtt::RemoteDevice{broker.linkAddress("fleet/car-4"), std::nullopt, "norvo"});
  {
    RecordingSession session(transport);
    ASSERT_EQ(session.configure("0x3C4E04\n"), tarn::CommandResult{});
    ASSERT_TRUE(eventually([&] { return querySimFiles(session) == tarn::CommandResult{}; }));
    const std::vector<bustest::ReceivedEvent> events = session.waitFor(2);
    ASSERT_GE(events.size(), 2u);
    const tarn::ipc::Object& answer = events[1].record;
    EXPECT_EQ(integerAt(answer, tarn::kKeyMetricID), kSimFiles);
    EXPECT_EQ(*answer.find(tarn::kKeyPayload)->asBytes(), (platform::Bytes{0x08, 3}));
  }
  source.stop();
}

std::unique_ptr<bustest::ChildProcess> startPublishingTarnd(const std::string& bus,
                                                            const std::string& broker,
                                                            std::vector<std::string> more,
                                                            const std::filesystem::path& stem) {
  std::vector<std::string> options = {"--source", "sim",       "--seed", "5",        "--speed",
                                      "20",       "--publish", broker,   "--device", "car-1"};
  options.insert(options.end(), more.begin(), more.end());
  return bustest::startTarnd(bus, std::move(options), stem);
}

TEST(APublishingTarnd, PublishesWhatItRecordsAndLeavesALastWillWhenKilled) {
  TemporaryFolder folder;
  Broker broker(folder.path(), {});
  const LinkOptions options = watching(broker, "fleet/#");
  Subscriber subscriber(options);

  auto tarnd =
      startPublishingTarnd("none", broker.address("fleet"),
                           {"--record", (folder / "drive.jsonl").string()}, folder / "tarnd");
  ASSERT_TRUE(eventually([&] { return subscriber.payloadsOn(kMetrics).size() >= 20; }))
      << tarnd->standardOutput() << tarnd->standardError();
  EXPECT_EQ(lastStatus(subscriber)["status"], "online");

  tarnd->stop(SIGKILL, 5s);
  ASSERT_TRUE(eventually([&] { return lastStatus(subscriber)["status"] == "offline"; }));
  // Retained, for whoever looks later.
  Subscriber later(options);
  EXPECT_TRUE(eventually([&] { return lastStatus(later)["status"] == "offline"; }));

  // Each message is the recorded line with the device and the wall-clock time added.
  std::ifstream recorded(folder / "drive.jsonl");
  tarn::log::MetricLogReader reader(recorded);
  for (const std::string& message : subscriber.payloadsOn(kMetrics)) {
    const tarn::log::ParsedLine published = tarn::log::parseMetricLogLine(message);
    ASSERT_TRUE(published.entry) << published.error;
    const auto line = reader.next();
    ASSERT_TRUE(line && line->parsed.entry);
    platform::Dictionary record = published.entry->record;
    EXPECT_EQ(*record.find("device"), platform::Value("car-1"));
    EXPECT_TRUE(record.find("unix_ms") && record.find("unix_ms")->asInteger() > 1'700'000'000'000);
    record.erase("device");
    record.erase("unix_ms");
    EXPECT_EQ(record, line->parsed.entry->record);
  }
}

TEST(APublishingTarnd, RefusedByTheBrokerSaysSoOnceAndServesItsLocalClients) {
  TemporaryFolder folder;
  Broker broker(folder.path(),
                {.account = std::pair("car", "right"), .tls = {}, .persistent = false});
  bustest::PrivateBus bus;
  tarn::dbus::BusTransport transport(bus.address());
  auto tarnd = startPublishingTarnd(bus.address(), broker.address("fleet", "car:wrong"), {},
                                    folder / "tarnd");
  ASSERT_TRUE(bus.waitForName(tarn::dbus::kBusName, true)) << tarnd->standardError();
  {
    bustest::RecordingSession session(transport);
    ASSERT_EQ(session.configure("0x3CD301\n0x3C4F6A\n0x3CD302\n0x3CD102\n0x3CD002\n"),
              tarn::CommandResult{});
    EXPECT_GE(session.waitFor(10).size(), 10u);
  }
  const std::string refused = "tarnd: the broker at 127.0.0.1:" + std::to_string(broker.port()) +
                              " refused the connection: Connection Refused: not authorised.\n";
  // Said once, though the library tries again after 1 s, 2 s, 4 s...
  ASSERT_TRUE(eventually([&] {
    const std::string log = broker.log();
    return log.find("not authorised") != log.rfind("not authorised");
  })) << broker.log();
  EXPECT_FALSE(tarnd->wait(0ms));
  const std::string output = tarnd->standardError();
  EXPECT_NE(output.find(refused), std::string::npos) << output;
  EXPECT_EQ(output.find("refused"), output.rfind("refused")) << output;
  EXPECT_EQ(tarnd->stop(SIGTERM, 10s), 0);
}

}  // namespace
