#include "app/ViewerEvents.h"

#include <string>

#include "events/EventJson.h"
#include "platform/Format.h"
#include "platform/Json.h"
#include "platform/ParseNumber.h"
#include "store/Dispatch.h"

namespace app {

namespace {

namespace http = ui::web::http;
using Answer = ui::web::Site::QueryAnswer;

constexpr std::size_t kDefaultLimit = 500;
constexpr std::size_t kMaxLimit = 5000;

Answer refuse(http::status status, std::string detail) {
  return {status, {}, std::move(detail)};
}

Answer answer(const platform::Dictionary& body) {
  return {http::status::ok, platform::toJson(body), {}};
}

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
  detector_.watch(intake);
}

void ViewerEvents::addPages(ui::DisplayOptions& display) {
  display.queries.emplace("events", [this](const ui::web::QueryParameters& parameters) {
    return eventsApi(parameters);
  });
  display.queries.emplace("events/metric", [this](const ui::web::QueryParameters& parameters) {
    return metricApi(parameters);
  });
  display.documents.push_back({"/timeline", "timeline.html", "Timeline"});
}

void ViewerEvents::reset() {
  ring_.clear();
  detector_.reset();
}

Answer ViewerEvents::eventsApi(const ui::web::QueryParameters& parameters) const {
  const EventQuery query = readEventQuery(parameters);
  if (!query.error.empty()) return refuse(http::status::bad_request, query.error);
  platform::List found;
  for (const events::Event* event : ring_.newestFirst(query.filter, query.limit))
    found.emplace_back(events::eventDictionary(*event));
  platform::Dictionary body;
  body.append("epoch", ring_.epoch());
  body.append("next_id", ring_.nextId());
  body.append("events", std::move(found));
  return answer(body);
}

Answer ViewerEvents::metricApi(const ui::web::QueryParameters& parameters) const {
  const auto idText = parameters.find("id");
  const auto id = idText != parameters.end() ? platform::parseNumber<std::uint64_t>(idText->second)
                                             : std::nullopt;
  if (!id) return refuse(http::status::bad_request, "id wants an event id");

  const events::Event* event = ring_.find(*id);
  if (event == nullptr) return refuse(http::status::not_found, "no such event");
  if (!event->metric) return refuse(http::status::not_found, "no metric is behind this event");
  const events::SourceMetric& metric = *event->metric;
  const store::Handler* handler = store::handlerFor(metric.metricID);
  std::optional<platform::Dictionary> decoded;
  if (metric.kept && handler != nullptr) decoded = handler->decode(&metric.payload);
  if (!decoded) return refuse(http::status::not_found, "the metric was too large to keep");
  platform::Dictionary body;
  body.append("id", event->id);
  body.append("metric_id", metric.metricID);
  body.append("metric_id_hex", platform::format("%X", metric.metricID));
  body.append("decoded", std::move(*decoded));
  return answer(body);
}

}  // namespace app
