#include "client/TarnWrapper.h"

#include <gtest/gtest.h>

#include <chrono>
#include <filesystem>
#include <fstream>
#include <future>

#include "platform/Log.h"
#include "platform/MainQueue.h"
#include "tarn/Names.h"
#include "tarn/client/Transport.h"
#include "tarn/testing/ScriptedMetricSource.h"
#include "tarn/transport/InProcess.h"

using namespace std::chrono_literals;
using platform::Dictionary;
using platform::Value;
using tarn::ipc::Object;

namespace {

constexpr std::uint32_t kRrcState = 0x3C4E04;
constexpr std::uint32_t kCaStatus = 0x3CD313;
constexpr std::uint32_t kSimFiles = 0x3C0013;
constexpr const char* kShippedConfiguration = NORVO_RESOURCES_DIR "/fen_test_lte.deviceconfig";

struct ReceivedCommand {
  std::string name;
  Value input;
};
using ReceivedCommands = std::vector<ReceivedCommand>;

// Keeps each command as the service receives it, and hands it on to `inner`, or without one
// answers it with `answer`.
class RecordingConnection final : public tarn::client::Connection {
 public:
  RecordingConnection(std::unique_ptr<tarn::client::Connection> inner, tarn::CommandResult answer,
                      std::shared_ptr<ReceivedCommands> received)
      : inner_(std::move(inner)), answer_(std::move(answer)), received_(std::move(received)) {}

  tarn::CommandResult perform(std::string_view command, const Object& input,
                              Object& output) override {
    received_->push_back({std::string(command), tarn::ipc::toPlainDictionary(input)});
    return inner_ ? inner_->perform(command, input, output) : answer_;
  }
  void setEventsOn(bool on) override {
    if (inner_) inner_->setEventsOn(on);
  }

 private:
  std::unique_ptr<tarn::client::Connection> inner_;
  tarn::CommandResult answer_;
  std::shared_ptr<ReceivedCommands> received_;
};

// Connects through `inner`, or without one answers every command with `answer`, or without
// either cannot connect at all.
class RecordingTransport final : public tarn::client::Transport {
 public:
  explicit RecordingTransport(std::shared_ptr<tarn::client::Transport> inner)
      : inner_(std::move(inner)) {}
  explicit RecordingTransport(std::optional<tarn::CommandResult> answer)
      : answer_(std::move(answer)) {}

  std::unique_ptr<tarn::client::Connection> connect(const std::string& clientName,
                                                    tarn::client::EventSink sink) override {
    if (!inner_ && !answer_) return nullptr;
    auto inner = inner_ ? inner_->connect(clientName, std::move(sink)) : nullptr;
    return std::make_unique<RecordingConnection>(
        std::move(inner), answer_.value_or(tarn::CommandResult{}), received_);
  }

  const ReceivedCommands& commands() const { return *received_; }

 private:
  std::shared_ptr<tarn::client::Transport> inner_;
  std::optional<tarn::CommandResult> answer_;
  std::shared_ptr<ReceivedCommands> received_ = std::make_shared<ReceivedCommands>();
};

// Keeps what it receives and whether every call came on the main queue.
class RecordingDelegate final : public TarnWrapperDelegate {
 public:
  void metricsDidUpdate(const Dictionary& metric) override {
    onMainQueue = onMainQueue && platform::isMainQueue();
    metrics.push_back(metric);
  }
  void eventsDidUpdate(const Dictionary& event) override {
    onMainQueue = onMainQueue && platform::isMainQueue();
    events.push_back(event);
  }

