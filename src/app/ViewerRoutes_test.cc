#include <gtest/gtest.h>

#include <boost/beast/http/field.hpp>
#include <boost/json/parse.hpp>
#include <string>

#include "app/MainInterface.h"
#include "app/ReplayControls.h"
#include "app/ViewerEvents.h"
#include "messages/Records.h"
#include "platform/Log.h"
#include "store/MetricValidator.h"
#include "ui/web/OpenPages.h"
#include "ui/web/Site.h"

namespace app {
namespace {

namespace http = ui::web::http;
namespace json = boost::json;
using messages::KCellularLteRrcState;
using store::MetricValidator;

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
