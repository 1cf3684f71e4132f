#include "tarn/log/MetricLog.h"

#include <algorithm>
#include <boost/json/monotonic_resource.hpp>
#include <boost/json/parse.hpp>
#include <boost/json/value.hpp>

#include "platform/Base64.h"
#include "platform/Json.h"
#include "tarn/Names.h"

namespace tarn::log {

namespace {

constexpr std::string_view kDeliveryKey = "t_ms";

platform::Value plainValue(const boost::json::value& json) {
  switch (json.kind()) {
    case boost::json::kind::null:
      return {};
    case boost::json::kind::bool_:
      return json.get_bool();
    case boost::json::kind::int64:
      return json.get_int64();
    case boost::json::kind::uint64:
      return json.get_uint64();
    case boost::json::kind::double_:
      return json.get_double();
    case boost::json::kind::string:
      return std::string_view(json.get_string());
    case boost::json::kind::array: {
      platform::List list;
      list.reserve(json.get_array().size());
      for (const boost::json::value& element : json.get_array())
        list.push_back(plainValue(element));
      return list;
    }
    case boost::json::kind::object: {
      platform::Dictionary dictionary;
      for (const auto& member : json.get_object()) {
        dictionary.set(std::string(member.key()), plainValue(member.value()));
      }
      return dictionary;
    }
  }
  return {};
}

ParsedLine failure(std::string error) {
  return {std::nullopt, std::move(error)};
}

bool isBlank(std::string_view line) {
  return std::all_of(line.begin(), line.end(),
                     [](char c) { return c == ' ' || c == '\t' || c == '\r'; });
}

}  // namespace

ParsedLine parseMetricLogLine(std::string_view line) {
  // A line's values live only until the record is made: they take their memory from the
  // stack, and from the heap only for a long line.
  unsigned char scratch[4096];
  boost::json::monotonic_resource memory(scratch, sizeof scratch);
  boost::system::error_code error;
  const boost::json::value json = boost::json::parse(line, error, &memory);
  if (error) return failure("not JSON (" + error.message() + ")");
  if (!json.is_object()) return failure("not a JSON object");

  MetricLogEntry entry;
  entry.record.reserve(json.get_object().size());
  for (const auto& member : json.get_object()) {
    const std::string_view key = member.key();
    const boost::json::value& value = member.value();
    if (key == tarn::kKeyPayload) {
      const std::optional<platform::Bytes> payload =
          value.is_string() ? platform::base64Decode(value.get_string()) : std::nullopt;
      if (!payload) return failure("\"kKeyPayload\" is not standard base64 text");
      entry.record.set(std::string(key), *payload);
    } else if (key == kDeliveryKey) {
      const std::optional<std::int64_t> milliseconds = plainValue(value).asInteger();
      if (!milliseconds || *milliseconds < 0) {
        return failure("\"t_ms\" is not a whole number of milliseconds of at least 0");
      }
      entry.deliveryMs = milliseconds;
    } else {
      entry.record.set(std::string(key), plainValue(value));
    }
  }
  return {std::move(entry), {}};
}

std::optional<std::string> formatMetricLogLine(const platform::Dictionary& record,
                                               std::optional<std::int64_t> deliveryMs) {
  return formatMetricLogLine(record, deliveryMs, {});
}

std::optional<std::string> formatMetricLogLine(const platform::Dictionary& record,
                                               std::optional<std::int64_t> deliveryMs,
                                               const platform::Dictionary& tail) {
  const auto integer = [&record](std::string_view key) -> std::optional<std::int64_t> {
    const platform::Value* value = record.find(key);
    return value != nullptr ? value->asInteger() : std::nullopt;
  };
  const std::optional<std::int64_t> metricID = integer(tarn::kKeyMetricID);
  const platform::Value* payload = record.find(tarn::kKeyPayload);
  if (!metricID || payload == nullptr || !payload->isBytes()) return std::nullopt;

  platform::Dictionary line;
  line.append(std::string(tarn::kKeyMetricID), *metricID);
  line.append(std::string(tarn::kKeyPayload), platform::base64Encode(*payload->asBytes()));
  for (const std::string_view key : {tarn::kKeyProfileID, tarn::kKeyAppID}) {
    if (const auto value = integer(key)) line.append(std::string(key), *value);
  }
  if (deliveryMs) line.append(std::string(kDeliveryKey), *deliveryMs);
  for (const auto& [key, value] : tail)
    line.set(key, value);
  return platform::toJson(line);
}

std::optional<MetricLogReader::Line> MetricLogReader::next() {
  std::string& text = line_;
  while (std::getline(input_, text)) {
    ++lineNumber_;
    if (isBlank(text)) continue;
    if (text.back() == '\r') text.pop_back();
    return Line{lineNumber_, parseMetricLogLine(text)};
  }
  return std::nullopt;
}

bool MetricLogWriter::write(const platform::Dictionary& record,
                            std::optional<std::int64_t> deliveryMs) {
  const std::optional<std::string> line = formatMetricLogLine(record, deliveryMs);
  if (!line) return false;
  output_ << *line << '\n';
  return true;
}

}  // namespace tarn::log
