#pragma once

#include <optional>
#include <string_view>

#include "platform/Value.h"
#include "series/SeriesStore.h"
#include "store/MetricValidator.h"

namespace dashboard {

// A technology is current while its serving level keeps arriving: the one whose level came
// last, unless that was longer ago than this.
inline constexpr std::int64_t kServingLevelStaleMs = 10'000;

struct ServingLevel {
  std::string_view technology;  // "LTE", "UMTS" or "GSM"
  std::string_view series;      // its level: "lte.rsrp", "umts.rscp" or "gsm.rxlev"
  series::Sample sample;
};

// Empty with no service, or before the first measurement.
std::optional<ServingLevel> servingLevel(const series::SeriesStore& series);

// GET /api/dashboard: the serving cell of the current technology, its levels, the carriers and
// the subscriber, read from the store as it is now.
//   {"technology": "LTE" or null,
//    "rows": [{"label": "RRC state", "value": "CONNECTED"}, {"label": "Band", "value": "3"}, ...],
//    "levels": [{"name": "lte.rsrp", "label": "RSRP", "value": -95.0, "unit": "dBm",
//                "quality": "good" or null}, ...],
//    "carriers": [{"index": 1, "state": "ACTIVATED", "pci": 7, "earfcn": 1300, "band": "3",
//                  "downlink": "1815.0 MHz", "bandwidth": "20.0 MHz", "rsrp": -95,
//                  "rsrq": -11.5}, ...],
//    "subscriber": {"imsi": "001010123456789", "mcc": "001", "mnc": "01",
//                   "msin": "0123456789", "iccid": "8949..."} or null}
// A number that no band holds is shown as it is, with no band or frequency.
platform::Dictionary dashboardCard(const store::MetricValidator& intake,
                                   const series::SeriesStore& series);

}  // namespace dashboard
