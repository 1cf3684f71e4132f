#include <gtest/gtest.h>

#include <algorithm>
#include <chrono>
#include <condition_variable>
#include <fstream>
#include <future>
#include <iterator>
#include <string>

#include "messages/Metrics.h"
#include "platform/Log.h"
#include "tarn/Ipc.h"
#include "tarn/Names.h"
#include "tarn/client/Client.h"
#include "tarn/client/Transport.h"
#include "tarn/flow/DropTally.h"
#include "tarn/flow/KindQueue.h"
#include "tarn/service/Configuration.h"
#include "tarn/service/Core.h"
#include "tarn/testing/ScriptedMetricSource.h"
#include "tarn/transport/InProcess.h"

namespace tarn {
void PrintTo(const CommandResult& result, std::ostream* out) {
  *out << "{" << result.status << ", \"" << result.message << "\"}";
}
}  // namespace tarn

namespace {

using namespace std::chrono_literals;
using namespace tarn;
using platform::Dictionary;
using platform::List;
using platform::Value;
using tarn::ipc::Object;
using tarn::service::Configuration;
using tarn::service::ConfigurationError;

constexpr std::uint32_t kRrcState = 0x3C4E04;
constexpr std::uint32_t kCaStatus = 0x3CD313;
constexpr std::uint32_t kSimFiles = 0x3C0013;

struct Event {
  std::string name;
  Value record;
};

// A session with events on that keeps what it receives.
class Session {
 public:
  Session(const std::string& clientName, const platform::SerialQueue& queue,
          client::Transport& transport)
      : manager_(client::CreateManager(clientName, queue, transport)) {
    for (const std::string_view name : {kEventMetric, kEventTrigger}) {
      client::RegisterEventHandler(
          manager_, std::string(name), [this, name](const Object& record, client::CompletionGroup) {
            const std::lock_guard lock(mutex_);
            events_.push_back({std::string(name), ipc::toPlainDictionary(record)});
            arrived_.notify_all();
          });
    }
    client::EventsOn(manager_);
  }
  const std::shared_ptr<client::Manager>& manager() const { return manager_; }

  // Waits for `count` events in all and answers every event received so far.
  std::vector<Event> waitFor(std::size_t count) {
    std::unique_lock lock(mutex_);
    arrived_.wait_for(lock, 5s, [&] { return events_.size() >= count; });
    return events_;
  }

 private:
  std::mutex mutex_;
  std::condition_variable arrived_;
  std::vector<Event> events_;
  std::shared_ptr<client::Manager> manager_;
};

Object::Entry entry(std::string_view key, Object value) {
  return {std::string(key), std::move(value)};
}

Object bytesOf(std::string_view text) {
  return Object::bytes(platform::Bytes(text.begin(), text.end()));
}

Object withAppId(Object::Entries entries) {
  entries.insert(entries.begin(), entry(kKeyAppID, Object::integer(2)));
  return Object::dictionary(std::move(entries));
}

Dictionary metricRecord(std::uint32_t metricId, platform::Bytes payload, std::int64_t profileId) {
  return {{"kKeyMetricID", std::int64_t{metricId}},
          {"kKeyPayload", std::move(payload)},
          {"kKeyProfileID", profileId},
          {"kKeyAppID", std::int64_t{2}}};
}

class AService : public ::testing::Test {
 protected:
  AService() { commander = client::CreateManager("commander", queue, inProcess); }

  CommandResult perform(std::string_view command, const Object& input) {
    Object output;
    return client::PerformCommand(commander, std::string(command), input, output);
  }

  CommandResult configure(std::string_view text) {
    return perform(kCommandAddConfiguration, withAppId({entry(kKeyPayload, bytesOf(text))}));
  }