  std::vector<Dictionary> metrics;
  std::vector<Dictionary> events;
  bool onMainQueue = true;
};

Dictionary metricRecord(std::uint32_t metricId, platform::Bytes payload) {
  return {{"kKeyMetricID", std::int64_t{metricId}},
          {"kKeyPayload", std::move(payload)},
          {"kKeyProfileID", std::int64_t{0}},
          {"kKeyAppID", std::int64_t{2}}};
}

std::vector<std::string> keysOf(const Value& dictionary) {
  std::vector<std::string> keys;
  for (const auto& [key, value] : *dictionary.asDictionary())
    keys.push_back(key);
  return keys;
}

bool runMainQueueUntil(const std::function<bool()>& done) {
  return platform::runMainQueueUntil(done, 5s);
}

void drain(const platform::SerialQueue& queue) {
  std::promise<void> done;
  queue.async([&done] { done.set_value(); });
  done.get_future().wait();
}

class ATarnWrapper : public ::testing::Test {
 protected:
  ATarnWrapper() { wrapper = std::make_unique<TarnWrapper>(*transport); }

  // Pushes the shipped configuration and listens, with `delegate` set.
  void startListening() {
    ASSERT_TRUE(wrapper->addVelaConfigForAppId("vexmora", kShippedConfiguration));
    wrapper->listen();
    wrapper->setDelegate(delegate);
  }

  std::size_t metricLogLines() const {
    std::size_t count = 0;
    for (const std::string& line : log.systemLines()) {
      if (line.starts_with("-[TarnWrapper listen]_block_invoke: MetricsTrigger dict=")) ++count;
    }
    return count;
  }

