#include "dashboard/SeriesApi.h"

#include <cmath>
#include <cstdint>
#include <limits>
#include <string>

#include "platform/Json.h"
#include "platform/NumberText.h"
#include "platform/ParseNumber.h"

namespace dashboard {

namespace {

using ui::web::Site;
namespace http = ui::web::http;

constexpr std::int64_t kAllTimes = std::numeric_limits<std::int64_t>::min();

void appendValue(std::string& out, double value) {
  const auto single = static_cast<float>(value);
  if (std::isfinite(single)) {
    platform::appendShortestFloat(out, single);
  } else {
    out += "null";
  }
}

// Names and units are the table's own: plain ASCII without quotes or backslashes.
void appendText(std::string& out, std::string_view key, std::string_view text) {
  out += '"';
  out += key;
  out += "\":\"";
  out += text;
  out += '"';
}

std::string listing(const series::SeriesStore& store) {
  std::string out = "{\"now\":";
  platform::appendDecimal(out, store.now());
  out += ",\"series\":[";
  bool first = true;
  for (const series::SeriesDefinition& definition : store.definitions()) {
    if (!first) out += ',';
    first = false;
    out += '{';
    appendText(out, "name", definition.name);
    out += ',';
    appendText(out, "label", definition.label);
    out += ',';
    appendText(out, "unit", definition.unit);
    out += ',';
    appendText(out, "graph", definition.graph);
    out += ",\"count\":";
    platform::appendDecimal(out, store.since(definition.name, kAllTimes)->size());
    out += ",\"latest\":";
    if (const auto latest = store.latest(definition.name)) {
      out += '[';
      platform::appendDecimal(out, latest->timeMs);
      out += ',';
      appendValue(out, latest->value);
      out += ']';
    } else {
      out += "null";
    }
    out += '}';
  }
  out += "]}";
  return out;
}

std::string columns(const series::SeriesDefinition& definition, const series::SampleRange& range) {
  std::string out;
  // Up to 14 characters a time and 8 a value, most of the time.
  out.reserve(96 + range.size() * 24);
  out += '{';
  appendText(out, "name", definition.name);
  out += ',';
  appendText(out, "unit", definition.unit);
  out += ",\"times\":[";
  bool first = true;
  for (const series::Sample sample : range) {
    if (!first) out += ',';
    first = false;
    platform::appendDecimal(out, sample.timeMs);
  }
  out += "],\"values\":[";
  first = true;
  for (const series::Sample sample : range) {
    if (!first) out += ',';
    first = false;
    appendValue(out, sample.value);
  }
  out += "]}";
  return out;
}

Site::QueryAnswer refuse(http::status status, std::string detail) {
  return {status, {}, std::move(detail)};
}

}  // namespace

Site::QueryAnswer answerSeries(const series::SeriesStore& store,
                               const ui::web::QueryParameters& parameters) {
  const auto name = parameters.find("name");
  const auto since = parameters.find("since");
  if (name == parameters.end()) {
    if (since != parameters.end())
      return refuse(http::status::bad_request, "since goes with the name of a series");
    return {http::status::ok, listing(store), {}};
  }
  std::int64_t sinceMs = kAllTimes;
  if (since != parameters.end()) {
    const auto parsed = platform::parseNumber<std::int64_t>(since->second);
    if (!parsed) {
      return refuse(http::status::bad_request,
                    "since wants a whole number of milliseconds since 1970, such as 1700000000000");
    }
    if (*parsed > store.now()) return refuse(http::status::bad_request, "since is in the future");
    sinceMs = *parsed;
  }
  const series::SeriesDefinition* definition = store.definition(name->second);
  if (definition == nullptr) {
    return refuse(http::status::not_found, "there is no series called " +
                                               platform::toJson(platform::Value(name->second)) +
                                               "; GET /api/series lists them");
  }
  return {http::status::ok, columns(*definition, *store.since(definition->name, sinceMs)), {}};
}

}  // namespace dashboard
