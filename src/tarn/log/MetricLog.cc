#include "tarn/log/MetricLog.h"

#include <algorithm>
#include <boost/json/monotonic_resource.hpp>
#include <boost/json/parse.hpp>
#include <boost/json/value.hpp>
#include <cmath>
#include <streambuf>

#include "platform/Base64.h"
#include "platform/Format.h"
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
      // The parser has kept the last of any repeated key, so every key is new.
      platform::Dictionary dictionary;
      dictionary.reserve(json.get_object().size());
      for (const auto& member : json.get_object()) {
        dictionary.append(std::string(member.key()), plainValue(member.value()));
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

// The keys of a JSON text, counted as the colons outside its strings, up to one past `most`:
// checked before the text is parsed, so that the parser never builds more objects than that.
std::size_t keysUpTo(std::string_view text, std::size_t most) {
  std::size_t keys = 0;
  bool inString = false;
  for (std::size_t i = 0; i < text.size() && keys <= most; ++i) {
    const char c = text[i];
    if (inString) {
      if (c == '\\')
        ++i;
      else if (c == '"')
        inString = false;
    } else if (c == '"') {
      inString = true;
    } else if (c == ':') {
      ++keys;
    }
  }
  return keys;
}

// "t_ms": any finite number of at least 0, a fraction rounded down; not a boolean.
std::optional<std::int64_t> deliveryTimeOf(const boost::json::value& value) {
  // 2^63, exactly: the first whole number past the largest std::int64_t.
  constexpr double kPastLargest = 9223372036854775808.0;
  if (const auto* whole = value.if_int64())
    return *whole >= 0 ? std::optional(*whole) : std::nullopt;
  if (const auto* large = value.if_uint64()) {
    return *large <= static_cast<std::uint64_t>(INT64_MAX)
               ? std::optional(static_cast<std::int64_t>(*large))
               : std::nullopt;
  }
  if (const auto* real = value.if_double()) {
    if (!std::isfinite(*real) || !(*real >= 0.0) || *real >= kPastLargest) return std::nullopt;
    return static_cast<std::int64_t>(std::floor(*real));
  }
  return std::nullopt;
}

}  // namespace

ParsedLine parseMetricLogLine(std::string_view line, const MetricLogLimits& limits) {
  if (line.size() > limits.lineBytes) {
    return failure(platform::format("longer than %zu bytes", limits.lineBytes));
  }
  if (keysUpTo(line, limits.keys) > limits.keys) {
    return failure(platform::format("more than %zu keys", limits.keys));
  }
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
      entry.record.append(std::string(key), *payload);
    } else if (key == kDeliveryKey) {
      entry.deliveryMs = deliveryTimeOf(value);
      if (!entry.deliveryMs) {
        return failure("\"t_ms\" is not a number of milliseconds of at least 0");
      }
    } else if (key == tarn::kKeyMetricID && value.is_bool()) {
      return failure("\"kKeyMetricID\" is a boolean, not a metric ID");
    } else {
      entry.record.append(std::string(key), plainValue(value));
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
  while (readLine(text)) {
    ++lineNumber_;
    if (isBlank(text)) continue;
    if (text.back() == '\r') text.pop_back();
    return Line{lineNumber_, parseMetricLogLine(text, limits_)};
  }
  return std::nullopt;
}

// Like std::getline, but keeps at most one byte past the limit, so that an overlong line is
// refused without being held whole.
bool MetricLogReader::readLine(std::string& text) {
  text.clear();
  const std::istream::sentry ready(input_, true);
  if (!ready) return false;
  std::streambuf& buffer = *input_.rdbuf();
  bool any = false;
  for (int c = buffer.sbumpc(); c != std::char_traits<char>::eof(); c = buffer.sbumpc()) {
    any = true;
    if (c == '\n') return true;
    if (text.size() <= limits_.lineBytes) text.push_back(static_cast<char>(c));
  }
  input_.setstate(any ? std::ios::eofbit : std::ios::eofbit | std::ios::failbit);
  return any;
}

bool MetricLogWriter::write(const platform::Dictionary& record,
                            std::optional<std::int64_t> deliveryMs) {
  const std::optional<std::string> line = formatMetricLogLine(record, deliveryMs);
  if (!line) return false;
  output_ << *line << '\n';
  return true;
}

}  // namespace tarn::log