  platform::log::Capture log;
  std::shared_ptr<tarn::testing::ScriptedMetricSource> source =
      std::make_shared<tarn::testing::ScriptedMetricSource>();
  std::shared_ptr<tarn::service::Core> core = std::make_shared<tarn::service::Core>(source);
  std::shared_ptr<RecordingTransport> transport =
      std::make_shared<RecordingTransport>(std::make_shared<tarn::transport::InProcess>(core));
  std::shared_ptr<RecordingDelegate> delegate = std::make_shared<RecordingDelegate>();
  std::unique_ptr<TarnWrapper> wrapper;
};

TEST_F(ATarnWrapper, RefusesAnAppIdThatDiffersOnlyInCaseOrByATrailingBlankAndSendsNothing) {
  for (const std::string_view appId : {"Vexmora", "VEXMORA", "vexmora ", ""}) {
    EXPECT_FALSE(wrapper->addVelaConfigForAppId(appId, kShippedConfiguration));
    EXPECT_FALSE(wrapper->removeVelaConfigForAppid(appId));
    EXPECT_FALSE(wrapper->querySpecificMetric(appId, 9999, 0, 0x7F0013, 0, 0));
  }
  EXPECT_TRUE(transport->commands().empty());
  EXPECT_TRUE(log.systemLines().empty());
}

TEST_F(ATarnWrapper, SendsEachCommandWithItsEntriesInOrderAndLogsItsResult) {
  ASSERT_TRUE(wrapper->removeVelaConfigForAppid("vexmora"));
  ASSERT_TRUE(wrapper->addVelaConfigForAppId("vexmora", kShippedConfiguration));
  EXPECT_FALSE(wrapper->querySpecificMetric("vexmora", -5, -2, 0x7F0013, -3, -1));

  std::ifstream file(kShippedConfiguration, std::ios::binary);
  const platform::Bytes configuration{std::istreambuf_iterator<char>(file),
                                      std::istreambuf_iterator<char>()};
  const ReceivedCommands& commands = transport->commands();
  ASSERT_EQ(commands.size(), 3u);
  EXPECT_EQ(commands[0].name, tarn::kCommandClearConfiguration);
  EXPECT_EQ(commands[0].input.description(), R"(["kKeyAppID": 2])");
  EXPECT_EQ(commands[1].name, tarn::kCommandAddConfiguration);
  EXPECT_EQ(keysOf(commands[1].input),
            (std::vector<std::string>{"kKeyAppID", "kKeyPayload", "kKeyPayloadType"}));
  EXPECT_EQ(commands[1].input, Value(Dictionary{{"kKeyAppID", std::int64_t{2}},
                                                {"kKeyPayload", configuration},
                                                {"kKeyPayloadType", std::int64_t{0}}}));
  // The text form shows the entries in order.
  EXPECT_EQ(commands[2].name, tarn::kCommandQueryMetric);
  EXPECT_EQ(
      commands[2].input.description(),
      R"(["kKeyAppID": 2, "kKeyPayloadType": 0, "kKeyTriggerRef": -5, "kKeyTriggerType": -2, )"
      R"("kKeyTriggerID": 8323091, "kKeyProfileID": -3, "kKeyMetricID": -1])");
  EXPECT_EQ(log.systemLines(),
            (std::vector<std::string>{
                "-[TarnWrapper removeVelaConfigForAppid:]: error=0 msg=",
                "-[TarnWrapper addVelaConfigForAppId:andProtofFilePath:]: error=0 msg=",
                "-[TarnWrapper querySpecificMetric:triggerRef:triggerType:triggerID:profileID:"
                "metricID:]: error=3 msg=metric ID -1 is out of range (0x1 to 0xFFFFFFFF)"}));
}

TEST_F(ATarnWrapper, AnswersByTheStatusAloneAndLogsItSigned) {
  RecordingTransport late(std::optional(tarn::CommandResult{0, "late"}));
  TarnWrapper accepting(late);
  RecordingTransport refused(std::optional(tarn::CommandResult{-5, ""}));
  TarnWrapper refusing(refused);

  EXPECT_TRUE(accepting.removeVelaConfigForAppid("vexmora"));
  EXPECT_FALSE(refusing.removeVelaConfigForAppid("vexmora"));
  EXPECT_EQ(log.systemLines(),
            (std::vector<std::string>{"-[TarnWrapper removeVelaConfigForAppid:]: error=0 msg=late",
                                      "-[TarnWrapper removeVelaConfigForAppid:]: error=-5 msg="}));
}

TEST_F(ATarnWrapper, PushesAnUnreadableFileAsNothingAndAnOversizedOneNotAtAll) {
  EXPECT_FALSE(wrapper->addVelaConfigForAppId("vexmora", "/nonexistent/fen_test_lte.deviceconfig"));
  ASSERT_EQ(transport->commands().size(), 1u);
  EXPECT_EQ(*transport->commands()[0].input.asDictionary()->find("kKeyPayload"),
            Value(platform::Bytes{}));
  EXPECT_EQ(log.systemLines(),
            (std::vector<std::string>{"-[TarnWrapper addVelaConfigForAppId:andProtofFilePath:]: "
                                      "error=5 msg=malformed configuration: the configuration is "
                                      "empty"}));

  const std::filesystem::path oversized =
      std::filesystem::temp_directory_path() / "norvo-oversized.deviceconfig";
  std::ofstream{oversized}.close();
  std::filesystem::resize_file(oversized, Object::kMaxBufferSize + 1);
  EXPECT_FALSE(wrapper->addVelaConfigForAppId("vexmora", oversized.string()));
  std::filesystem::remove(oversized);
  EXPECT_EQ(transport->commands().size(), 1u);
  EXPECT_EQ(log.systemLines().size(), 1u);
}

TEST_F(ATarnWrapper, HandsEachSubscribedMetricToItsDelegateOnceOnTheMainQueue) {
  startListening();
  wrapper->listen();
  source->emit({0x123456, {1}});
  source->emit({kRrcState, {2}});
  source->emit({kCaStatus, {3}});

  ASSERT_TRUE(runMainQueueUntil([&] { return delegate->metrics.size() == 2; }));
  EXPECT_EQ(delegate->metrics[0], metricRecord(kRrcState, {2}));
  EXPECT_EQ(delegate->metrics[1], metricRecord(kCaStatus, {3}));
  EXPECT_TRUE(delegate->onMainQueue);
  EXPECT_EQ(log.count("-[TarnWrapper listen]: listening for events"), 2u);
  EXPECT_EQ(log.count("-[TarnWrapper listen]_block_invoke: MetricsTrigger dict=[\"kKeyMetricID\": "
                      "3952132, \"kKeyPayload\": <02>, \"kKeyProfileID\": 0, \"kKeyAppID\": 2]"),
            1u);
}

TEST_F(ATarnWrapper, LogsButDropsWhatArrivesBeforeADelegateIsSet) {
  ASSERT_TRUE(wrapper->addVelaConfigForAppId("vexmora", kShippedConfiguration));
  wrapper->listen();
  source->emit({kRrcState, {1}});
  source->flush();
  drain(wrapper->queue());
  ASSERT_EQ(metricLogLines(), 1u);

  wrapper->setDelegate(delegate);
  source->emit({kCaStatus, {2}});
  ASSERT_TRUE(runMainQueueUntil([&] { return !delegate->metrics.empty(); }));
  EXPECT_EQ(delegate->metrics, std::vector<Dictionary>{metricRecord(kCaStatus, {2})});
}

TEST_F(ATarnWrapper, CallsNoDelegateThatWentAwayBeforeTheMainQueueRan) {
  startListening();
  source->emit({kRrcState, {1}});
  source->flush();
  drain(wrapper->queue());
  const std::weak_ptr<RecordingDelegate> gone = delegate;
  delegate.reset();
  ASSERT_TRUE(gone.expired());

  bool ran = false;
  platform::postToMainQueue([&ran] { ran = true; });
  EXPECT_TRUE(runMainQueueUntil([&ran] { return ran; }));
  EXPECT_EQ(metricLogLines(), 1u);
}

TEST_F(ATarnWrapper, KeepsWorkingWhenItsSessionIsMissingOrItsServiceHasGone) {
  RecordingTransport unreachable{std::optional<tarn::CommandResult>()};
  TarnWrapper unconnected(unreachable);
  EXPECT_FALSE(unconnected.removeVelaConfigForAppid("vexmora"));
  unconnected.listen();

  transport.reset();
  core.reset();
  EXPECT_FALSE(wrapper->removeVelaConfigForAppid("vexmora"));
  wrapper->listen();

  EXPECT_EQ(log.count("-[TarnWrapper removeVelaConfigForAppid:]: error=7 msg=no session: the "
                      "manager handle is empty"),
            1u);
  EXPECT_EQ(log.count("-[TarnWrapper removeVelaConfigForAppid:]: error=8 msg=the baseband "
                      "manager service has gone away"),
            1u);
}

TEST(TheSharedTarnWrapper, PushesTheShippedConfigurationAndDeliversMetricsAndTheSimFiles) {
  // The shared wrapper opens its session over the transport the application chose, and keeps it
  // for the rest of the process, so its service stays too.
  static const auto source = std::make_shared<tarn::testing::ScriptedMetricSource>();
  static const auto core = std::make_shared<tarn::service::Core>(source);
  tarn::client::useTransport(std::make_shared<tarn::transport::InProcess>(core));
  source->answerQueriesWith({kSimFiles, {0x0A, 0x02}});
  const auto delegate = std::make_shared<RecordingDelegate>();

  TarnWrapper& wrapper = TarnWrapper::sharedInstance();
  ASSERT_EQ(&wrapper, &TarnWrapper::sharedInstance());
  EXPECT_TRUE(wrapper.queue().label().ends_with(".serialQ.queue"));
  wrapper.listen();
  wrapper.setDelegate(delegate);
  wrapper.removeVelaConfigForAppid("vexmora");
  ASSERT_TRUE(wrapper.addVelaConfigForAppId("vexmora", kShippedConfiguration));
  wrapper.listen();
  ASSERT_TRUE(wrapper.querySpecificMetric("vexmora", 9999, 0, 0x7F0013, 0, 0));
  source->emit({kCaStatus, {3}});

  ASSERT_TRUE(runMainQueueUntil([&] { return delegate->metrics.size() == 2; }));
  EXPECT_EQ(delegate->metrics[0], metricRecord(kSimFiles, {0x0A, 0x02}));
  EXPECT_EQ(delegate->metrics[1], metricRecord(kCaStatus, {3}));
  ASSERT_EQ(delegate->events.size(), 1u);
  EXPECT_EQ(*delegate->events[0].find("kKeyTriggerRef"), Value(std::int64_t{9999}));
  EXPECT_TRUE(delegate->onMainQueue);
  wrapper.setDelegate({});
}

}  // namespace
