#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <boost/json/parse.hpp>
#include <csignal>
#include <fstream>

#include "Broker.h"
#include "Eventually.h"
#include "Files.h"
#include "PrivateBus.h"
#include "RecordingSession.h"
#include "Subscriber.h"
#include "Tarnd.h"
#include "TemporaryFolder.h"
#include "tarn/Names.h"
#include "tarn/dbus/BusTransport.h"
#include "tarn/dbus/Interface.h"
#include "tarn/log/MetricLog.h"

namespace {

using namespace std::chrono_literals;
using bustest::eventually;
using bustest::TemporaryFolder;
using mqtttest::Broker;
using mqtttest::Subscriber;
using ::testing::HasSubstr;

constexpr std::string_view kMetrics = "fleet/car-9/metrics";
constexpr std::string_view kStatus = "fleet/car-9/status";

std::unique_ptr<bustest::ChildProcess> startPublishingTarnd(const std::string& bus,
                                                            const std::string& broker,
                                                            std::vector<std::string> more,
                                                            const std::filesystem::path& stem) {
  std::vector<std::string> options = {"--source", "sim",       "--seed", "5",        "--speed",
                                      "20",       "--publish", broker,   "--device", "car-9"};
  options.insert(options.end(), more.begin(), more.end());
  return bustest::startTarnd(bus, std::move(options), stem);
}

std::string statusOf(const std::string& message) {
  return std::string(boost::json::parse(message).at("status").as_string());
}

TEST(APublishingTarnd, PublishesWhatItRecordsAndLeavesALastWillWhenKilled) {
  TemporaryFolder folder;
  Broker broker(folder.path(), {});
  tarn::mqtt::LinkOptions options;
  options.broker = broker.linkAddress("fleet");
  options.subscriptions = {"fleet/#"};
  Subscriber subscriber(options);
  ASSERT_TRUE(eventually([&] { return subscriber.subscriptions() == 1; }));

  auto tarnd =
      startPublishingTarnd("none", broker.address("fleet"),
                           {"--record", (folder / "drive.jsonl").string()}, folder / "tarnd");
  ASSERT_TRUE(eventually([&] { return subscriber.payloadsOn(kMetrics).size() >= 20; }))
      << tarnd->standardOutput() << tarnd->standardError();
  ASSERT_FALSE(subscriber.payloadsOn(kStatus).empty());
  EXPECT_EQ(statusOf(subscriber.payloadsOn(kStatus).front()), "online");

  tarnd->stop(SIGKILL, 5s);
  ASSERT_TRUE(
      eventually([&] { return statusOf(subscriber.payloadsOn(kStatus).back()) == "offline"; }));
  // Retained, for whoever looks later.
  Subscriber later(options);
  ASSERT_TRUE(eventually([&] { return !later.payloadsOn(kStatus).empty(); }));
  EXPECT_EQ(statusOf(later.payloadsOn(kStatus).back()), "offline");

  // Each message is the recorded line with the device and the wall-clock time added.
  std::ifstream recorded(folder / "drive.jsonl");
  tarn::log::MetricLogReader reader(recorded);
  for (const std::string& message : subscriber.payloadsOn(kMetrics)) {
    const tarn::log::ParsedLine published = tarn::log::parseMetricLogLine(message);
    ASSERT_TRUE(published.entry) << published.error;
    const auto line = reader.next();
    ASSERT_TRUE(line && line->parsed.entry);
    platform::Dictionary record = published.entry->record;
    EXPECT_EQ(*record.find("device"), platform::Value("car-9"));
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
  constexpr std::string_view kRefused =
      "refused the connection: Connection Refused: not authorised.\n";
  ASSERT_TRUE(eventually([&] {
    return tarnd->standardError().find(kRefused) != std::string::npos;
  })) << tarnd->standardError();
  std::this_thread::sleep_for(2s);  // the library tries again after 1 s, then 2 s
  EXPECT_FALSE(tarnd->wait(0ms));
  const std::string output = tarnd->standardError();
  EXPECT_EQ(output.find("refused"), output.rfind("refused")) << output;
  EXPECT_EQ(tarnd->stop(SIGTERM, 10s), 0);
}

}  // namespace
