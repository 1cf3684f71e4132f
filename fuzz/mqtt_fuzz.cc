// Feeds arbitrary MQTT messages to the fleet viewer, as any client of its broker could publish
// them: metric and status messages of any text, on any topic, and metrics whose payload is any
// bytes. Nothing may crash or hang, and the fleet's JSON stays JSON whatever the names and texts.
// The first byte picks the kind of message.
#include <boost/json/parse.hpp>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <string>
#include <string_view>

#include "fleet/Fleet.h"
#include "platform/Log.h"
#include "tarn/mqtt/PublishingSource.h"

namespace {

constexpr std::string_view kPrefix = "fleet";

[[noreturn]] void fail(const char* what) {
  std::fprintf(stderr, "%s\n", what);
  std::abort();
}

// The metrics the fleet page summarises, and one it passes over.
constexpr std::uint32_t kMetricIds[] = {0x3C40C2, 0x3CD301, 0x3C300C, 0x3CD102,
                                        0x3C2E0C, 0x3CD002, 0x3C4E04};

// A metric with any payload, as a device's publisher writes it.
void metricOfAnyPayload(fleet::Fleet& fleet, std::string_view input) {
  if (input.empty()) return;
  const std::uint32_t metricId =
      kMetricIds[static_cast<std::uint8_t>(input[0]) % std::size(kMetricIds)];
  input.remove_prefix(1);
  const tarn::service::Metric metric{metricId, platform::Bytes(input.begin(), input.end())};
  fleet.receive(std::string(kPrefix) + "/device/metrics",
                tarn::mqtt::metricMessage(metric, 0, "device", 0), 0);
  const auto json = boost::json::parse(fleet.json(0));
  const auto& device = json.at("devices").at(0);
  if (device.at("metrics").as_int64() != 1 || device.at("refused").as_int64() != 0)
    fail("a published metric was not taken");
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  static const platform::log::Silence silence;
  if (size == 0) return 0;
  const std::string_view input(reinterpret_cast<const char*>(data) + 1, size - 1);
  fleet::Fleet fleet{std::string(kPrefix)};
  switch (data[0] % 4) {
    case 0:
      fleet.receive("fleet/device/metrics", input, 0);
      break;
    case 1:
      fleet.receive("fleet/device/status", input, 0);
      break;
    case 2:
      metricOfAnyPayload(fleet, input);
      break;
    default: {
      // A topic up to the first NUL, then the message.
      const std::size_t end = std::min(input.find('\0'), input.size());
      fleet.receive(input.substr(0, end), input.substr(std::min(end + 1, input.size())), 0);
      break;
    }
  }
  boost::system::error_code error;
  (void)boost::json::parse(fleet.json(1000), error);
  if (error) fail("the fleet's JSON does not parse");
  return 0;
}
