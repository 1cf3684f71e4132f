#include "app/RootNavigationController.h"

#include <gtest/gtest.h>

#include <filesystem>
#include <map>

#include "app/AppDelegate.h"
#include "app/SharedIntake.h"
#include "platform/Log.h"
#include "screens/NorvoViewController.h"
#include "tarn/Ipc.h"
#include "tarn/Names.h"
#include "tarn/client/Transport.h"

namespace {

struct Sent {
  std::string command;
  platform::Dictionary input;
};

// Keeps the commands the service would receive and answers each with the status set for it
// (0 unless told otherwise); counts how often events are switched on.
class RecordingTransport final : public tarn::client::Transport {
 public:
  std::unique_ptr<tarn::client::Connection> connect(const std::string&,
                                                    tarn::client::EventSink) override {
    return std::make_unique<Connection>(*this);
  }

  std::vector<std::string> commands() const {
    std::vector<std::string> names;
    for (const Sent& command : sent)
      names.push_back(command.command);
    return names;
  }

  std::vector<Sent> sent;
  std::map<std::string, std::int32_t, std::less<>> statuses;
  int eventsSwitchedOn = 0;

 private:
  class Connection final : public tarn::client::Connection {
   public:
    explicit Connection(RecordingTransport& owner) : owner_(owner) {}
    tarn::CommandResult perform(std::string_view command, const tarn::ipc::Object& input,
                                tarn::ipc::Object&) override {
      owner_.sent.push_back(
          {std::string(command), *tarn::ipc::toPlainDictionary(input).asDictionary()});
      const auto status = owner_.statuses.find(command);
      return {status != owner_.statuses.end() ? status->second : 0, ""};
    }
    void setEventsOn(bool on) override { owner_.eventsSwitchedOn += on ? 1 : 0; }

   private:
    RecordingTransport& owner_;
  };
};

class TheRootNavigationController : public ::testing::Test {
 protected:
  // Builds the controller over `resources` and loads its view; answers the plain log lines.
  std::vector<std::string> start(const ui::Bundle& resources) {
    RootNavigationController root(std::make_unique<NorvoViewController>(), &session, validator,
                                  resources);
    platform::log::Capture log;
    root.loadViewIfNeeded();
    return log.plainLines();
  }

  std::shared_ptr<RecordingTransport> transport = std::make_shared<RecordingTransport>();
  TarnWrapper session{*transport};
  app::TarnWrapperSession intakeSession{session};
  store::MetricValidator validator{&intakeSession};
  const ui::Bundle shipped{{NORVO_RESOURCES_DIR}};
  const ui::Bundle empty{{std::filesystem::temp_directory_path() / "norvo-no-resources"}};
};

TEST_F(TheRootNavigationController, PushesTheConfigurationListensAgainAndAsksForTheSimFiles) {
  const auto lines = start(shipped);

  EXPECT_EQ(lines, (std::vector<std::string>{"pushing metric file", "Querying SIM files"}));
  EXPECT_EQ(transport->commands(),
            (std::vector<std::string>{std::string(tarn::kCommandClearConfiguration),
                                      std::string(tarn::kCommandAddConfiguration),
                                      std::string(tarn::kCommandQueryMetric)}));
  // Once when the intake was made, once after the push.
  EXPECT_EQ(transport->eventsSwitchedOn, 2);

  const platform::Dictionary& query = transport->sent.back().input;
  const std::pair<std::string_view, std::int64_t> expected[] = {
      {tarn::kKeyAppID, 2},           {tarn::kKeyTriggerRef, 9999}, {tarn::kKeyTriggerType, 0},
      {tarn::kKeyTriggerID, 8323091}, {tarn::kKeyProfileID, 0},     {tarn::kKeyMetricID, 0}};
  for (const auto& [key, value] : expected) {
    ASSERT_NE(query.find(key), nullptr) << key;
    EXPECT_EQ(query.find(key)->asInteger(), value) << key;
  }
}

TEST_F(TheRootNavigationController, StopsAfterTheRemovalWhenTheConfigurationFileIsMissing) {
  EXPECT_EQ(start(empty), std::vector<std::string>{"Metric Log File path doesnt exist"});
  EXPECT_EQ(transport->commands(),
            std::vector<std::string>{std::string(tarn::kCommandClearConfiguration)});
  EXPECT_EQ(transport->eventsSwitchedOn, 1);
}

TEST_F(TheRootNavigationController, AsksNothingMoreWhenThePushIsRefused) {
  transport->statuses[std::string(tarn::kCommandAddConfiguration)] = tarn::status::kUnknownAppId;
  EXPECT_EQ(start(shipped), std::vector<std::string>{"pushing metric file"});
  EXPECT_EQ(transport->commands().size(), 2u);
  EXPECT_EQ(transport->eventsSwitchedOn, 1);
}

TEST_F(TheRootNavigationController, GoesOnDespiteAFailedRemovalAndSendsNothingWithoutASession) {
  transport->statuses[std::string(tarn::kCommandClearConfiguration)] = tarn::status::kUnknownAppId;
  EXPECT_EQ(start(shipped).size(), 2u);
  EXPECT_EQ(transport->commands().size(), 3u);

  RootNavigationController sessionless(std::make_unique<NorvoViewController>(), nullptr, validator,
                                       shipped);
  platform::log::Capture log;
  sessionless.loadViewIfNeeded();
  EXPECT_EQ(log.plainLines(), std::vector<std::string>{"pushing metric file"});
  EXPECT_EQ(transport->commands().size(), 3u);
}

TEST_F(TheRootNavigationController, RunsTheStartUpOnceWhenItsViewFirstLoads) {
  RootNavigationController root(std::make_unique<NorvoViewController>(), &session, validator,
                                shipped);
  EXPECT_TRUE(transport->sent.empty());

  root.loadViewIfNeeded();
  root.loadViewIfNeeded();
  EXPECT_EQ(transport->sent.size(), 3u);
}

TEST(TheAppDelegate, FinishesLaunchingWithOrWithoutOptions) {
  AppDelegate delegate;
  EXPECT_TRUE(delegate.didFinishLaunchingWithOptions(std::nullopt));
  EXPECT_TRUE(delegate.didFinishLaunchingWithOptions(platform::Dictionary{{"url", "x"}}));
}

}  // namespace
