#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <boost/json/parse.hpp>
#include <csignal>

#include "Broker.h"
#include "Eventually.h"
#include "Subscriber.h"
#include "TemporaryFolder.h"
#include "platform/Log.h"
#include "tarn/mqtt/Publisher.h"

namespace {

using namespace std::chrono_literals;
using bustest::eventually;
using bustest::TemporaryFolder;
using mqtttest::Broker;
using mqtttest::Subscriber;
using tarn::mqtt::BrokerAddress;
using tarn::mqtt::LinkOptions;
using tarn::mqtt::Publisher;
using ::testing::ElementsAreArray;
using ::testing::HasSubstr;

constexpr std::string_view kMetrics = "fleet/car-1/metrics";
constexpr std::string_view kStatus = "fleet/car-1/status";

BrokerAddress addressOf(const Broker& broker, const std::string& path,
                        const std::string& credentials = {}) {
  return *tarn::mqtt::parseBrokerAddress(broker.address(path, credentials)).address;
}

tarn::mqtt::PublisherOptions publisherOptions(const Broker& broker, int qos,
                                              std::size_t queueLimit) {
  return {.broker = addressOf(broker, "fleet"),
          .caFile = std::nullopt,
          .device = "car-1",
          .qos = qos,
          .queueLimit = queueLimit,
          .source = "sim, seed 1",
          .name = "tarnd"};
}

LinkOptions watching(const Broker& broker, std::string pattern) {
  LinkOptions options;
  options.broker = addressOf(broker, "fleet");
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
    ASSERT_TRUE(eventually([&] { return subscriber.subscriptions() == 1; }));
    Publisher publisher(publisherOptions(broker, qos, 1000));
    ASSERT_TRUE(eventually([&] { return publisher.counts().linked; }));

    std::vector<std::string> lines = numberedLines(0, 200);
    lines.push_back(R"({"device":"Zürich ☎ \"quoted\" \\ back","x":[1,2.5,null]})");
    lines.push_back(std::string(100'000, 'x'));
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
  ASSERT_TRUE(eventually([&] { return subscriber.subscriptions() == 1; }));
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

TEST(APublisher, RefusedForItsPasswordSaysSoOnceAndKeepsTakingMetrics) {
  TemporaryFolder folder;
  Broker broker(folder.path(),
                {.account = std::pair("car", "right"), .tls = {}, .persistent = false});
  platform::log::Capture log;
  tarn::mqtt::PublisherOptions options = publisherOptions(broker, 1, 10);
  options.broker = addressOf(broker, "fleet", "car:wrong");
  Publisher publisher(std::move(options));
  // The library tries again after 1, 2 and 4 s.
  std::this_thread::sleep_for(3500ms);
  for (const std::string& line : numberedLines(0, 20))
    publisher.publish(line);

  EXPECT_THAT(log.systemLines(),
              ElementsAreArray({"tarnd: the broker at 127.0.0.1:" + std::to_string(broker.port()) +
                                " refused the connection: Connection Refused: not authorised."}));
  EXPECT_EQ(publisher.counts().accepted, 20u);
  EXPECT_EQ(publisher.counts().dropped, 10u);
}

TEST(APublisher, ReachesATlsBrokerThroughTheAuthorityItIsGivenOnly) {
  TemporaryFolder folder;
  const mqtttest::TestCertificates certificates = mqtttest::makeTestCertificates(folder.path());
  Broker broker(folder.path(), {.account = std::nullopt, .tls = certificates, .persistent = false});
  LinkOptions watcher = watching(broker, "fleet/#");
  watcher.caFile = certificates.authority.string();
  Subscriber subscriber(std::move(watcher));
  ASSERT_TRUE(eventually([&] { return subscriber.subscriptions() == 1; }));

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

}  // namespace
