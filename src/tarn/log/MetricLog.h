#pragma once

#include <cstddef>
#include <cstdint>
#include <istream>
#include <optional>
#include <ostream>
#include <string>
#include <string_view>

#include "platform/Value.h"

// Metric logs: JSON Lines, one metric record per line, as docs/metric-log.md describes.
//
//   {"kKeyMetricID":3952132,"kKeyPayload":"CICw3vfTKxAD","kKeyProfileID":7,"kKeyAppID":2,"t_ms":250}
namespace tarn::log {

struct MetricLogEntry {
  // The metric record as the session delivers it: "kKeyPayload" as bytes, the other keys as
  // they stand in the line.
  platform::Dictionary record;
  // "t_ms": when the record was delivered, in milliseconds from the start of the log.
  std::optional<std::int64_t> deliveryMs;
};

// A parsed line, or what is wrong with it.
struct ParsedLine {
  std::optional<MetricLogEntry> entry;
  std::string error;
};

// What a line may hold. A line of the log holds five keys and a payload of a few kilobytes; the
// limits keep a broken or hostile log from taking the reader's time and memory.
struct MetricLogLimits {
  std::size_t lineBytes = 1024 * 1024;
  // Keys of the line's object and of any object inside it, together.
  std::size_t keys = 64;
};

// Refuses a line that is longer or has more keys than `limits` allow, is no JSON object, whose
// "kKeyMetricID" is a boolean, whose "kKeyPayload" is no standard base64 text, or whose "t_ms"
// is no finite number of at least 0 (a fraction is rounded down). Nothing else is checked here:
// a record without an integer "kKeyMetricID" is the intake's to judge. Takes time in proportion
// to the line's length.
ParsedLine parseMetricLogLine(std::string_view line, const MetricLogLimits& limits = {});

// The line for a record, without its newline; empty when the record has no integer
// "kKeyMetricID" or no byte "kKeyPayload". Integer "kKeyProfileID" and "kKeyAppID" are kept,
// other keys are not.
std::optional<std::string> formatMetricLogLine(const platform::Dictionary& record,
                                               std::optional<std::int64_t> deliveryMs = {});
// The same line with the entries of `tail` after its own keys, such as the device that published
// the record and when. A reader takes them into the record as other keys.
std::optional<std::string> formatMetricLogLine(const platform::Dictionary& record,
                                               std::optional<std::int64_t> deliveryMs,
                                               const platform::Dictionary& tail);

// Reads a log line by line. Blank lines are passed over; a line may end in CR LF.
class MetricLogReader {
 public:
  struct Line {
    std::size_t number;  // from 1
    ParsedLine parsed;
  };

  explicit MetricLogReader(std::istream& input, MetricLogLimits limits = {})
      : input_(input), limits_(limits) {}

  // The next line that is not blank; empty at the end of the input or when reading failed. Of a
  // line longer than the limit, no more than the limit is kept in memory.
  std::optional<Line> next();
  // Whether the input ended in a read error rather than at its end.
  bool failed() const { return input_.bad(); }

 private:
  bool readLine(std::string& text);

  std::istream& input_;
  const MetricLogLimits limits_;
  std::size_t lineNumber_ = 0;
  std::string line_;  // kept, so that its memory serves the next line
};

class MetricLogWriter {
 public:
  explicit MetricLogWriter(std::ostream& output) : output_(output) {}

  // False, writing nothing, for a record that formatMetricLogLine refuses.
  bool write(const platform::Dictionary& record, std::optional<std::int64_t> deliveryMs = {});

 private:
  std::ostream& output_;
};

}  // namespace tarn::log
