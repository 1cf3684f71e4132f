#include <gtest/gtest.h>

#include <boost/beast/http/field.hpp>
#include <boost/json/parse.hpp>
#include <filesystem>
#include <map>
#include <string>

#include "app/AppDelegate.h"
#include "app/LogDestination.h"
#include "app/MainInterface.h"
#include "app/ReplayControls.h"
#include "app/RootNavigationController.h"
#include "app/SharedIntake.h"
#include "app/StatusLine.h"
#include "app/ViewerEvents.h"
#include "messages/Records.h"
#include "platform/Log.h"
#include "screens/NorvoViewController.h"
#include "store/MetricValidator.h"
#include "tarn/Ipc.h"
#include "tarn/Names.h"
#include "tarn/client/Transport.h"
#include "ui/web/OpenPages.h"
#include "ui/web/Site.h"

namespace app {
namespace {

namespace http = ui::web::http;
namespace json = boost::json;
using messages::KCellularLteRrcState;
using platform::Dictionary;
using platform::List;
using store::MetricValidator;

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

// Browses the real screens the way a browser does, over a store of the test's own.
class TheBrowser : public ::testing::Test {
 protected:
  ui::web::Response get(const std::string& target) {
    ui::web::Request request(http::verb::get, target, 11);
    request.set(http::field::host, "127.0.0.1:8080");
    return site.handle(request);
  }

  bool shows(const std::string& target, std::string_view html) {
    return get(target).body().find(html) != std::string::npos;
  }

  store::MetricValidator validator{nullptr};
  ui::Storyboard board = mainInterface(&validator);
  ui::web::OpenPages pages{board, {}};
  ui::web::Site site{pages, {}};
};

TEST_F(TheBrowser, ShowsTheCarriersOfTheCaStatusAsNumberedSections) {
  store::LTE lte = validator.myLTE();
  lte.CAStatusList = List{Dictionary{{"rsrp", -95}, {"dl_bandwidth", 20.0f}},
                          Dictionary{{"rsrp", -101}, {"dl_bandwidth", 1.4f}}};
  validator.setMyLTE(lte);

  EXPECT_TRUE(shows("/LTE/CA%20Status", "<h2>Component Carrier 1</h2>"));
  const json::value table = json::parse(get("/api/screens/LTE/CA%20Status").body());
  EXPECT_EQ(table.at("title"), "CA Status");
  EXPECT_EQ(table.at("sections").at(0).at("header"), "Component Carrier 0");
  EXPECT_EQ(table.at("sections").at(0).at("rows").at(1),
            (json::value{{"text", "dl_bandwidth"}, {"detail", "20.0"}}));
  EXPECT_EQ(table.at("sections").at(1).at("rows").at(1).at("detail"), "1.4");
}

// The launch screen, the categories and the identities' rows are walked in a browser by
// tests/browser/browse.test.js.
TEST_F(TheBrowser, FindsEachItemUnderItsOwnCategoryAndTheThirdLevelByAddress) {
  EXPECT_TRUE(shows("/GSM", R"(<a href="/GSM/GSM%20GPRS%20Config">)"));
  EXPECT_EQ(get("/LTE/GSM%20GPRS%20Config").result(), http::status::not_found);
  // Detail rows are not links, but each leads to the third level.
  EXPECT_FALSE(shows("/Device%20Info/IMSI", "<a href=\"/Device%20Info/IMSI/"));
  EXPECT_TRUE(shows("/Device%20Info/IMSI/Come%20back%20later", "No further details"));
}

TEST(TheLogDestination, IsTheStatusLineOnATerminalAndTheLinesElsewhere) {
  const std::optional<std::string> home = "/home/ann/.local/state/norvo/norvo.log";
  struct Case {
    std::optional<std::string_view> option;
    bool terminal;
    std::optional<std::string> defaultFile;
    LogDestination destination;
  };
  const Case cases[] = {
      {std::nullopt, true, home, {home, true}},
      {std::nullopt, false, home, {std::nullopt, false}},
      {std::nullopt, true, std::nullopt, {std::nullopt, false}},
      {"-", true, home, {std::nullopt, false}},
      {"-", false, home, {std::nullopt, false}},
      {"drive.log", true, home, {"drive.log", true}},
      {"drive.log", false, home, {"drive.log", false}},
  };
  for (const Case& c : cases) {
    EXPECT_EQ(chooseLogDestination(c.option, c.terminal, c.defaultFile), c.destination)
        << c.option.value_or("(none)") << " terminal=" << c.terminal;
  }
}

TEST(TheDefaultLogFile, IsUnderTheStateHomeWhenItIsAnAbsolutePath) {
  EXPECT_EQ(defaultLogFile("/state", "/home/ann"), "/state/norvo/norvo.log");
  EXPECT_EQ(defaultLogFile(nullptr, "/home/ann"), "/home/ann/.local/state/norvo/norvo.log");
  EXPECT_EQ(defaultLogFile("relative", "/home/ann"), "/home/ann/.local/state/norvo/norvo.log");
  EXPECT_EQ(defaultLogFile("", "/home/ann"), "/home/ann/.local/state/norvo/norvo.log");
  EXPECT_EQ(defaultLogFile(nullptr, nullptr), std::nullopt);
}

TEST(TheStatusLine, ShowsTheAddressSourceRateAndServingLevelWithinTheTerminalsWidth) {
  StatusFigures figures{"http://127.0.0.1:8080/", "simulated phone", 4.25, std::nullopt, {}, {}};
  EXPECT_EQ(statusText(figures, 200),
            "Open http://127.0.0.1:8080/ | simulated phone | 4.2 metrics/s | no service");
  figures.serving = dashboard::ServingLevel{"LTE", "lte.rsrp", {0, -95.4}};
  figures.servingUnit = "dBm";
  figures.alerts = 1;
  EXPECT_EQ(
      statusText(figures, 200),
      "Open http://127.0.0.1:8080/ | simulated phone | 4.2 metrics/s | LTE -95 dBm | 1 alert");
  figures.alerts = 3;
  EXPECT_TRUE(statusText(figures, 200).ends_with("| 3 alerts"));
  // One column short of the width, so that the terminal never wraps it.
  EXPECT_EQ(statusText(figures, 28), "Open http://127.0.0.1:8080/");
  figures.address.clear();
  EXPECT_TRUE(statusText(figures, 200).starts_with("Norvo is starting | simulated phone |"));
}

platform::Dictionary rrcRecord(KCellularLteRrcState::State state,
                               KCellularLteRrcState::Cause cause) {
  KCellularLteRrcState record;
  record.setTimestamp(1718100000000);
  record.setState(state);
  record.setCause(cause);
  return {{"kKeyMetricID", MetricValidator::K_LTE_RRC_STATE}, {"kKeyPayload", record.data()}};
}

// The viewer's events and replay, asked through the site as a browser asks.
class ViewerRoutes : public ::testing::Test {
 protected:
  ViewerRoutes() { events.addPages(display); }

