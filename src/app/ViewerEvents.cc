#include "app/ViewerEvents.h"

#include <string>

#include "app/ApiResponses.h"
#include "events/EventJson.h"
#include "platform/Format.h"
#include "platform/ParseNumber.h"
#include "store/Dispatch.h"
#include "ui/web/Assets.h"
#include "ui/web/Query.h"
#include "ui/web/Responses.h"

namespace app {

namespace {

namespace http = ui::web::http;
using ui::web::Request;
using ui::web::Response;

constexpr std::size_t kDefaultLimit = 500;
constexpr std::size_t kMaxLimit = 5000;

// Calls `take` with each item of a comma-separated list; stops at the first it refuses.
template <class Take>
bool eachListed(std::string_view list, Take take) {
  while (true) {
    const std::size_t comma = list.find(',');
    if (!take(list.substr(0, comma))) return false;
    if (comma == std::string_view::npos) return true;
    list = list.substr(comma + 1);
  }
}

// The filter and limit a query asks for, or what is wrong with it.
struct EventQuery {
  events::EventFilter filter;
  std::size_t limit = kDefaultLimit;
  std::string error;
};

EventQuery readEventQuery(const ui::web::QueryParameters& parameters) {
  EventQuery query;
  for (const auto& [name, value] : parameters) {
    if (name == "since") {
      query.filter.sinceMs = platform::parseNumber<std::int64_t>(value);
      if (!query.filter.sinceMs) query.error = "since wants milliseconds since 1970";
    } else if (name == "after") {
      query.filter.afterId = platform::parseNumber<std::uint64_t>(value);
      if (!query.filter.afterId) query.error = "after wants an event id";
    } else if (name == "limit") {
      const auto limit = platform::parseNumber<std::size_t>(value);
      if (!limit || *limit == 0 || *limit > kMaxLimit) {
        query.error = platform::format("limit wants a number from 1 to %zu", kMaxLimit);
      } else {
        query.limit = *limit;
      }
    } else if (name == "kind") {
      eachListed(value, [&](std::string_view kind) {
        const auto known = events::kindNamed(kind);
        if (known)
          query.filter.kinds.push_back(*known);
        else
          query.error = "unknown kind \"" + std::string(kind) + '"';
        return known.has_value();
      });
    } else if (name == "severity") {
      eachListed(value, [&](std::string_view severity) {
        const auto known = events::severityNamed(severity);
        if (known)
          query.filter.severities.push_back(*known);
        else
          query.error = "unknown severity \"" + std::string(severity) + '"';
        return known.has_value();
      });
    } else {
      query.error = "unknown parameter \"" + name + '"';
    }
    if (!query.error.empty()) break;
  }
  return query;
}

}  // namespace

ViewerEvents::ViewerEvents(store::MetricValidator& intake) {
  intake.addAcceptedMetricObserver([this](std::int64_t metricID, const platform::Bytes* payload,
                                          const platform::Dictionary& decoded) {
    detector_.observe(metricID, payload, decoded);
  });
}

void ViewerEvents::addRoutes(ui::DisplayOptions& display) {
  display.routes.emplace("/api/events",
                         [this](const Request& request) { return eventsApi(request); });
  display.routes.emplace("/api/events/metric",
                         [this](const Request& request) { return metricApi(request); });
  display.routes.emplace("/timeline", [](const Request& request) {
    if (!isRead(request)) return methodNotAllowed(request, "GET, HEAD");
    const ui::web::Asset* page = ui::web::findAsset("timeline.html");
    return ui::web::makeResponse(http::status::ok, page->contentType, std::string(page->content),
                                 request.version(), request.keep_alive());
  });
}

void ViewerEvents::reset() {
  ring_.clear();
  detector_.reset();
}

Response ViewerEvents::eventsApi(const Request& request) const {
  if (!isRead(request)) return methodNotAllowed(request, "GET, HEAD");
  const auto parameters = ui::web::parseQuery(request.target());
  if (!parameters) return jsonError(request, http::status::bad_request, "malformed query");
  const EventQuery query = readEventQuery(*parameters);
  if (!query.error.empty()) return jsonError(request, http::status::bad_request, query.error);

  platform::List found;
  for (const events::Event* event : ring_.newestFirst(query.filter, query.limit))
    found.emplace_back(events::eventDictionary(*event));
  platform::Dictionary body;
  body.append("epoch", ring_.epoch());
  body.append("next_id", ring_.nextId());
  body.append("events", std::move(found));
  return jsonResponse(request, body);
}

Response ViewerEvents::metricApi(const Request& request) const {
  if (!isRead(request)) return methodNotAllowed(request, "GET, HEAD");
  const auto parameters = ui::web::parseQuery(request.target());
  const auto idText = parameters ? ui::web::queryValue(*parameters, "id") : std::nullopt;
  const auto id = idText ? platform::parseNumber<std::uint64_t>(*idText) : std::nullopt;
  if (!id) return jsonError(request, http::status::bad_request, "id wants an event id");

  const events::Event* event = ring_.find(*id);
  if (event == nullptr) return jsonError(request, http::status::not_found, "no such event");
  if (!event->metric) {
    return jsonError(request, http::status::not_found, "no metric is behind this event");
  }
  const events::SourceMetric& metric = *event->metric;
  const store::Handler* handler = store::handlerFor(metric.metricID);
  std::optional<platform::Dictionary> decoded;
  if (metric.kept && handler != nullptr) decoded = handler->decode(&metric.payload);
  if (!decoded) {
    return jsonError(request, http::status::not_found, "the metric was too large to keep");
  }
  platform::Dictionary body;
  body.append("id", event->id);
  body.append("metric_id", metric.metricID);
  body.append("metric_id_hex", platform::format("%X", metric.metricID));
  body.append("decoded", std::move(*decoded));
  return jsonResponse(request, body);
}

}  // namespace app
