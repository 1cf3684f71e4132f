// Feeds arbitrary text to the metric-log reader, as a whole log and as one line. A broken or
// hostile log must never crash, hang or take more than its limits allow, and what a line gives
// must survive being written and read again.
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <sstream>
#include <string_view>

#include "platform/Log.h"
#include "tarn/log/MetricLog.h"

namespace {

[[noreturn]] void fail(const char* what) {
  std::fprintf(stderr, "%s\n", what);
  std::abort();
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  static const platform::log::Silence silence;
  const std::string_view text(reinterpret_cast<const char*>(data), size);
  const tarn::log::MetricLogLimits limits{.lineBytes = 4096, .keys = 16};

  std::istringstream log{std::string(text)};
  tarn::log::MetricLogReader reader(log, limits);
  std::size_t lastNumber = 0;
  while (const auto line = reader.next()) {
    if (line->number <= lastNumber) fail("line numbers do not increase");
    lastNumber = line->number;
  }

  const tarn::log::ParsedLine parsed = tarn::log::parseMetricLogLine(text, limits);
  if (!parsed.entry) {
    if (parsed.error.empty()) fail("a refused line without a reason");
    return 0;
  }
  if (parsed.entry->deliveryMs && *parsed.entry->deliveryMs < 0) fail("a negative t_ms");
  const auto written =
      tarn::log::formatMetricLogLine(parsed.entry->record, parsed.entry->deliveryMs);
  if (!written) return 0;
  const tarn::log::ParsedLine again = tarn::log::parseMetricLogLine(*written);
  if (!again.entry) fail("a written line does not read back");
  if (again.entry->deliveryMs != parsed.entry->deliveryMs) fail("t_ms changed on the way");
  if (*again.entry->record.find("kKeyPayload") != *parsed.entry->record.find("kKeyPayload"))
    fail("the payload changed on the way");
  return 0;
}