  ui::web::Response call(const std::string& target, http::verb method = http::verb::get,
                         std::string body = {}, const std::string& type = "application/json") {
    if (!site) {
      site = std::make_unique<ui::web::Site>(
          pages, ui::web::Site::Options{false, display.readings, display.queries, display.documents,
                                        display.routes});
    }
    ui::web::Request request(method, target, 11);
    request.set(http::field::host, "127.0.0.1:8080");
    request.set(http::field::content_type, type);
    request.body() = std::move(body);
    request.prepare_payload();
    return site->handle(request);
  }

  json::value answer(const std::string& target, http::verb method = http::verb::get,
                     std::string body = {}) {
    const ui::web::Response response = call(target, method, std::move(body));
    EXPECT_EQ(response.result(), http::status::ok) << target << ' ' << response.body();
    return json::parse(response.body());
  }

  platform::log::Capture log;
  MetricValidator intake{nullptr};
  ViewerEvents events{intake};
  ui::DisplayOptions display;
  ui::Storyboard board = mainInterface(&intake);
  ui::web::OpenPages pages{board, {}};
  std::unique_ptr<ui::web::Site> site;
};

TEST_F(ViewerRoutes, AnswersTheEventsAsAskedAndTheMetricBehindOne) {
  intake.metricsDidUpdate(rrcRecord(KCellularLteRrcState::KLTE_RRC_STATE_CONNECTED,
                                    KCellularLteRrcState::KLTE_RRC_CAUSE_EST_MO_DATA));
  intake.metricsDidUpdate(
      rrcRecord(KCellularLteRrcState::KLTE_RRC_STATE_ATMPT_CONNECTION,
                KCellularLteRrcState::KLTE_RRC_CAUSE_REEST_OTHER_FAIL_T310_EXP));

  const json::value all = answer("/api/events");
  EXPECT_EQ(all.at("next_id"), 3);
  EXPECT_EQ(all.at("events").as_array().size(), 2u);
  EXPECT_EQ(all.at("events").at(0).at("kind"), "radio-link");
  const struct {
    const char* target;
    std::size_t count;
  } filters[] = {{"/api/events?severity=failure", 1}, {"/api/events?kind=rrc,sim", 1},
                 {"/api/events?after=1", 1},          {"/api/events?since=1718100000001", 0},
                 {"/api/events?limit=1", 1},          {"/api/events?kind=rrc,radio-link", 2}};
  for (const auto& filter : filters)
    EXPECT_EQ(answer(filter.target).at("events").as_array().size(), filter.count) << filter.target;
  for (const char* malformed :
       {"/api/events?since=soon", "/api/events?kind=nope", "/api/events?severity=bad",
        "/api/events?limit=0", "/api/events?limit=99999", "/api/events?colour=red",
        "/api/events?kind=%zz", "/api/events/metric?id=x", "/api/events/metric"}) {
    const ui::web::Response response = call(malformed);
    EXPECT_EQ(response.result(), http::status::bad_request) << malformed;
    EXPECT_TRUE(json::parse(response.body()).as_object().contains("error")) << malformed;
  }
  EXPECT_EQ(call("/api/events", http::verb::post).result(), http::status::method_not_allowed);

  const json::value metric = answer("/api/events/metric?id=2");
  EXPECT_EQ(metric.at("metric_id_hex"), "3C4E04");
  EXPECT_EQ(metric.at("decoded").at("state"), "KLTE_RRC_STATE_ATMPT_CONNECTION");
  EXPECT_EQ(call("/api/events/metric?id=9").result(), http::status::not_found);

  const ui::web::Response page = call("/timeline");
  EXPECT_EQ(page.result(), http::status::ok);
  EXPECT_NE(page.body().find("<h1>Timeline</h1>"), std::string::npos);
  EXPECT_NE(call("/").body().find(R"(<a href="/timeline">Timeline</a>)"), std::string::npos);
}

TEST_F(ViewerRoutes, ControlsTheReplayAndSeeksByRebuilding) {
  player::Drive drive;
  drive.metrics = {
      {0, rrcRecord(KCellularLteRrcState::KLTE_RRC_STATE_IDLE,
                    KCellularLteRrcState::KLTE_RRC_CAUSE_NA)},
      {1000, rrcRecord(KCellularLteRrcState::KLTE_RRC_STATE_CONNECTED,
                       KCellularLteRrcState::KLTE_RRC_CAUSE_EST_MO_DATA)},
      {2000, rrcRecord(KCellularLteRrcState::KLTE_RRC_STATE_ATMPT_CONNECTION,
                       KCellularLteRrcState::KLTE_RRC_CAUSE_REEST_OTHER_FAIL_T310_EXP)},
  };
  ReplayControls controls(std::move(drive), 1.0, false, intake, [this] {
    intake.clearStore();
    events.reset();
  });
  controls.addPages(display);

  const json::value start = answer("/api/replay");
  EXPECT_EQ(start, json::parse(R"({"playing":false,"speed":1.0,"position_ms":0,
                                   "duration_ms":2000,"loop":false})"));
  const json::value markers = answer("/api/replay/markers").at("markers");
  ASSERT_EQ(markers.as_array().size(), 3u);
  EXPECT_EQ(markers.at(2).at("position_ms"), 2000);
  EXPECT_EQ(markers.at(2).at("severity"), "failure");

  const json::value seeked =
      answer("/api/replay", http::verb::post, R"({"action":"seek","position_ms":1500})");
  EXPECT_EQ(seeked.at("position_ms"), 1500);
  EXPECT_EQ(intake.myLTERRCStateDict()->find("state")->description(), "KLTE_RRC_STATE_CONNECTED");
  EXPECT_EQ(events.ring().size(), 2u);
  EXPECT_EQ(
      answer("/api/replay", http::verb::post, R"({"action":"speed","speed":"max"})").at("speed"),
      "max");
  EXPECT_EQ(answer("/api/replay", http::verb::post, R"({"action":"speed","speed":2})").at("speed"),
            2.0);
  EXPECT_EQ(answer("/api/replay", http::verb::post, R"({"action":"play"})").at("playing"), true);
  EXPECT_EQ(answer("/api/replay", http::verb::post, R"({"action":"pause"})").at("playing"), false);

  for (const char* refused :
       {"", "[]", "{\"action\":\"rewind\"}", "{\"action\":\"seek\"}",
        "{\"action\":\"seek\",\"position_ms\":-1}", "{\"action\":\"seek\",\"position_ms\":\"1\"}",
        "{\"action\":\"speed\",\"speed\":0}", "{\"action\":\"speed\",\"speed\":\"fast\"}"}) {
    EXPECT_EQ(call("/api/replay", http::verb::post, refused).result(), http::status::bad_request)
        << refused;
  }
  EXPECT_EQ(call("/api/replay", http::verb::post, R"({"action":"play"})", "text/plain").result(),
            http::status::unsupported_media_type);
  EXPECT_EQ(call("/api/replay", http::verb::put).result(), http::status::method_not_allowed);
}

}  // namespace
}  // namespace app
