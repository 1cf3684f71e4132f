#include "app/ReplayControls.h"

#include <boost/beast/http/field.hpp>
#include <boost/json/parse.hpp>
#include <boost/json/value.hpp>
#include <string>

#include "events/EventDetector.h"
#include "platform/Json.h"
#include "platform/Log.h"
#include "platform/MainQueue.h"
#include "ui/web/Responses.h"

namespace app {

namespace {

namespace http = ui::web::http;
using ui::web::Request;
using ui::web::Response;

// Metrics handed over per task of the main queue, so that pages still answer in between.
constexpr std::size_t kBatch = 200;
// A speed beyond this is no replay any more; "max" says it better.
constexpr double kMaxSpeed = 10000.0;
constexpr std::size_t kMaxBody = 4096;

Response jsonResponse(const Request& request, const platform::Dictionary& body) {
  return ui::web::makeResponse(http::status::ok, "application/json", platform::toJson(body),
                               request.version(), request.keep_alive());
}

// As the site's other refusals: {"error": the status's reason, "detail": why}.
Response jsonError(const Request& request, http::status status, std::string_view detail) {
  const platform::Dictionary body{{"error", std::string(http::obsolete_reason(status))},
                                  {"detail", detail}};
  return ui::web::makeResponse(status, "application/json", platform::toJson(body),
                               request.version(), request.keep_alive());
}

platform::Value speedValue(const std::optional<double>& speed) {
  return speed ? platform::Value(*speed) : platform::Value("max");
}

}  // namespace

platform::List driveMarkers(const player::Drive& drive) {
  store::MetricValidator intake(nullptr);
  events::EventRing ring;
  events::EventDetector detector(ring);
  detector.watch(intake);
  const platform::log::Capture quiet;
  platform::List markers;
  std::uint64_t seen = 0;
  for (const player::DriveMetric& metric : drive.metrics) {
    intake.isMetricIDValidWithMetricdict(metric.record);
    for (const events::Event* event : ring.addedAfter(seen)) {
      markers.emplace_back(platform::Dictionary{{"position_ms", metric.atMs},
                                                {"kind", event->kind},
                                                {"severity", severityName(event->severity)},
                                                {"text", event->text}});
    }
    seen = ring.nextId() - 1;
  }
  return markers;
}

ReplayControls::ReplayControls(player::Drive drive, std::optional<double> speed, bool loop,
                               store::MetricValidator& intake, std::function<void()> reset)
    : player_(std::move(drive),
              {std::move(reset),
               [&intake](const platform::Dictionary& record) { intake.metricsDidUpdate(record); }},
              speed, loop, [] { return player::Player::Clock::now(); }),
      markers_(driveMarkers(player_.drive())),
      timer_(platform::mainQueue()) {}

void ReplayControls::addPages(ui::DisplayOptions& display) {
  display.routes.emplace("/api/replay", [this](const Request& request) { return api(request); });
  display.readings.emplace("replay/markers", [this] {
    return platform::toJson(platform::Dictionary{{"markers", markers_}});
  });
}

void ReplayControls::start() {
  platform::postToMainQueue([this] {
    player_.play();
    schedule();
  });
}

void ReplayControls::schedule() {
  timer_.cancel();
  const auto due = player_.deliverDue(kBatch);
  if (!due) return;
  timer_.expires_at(*due);
  timer_.async_wait([this](const boost::system::error_code& error) {
    if (!error) schedule();
  });
}

platform::Dictionary ReplayControls::stateDictionary() const {
  const player::PlayerState state = player_.state();
  return {{"playing", state.playing},
          {"speed", speedValue(state.speed)},
          {"position_ms", state.positionMs},
          {"duration_ms", state.durationMs},
          {"loop", state.loop}};
}

Response ReplayControls::api(const Request& request) {
  if (request.method() == http::verb::get || request.method() == http::verb::head)
    return jsonResponse(request, stateDictionary());
  if (request.method() != http::verb::post) {
    Response refused = jsonError(request, http::status::method_not_allowed,
                                 "this address takes GET, HEAD and POST");
    refused.set(http::field::allow, "GET, HEAD, POST");
    return refused;
  }
  // A page elsewhere cannot send JSON here without asking first, and it is never told yes.
  if (!request[http::field::content_type].starts_with("application/json"))
    return jsonError(request, http::status::unsupported_media_type, "send a JSON object");
  return control(request);
}

Response ReplayControls::control(const Request& request) {
  const auto refuse = [&request](std::string_view why) {
    return jsonError(request, http::status::bad_request, why);
  };
  if (request.body().size() > kMaxBody) return refuse("the command is too long");
  boost::system::error_code invalid;
  const boost::json::value command = boost::json::parse(request.body(), invalid);
  const boost::json::object* fields = invalid ? nullptr : command.if_object();
  if (fields == nullptr) return refuse("send a JSON object");
  const boost::json::value* action = fields->if_contains("action");
  const boost::json::string* name = action != nullptr ? action->if_string() : nullptr;
  if (name == nullptr) return refuse("\"action\" wants play, pause, speed or seek");

  if (*name == "play") {
    player_.play();
  } else if (*name == "pause") {
    player_.pause();
  } else if (*name == "speed") {
    const boost::json::value* speed = fields->if_contains("speed");
    if (speed != nullptr && speed->is_string() && speed->get_string() == "max") {
      player_.setSpeed(std::nullopt);
    } else if (speed != nullptr && speed->is_number() && speed->to_number<double>() > 0.0 &&
               speed->to_number<double>() <= kMaxSpeed) {
      player_.setSpeed(speed->to_number<double>());
    } else {
      return refuse("\"speed\" wants a number above 0 and up to 10000, or \"max\"");
    }
  } else if (*name == "seek") {
    const boost::json::value* position = fields->if_contains("position_ms");
    if (position == nullptr || !position->is_int64() || position->as_int64() < 0)
      return refuse("\"position_ms\" wants a whole number of milliseconds from the start");
    // The intake's lines of a rebuild would only bury the live ones.
    const platform::log::Capture quiet;
    player_.seek(position->as_int64());
  } else {
    return refuse("\"action\" wants play, pause, speed or seek");
  }
  schedule();
  return jsonResponse(request, stateDictionary());
}

}  // namespace app
