#include "tarn/service/Core.h"

#include <gtest/gtest.h>

#include <chrono>
#include <condition_variable>
#include <future>

#include "platform/Log.h"
#include "tarn/Names.h"
#include "tarn/client/Client.h"
#include "tarn/client/Transport.h"
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
using platform::Value;
using tarn::ipc::Object;

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
  ~Session() { manager_.reset(); }

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

TEST_F(AService, DeliversOnlyTheSubscribedMetricsAsRecordsUnderTheirProfile) {
  Session app("vexmora", queue, inProcess);
  ASSERT_EQ(configure("profile 7\n0x3C4E04\n"), CommandResult{});

  source->emit({kCaStatus, {9}});
  source->emit({kRrcState, {1, 2}});
  const std::vector<Event> events = app.waitFor(1);

  ASSERT_EQ(events.size(), 1u);
  EXPECT_EQ(events[0].name, kEventMetric);
  EXPECT_EQ(events[0].record, metricRecord(kRrcState, {1, 2}, 7));
  EXPECT_EQ(events[0].record.asDictionary()->begin()->first, "kKeyMetricID");
}

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

TEST_F(AService, RefusesEveryFaultyCommandWithAStatusAndAMessageThatNamesTheFault) {
  const struct {
    std::string_view command;
    Object input;
    CommandResult result;
  } cases[] = {
      {"Reboot", withAppId({}), {status::kUnknownCommand, "unknown command 'Reboot'"}},
      {kCommandClearConfiguration,
       Object::integer(2),
       {status::kInvalidArgument, "the command's arguments are not a dictionary"}},
      {kCommandClearConfiguration,
       Object::dictionary({entry(kKeyAppID, Object())}),
       {status::kMissingArgument, "missing argument kKeyAppID"}},
      {kCommandClearConfiguration,
       Object::dictionary({entry(kKeyAppID, Object::text("2"))}),
       {status::kInvalidArgument, "argument kKeyAppID is not an integer"}},
      {kCommandClearConfiguration,
       Object::dictionary({entry(kKeyAppID, Object::integer(7))}),
       {status::kUnknownAppId, "unknown app ID 7"}},
      {kCommandAddConfiguration,
       withAppId({entry(kKeyPayload, bytesOf("0x1\n0xZZ\n"))}),
       {status::kMalformedConfiguration,
        "malformed configuration: line 2: '0xZZ' is not a metric ID; write metric IDs in hex, "
        "like 0x3C4E04"}},
      {kCommandAddConfiguration,
       withAppId({entry(kKeyPayload, bytesOf("0x1")), entry(kKeyPayloadType, Object::integer(1))}),
       {status::kInvalidArgument, "unsupported payload type 1"}},
      {kCommandQueryMetric,
       withAppId({entry(kKeyTriggerID, Object::integer(0x3C0013))}),
       {status::kInvalidArgument,
        "trigger ID 0x3C0013 asks for no metric; on-demand triggers run from 0x7F0000 to "
        "0x7FFFFF"}},
      {kCommandQueryMetric,
       withAppId({entry(kKeyTriggerID, Object::integer(0x7F4E04))}),
       {status::kNoSuchMetric, "the baseband has no metric 0x3C4E04 to report"}},
  };
  for (const auto& faulty : cases)
    EXPECT_EQ(perform(faulty.command, faulty.input), faulty.result);
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

}  // namespace