  std::shared_ptr<tarn::testing::ScriptedMetricSource> source =
      std::make_shared<tarn::testing::ScriptedMetricSource>();
  std::shared_ptr<service::Core> core = std::make_shared<service::Core>(source);
  transport::InProcess inProcess{core};
  platform::SerialQueue queue{"org.norvo.test.sessions"};
  std::shared_ptr<client::Manager> commander;
};

TEST_F(AService, ReplacesAConfigurationForgetsAClearedOneAndAnswersQueriesRegardless) {
  Session app("vexmora", queue, inProcess);
  source->answerQueriesWith({kSimFiles, {5}});
  ASSERT_EQ(configure("0x3C4E04"), CommandResult{});
  ASSERT_EQ(configure("0x3CD313"), CommandResult{});
  source->emit({kRrcState, {1}});
  source->emit({kCaStatus, {2}});
  ASSERT_EQ(app.waitFor(1).size(), 1u);

  ASSERT_EQ(perform(kCommandClearConfiguration, withAppId({})), CommandResult{});
  source->emit({kCaStatus, {3}});
  source->flush();
  ASSERT_EQ(
      perform(kCommandQueryMetric, withAppId({entry(kKeyTriggerRef, Object::integer(9999)),
                                              entry(kKeyTriggerID, Object::integer(0x7F0013))})),
      CommandResult{});
  const std::vector<Event> events = app.waitFor(3);

  ASSERT_EQ(events.size(), 3u);
  EXPECT_EQ(events[0].record, metricRecord(kCaStatus, {2}, 0));
  EXPECT_EQ(events[1].name, kEventTrigger);
  EXPECT_EQ(events[1].record, Value(Dictionary{{"kKeyAppID", std::int64_t{2}},
                                               {"kKeyTriggerRef", std::int64_t{9999}},
                                               {"kKeyTriggerType", std::int64_t{0}},
                                               {"kKeyTriggerID", std::int64_t{0x7F0013}},
                                               {"kKeyProfileID", std::int64_t{0}}}));
  EXPECT_EQ(events[2].name, kEventMetric);
  EXPECT_EQ(events[2].record, metricRecord(kSimFiles, {5}, 0));
}

TEST_F(AService, SendsEventsOnlyToTheAppsSessionsWhoseEventsAreOn) {
  Session first("vexmora", queue, inProcess);
  Session second("vexmora", queue, inProcess);
  Session silenced("vexmora", queue, inProcess);
  Session stranger("someone-else", queue, inProcess);
  client::EventsOff(silenced.manager());
  ASSERT_EQ(configure("0x3C4E04"), CommandResult{});

  source->emit({kRrcState, {1}});
  ASSERT_EQ(first.waitFor(1).size(), 1u);
  ASSERT_EQ(second.waitFor(1).size(), 1u);
  source->flush();
  std::promise<void> drained;
  queue.async([&drained] { drained.set_value(); });
  drained.get_future().wait();

  EXPECT_TRUE(silenced.waitFor(0).empty());
  EXPECT_TRUE(stranger.waitFor(0).empty());
}

TEST(ARecordedDrive, StartsOnceASessionHasItsEventsOnAndItsAppConfiguredInEitherOrder) {
  for (const bool configureFirst : {false, true}) {
    const auto drive = std::make_shared<tarn::testing::ScriptedMetricSource>(true);
    const auto core = std::make_shared<service::Core>(drive);
    transport::InProcess inProcess(core);
    const platform::SerialQueue queue("org.norvo.test.sessions");
    const auto app = client::CreateManager("vexmora", queue, inProcess);
    const auto stranger = client::CreateManager("someone-else", queue, inProcess);
    Object output;
    const Object configuration = withAppId({entry(kKeyPayload, bytesOf("0x3C4E04"))});

    client::EventsOn(stranger);
    client::EventsOn(app);
    client::EventsOff(app);
    EXPECT_FALSE(drive->started());
    if (configureFirst) {
      ASSERT_EQ(
          client::PerformCommand(app, std::string(kCommandAddConfiguration), configuration, output),
          CommandResult{});
      EXPECT_FALSE(drive->started()) << "the app's events are off";
      client::EventsOn(app);
    } else {
      client::EventsOn(app);
      EXPECT_FALSE(drive->started()) << "the app has not said which metrics it wants";
      ASSERT_EQ(
          client::PerformCommand(app, std::string(kCommandAddConfiguration), configuration, output),
          CommandResult{});
    }
    EXPECT_TRUE(drive->started());
  }
}

TEST(AClientSession, AnswersWithAStatusWhenItsHandleIsEmptyOrItsServiceHasGone) {
  platform::log::Capture log;
  Object output;
  EXPECT_EQ(client::PerformCommand(nullptr, "QueryMetric", Object(), output).status,
            status::kNoSession);
  client::EventsOn(nullptr);
  EXPECT_EQ(log.systemLines(), std::vector<std::string>{"tarn::client::EventsOn: no session (the "
                                                        "manager handle is empty)"});

  auto core = std::make_shared<service::Core>();
  auto inProcess = std::make_unique<transport::InProcess>(core);
  const auto manager =
      client::CreateManager("vexmora", platform::SerialQueue("org.norvo.test"), *inProcess);
  inProcess.reset();
  core.reset();
  EXPECT_EQ(
      client::PerformCommand(manager, "ClearConfiguration", withAppId({}), output),
      (CommandResult{status::kServiceUnavailable, "the baseband manager service has gone away"}));
  client::EventsOn(manager);
}

TEST(AnIpcObject, BecomesAPlainDictionaryWithItsEntriesInOrderAndNestedValuesConverted) {
  Object record;
  record.set("kKeyMetricID", Object::integer(-1));
  record.set("kKeyPayload", Object::bytes({0x0A, 0xFF}));
  record.set("note", Object::text("rrc"));
  record.set("none", Object());
  record.set("cells", Object::array(
                          {Object::integer(3), Object::dictionary({{"pci", Object::integer(7)}})}));
  record.set("kKeyMetricID", Object::integer(0x3C4E04));

  const Value plain = tarn::ipc::toPlainDictionary(record);

  EXPECT_EQ(plain, Value(Dictionary{
                       {"kKeyMetricID", std::int64_t{0x3C4E04}},
                       {"kKeyPayload", platform::Bytes{0x0A, 0xFF}},
                       {"note", "rrc"},
                       {"none", nullptr},
                       {"cells", List{std::int64_t{3}, Dictionary{{"pci", std::int64_t{7}}}}}}));
  ASSERT_TRUE(plain.isDictionary());
  EXPECT_EQ(plain.asDictionary()->begin()->first, "kKeyMetricID");
}

TEST(AnIpcObject, IsNullForAByteBufferLargerThanAMessageCarries) {
  EXPECT_TRUE(Object::bytes(platform::Bytes(Object::kMaxBufferSize + 1)).isNull());
  EXPECT_FALSE(Object::bytes({}).isNull());
}

std::string errorOf(std::string_view text) {
  try {
    Configuration::parse(text);
  } catch (const ConfigurationError& error) {
    return error.what();
  }
  return "(accepted)";
}

TEST(AConfiguration, ReadsOneHexMetricIdPerLineUnderTheProfileDeclaredAboveIt) {
  const Configuration configuration = Configuration::parse(
      "\xEF\xBB\xBF# field test\r\n"
      "0x3C4E04   # LTE RRC state\r\n"
      "\r\n"
      "\t0X3cd313\n"
      "profile 12\n"
      "0x3C0013");

  EXPECT_EQ(configuration.size(), 3u);
  EXPECT_EQ(configuration.profileOf(0x3C4E04), 0);
  EXPECT_EQ(configuration.profileOf(0x3CD313), 0);
  EXPECT_EQ(configuration.profileOf(0x3C0013), 12);
  EXPECT_EQ(configuration.profileOf(0x3CD30E), std::nullopt);
}

TEST(AConfiguration, NamesTheLineAndTheFaultOfAMalformedText) {
  const std::pair<std::string_view, std::string_view> cases[] = {
      {"", "the configuration is empty"},
      {"# nothing\n\n", "the configuration subscribes to no metric"},
      {"0x3C4E04\n3C4E04\n",
       "line 2: '3C4E04' is not a metric ID; write metric IDs in hex, like 0x3C4E04"},
      {"0x", "line 1: '0x' is not a metric ID; write metric IDs in hex, like 0x3C4E04"},
      {"0x3C4G04", "line 1: '0x3C4G04' is not a metric ID; write metric IDs in hex, like 0x3C4E04"},
      {"\x01\x02", "line 1: '\?\?' is not a metric ID; write metric IDs in hex, like 0x3C4E04"},
      {"0x0", "line 1: metric ID 0x0 is out of range (0x1 to 0xFFFFFFFF)"},
      {"0x100000000", "line 1: metric ID 0x100000000 is out of range (0x1 to 0xFFFFFFFF)"},
      {"0x3C4E04 0x3CD313",
       "line 1: unexpected '0x3CD313' after the metric ID; write one metric per line"},
      {"0x3C4E04\n# again\n0x3c4e04", "line 3: metric ID 0x3C4E04 is already subscribed on line 1"},
      {"profile\n0x1", "line 1: 'profile' takes one number from 0 to 2147483647"},
      {"profile -1\n0x1", "line 1: 'profile' takes one number from 0 to 2147483647"},
      {"profile 2147483648\n0x1", "line 1: 'profile' takes one number from 0 to 2147483647"},
      {"profile 1 2\n0x1", "line 1: 'profile' takes one number from 0 to 2147483647"},
  };
  for (const auto& [text, error] : cases)
    EXPECT_EQ(errorOf(text), error) << text;

  const std::string largest(Configuration::kLargestText, '#');
  EXPECT_EQ(errorOf(largest), "the configuration subscribes to no metric");
  EXPECT_EQ(errorOf(largest + "\n0x1"),
            "the configuration is 1048580 bytes long; it may be at most 1048576");
}

TEST(TheShippedConfiguration, SubscribesToEveryMetric) {
  std::ifstream file(NORVO_RESOURCES_DIR "/fen_test_lte.deviceconfig", std::ios::binary);
  const std::string text{std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>()};
  const Configuration configuration = Configuration::parse(text);
  EXPECT_EQ(configuration.size(), messages::kMetricKinds.size());
  for (const messages::MetricKind& kind : messages::kMetricKinds)
    EXPECT_TRUE(configuration.profileOf(kind.metricID)) << kind.name;
}

}  // namespace

