#pragma once

#include <cstdint>
#include <optional>
#include <string>

#include "tarn/service/MetricSource.h"

namespace fleet {

// What the fleet page shows of one device: the latest of each, as text ready to show.
struct DeviceSummary {
  std::string status;      // "online", "offline", or empty before its status arrives
  std::string source;      // what produces its metrics, from its status
  std::string technology;  // "LTE", "UMTS", "GSM"
  std::string network;     // MCC-MNC, as "001-01"
  std::string cell;        // "PCI 355, cell 227775233", "PSC 42, cell 1234", "BSIC 12, cell 77"
  std::string band;        // "B3", "UARFCN 10700", "ARFCN 62"
  std::string levels;      // "RSRP -95 dBm, RSRQ -10.5 dB", "RSCP -80 dBm, Ec/No -7 dB"
  std::uint64_t metrics = 0;
  std::uint64_t refused = 0;
  std::uint64_t dropped = 0;  // by the device, while its broker was away
  // When its last metric arrived, in the fleet's clock.
  std::optional<std::int64_t> lastMetricMs;
};

// Takes what the metric says of the device's radio into `summary`, if anything.
void summarise(DeviceSummary& summary, const tarn::service::Metric& metric);

}  // namespace fleet