namespace tarn::flow {
namespace {

using namespace std::chrono_literals;

TEST(AKindQueue, WhenFullDropsTheOldestOfTheKindWithTheMostWaitingAndKeepsTheOrder) {
  KindQueue<int> queue(4);
  // Kind 1 comes often, kind 2 once: the rare one stays however many of the frequent one come.
  EXPECT_EQ(queue.push(1, 10), std::nullopt);
  EXPECT_EQ(queue.push(2, 20), std::nullopt);
  EXPECT_EQ(queue.push(1, 11), std::nullopt);
  EXPECT_EQ(queue.push(1, 12), std::nullopt);
  EXPECT_EQ(queue.push(1, 13), 1u);
  EXPECT_EQ(queue.push(3, 30), 1u);
  EXPECT_EQ(queue.size(), 4u);
  EXPECT_EQ(queue.takeAll(), (std::vector<int>{20, 12, 13, 30}));
  EXPECT_EQ(queue.size(), 0u);
  EXPECT_EQ(queue.push(1, 14), std::nullopt);
  EXPECT_EQ(queue.takeAll(), (std::vector<int>{14}));
}

TEST(AKindQueue, StaysWithinItsCapacityUnderAFlood) {
  KindQueue<std::uint64_t> queue(100);
  std::size_t dropped = 0;
  for (std::uint64_t i = 0; i < 100'000; ++i) {
    if (queue.push(i % 7, i)) ++dropped;
    ASSERT_LE(queue.size(), 100u);
  }
  EXPECT_EQ(dropped, 100'000u - 100u);
  // The newest of each kind survives.
  const std::vector<std::uint64_t> kept = queue.takeAll();
  for (std::uint64_t newest = 100'000 - 7; newest < 100'000; ++newest) {
    EXPECT_NE(std::find(kept.begin(), kept.end(), newest), kept.end()) << newest;
  }
}

TEST(ADropTally, ReportsTheDropsByKindAtMostOnceASecond) {
  DropTally tally("tarnd");
  const auto start = DropTally::Clock::time_point() + 1h;
  EXPECT_EQ(tally.report(start), std::nullopt);
  tally.count(0x3C4E04);
  tally.count(0x3C4E04);
  tally.count(0);
  EXPECT_EQ(tally.report(start),
            "tarnd: fell behind; dropped 3 event(s), the oldest of their kind: events \u00D71, "
            "0x3C4E04 \u00D72");
  tally.count(0x3CD313);
  EXPECT_EQ(tally.report(start + 999ms), std::nullopt);
  EXPECT_EQ(tally.report(start + 1s),
            "tarnd: fell behind; dropped 1 event(s), the oldest of their kind: 0x3CD313 \u00D71");
  EXPECT_EQ(tally.report(start + 5s), std::nullopt);
}

}  // namespace
}  // namespace tarn::flow
