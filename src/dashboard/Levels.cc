#include "dashboard/Levels.h"

namespace dashboard {

namespace {

constexpr LevelRange kLevels[] = {
    {"lte.rsrp", "RSRP", -80, -90, -100},      {"lte.rsrq", "RSRQ", -10, -15, -20},
    {"lte.sinr", "SINR", 20, 13, 0},           {"umts.rscp", "RSCP", -70, -85, -100},
    {"umts.ecno", "Ec/No", -6, -10, -20},      {"umts.rssi", "RSSI", -65, -75, -85},
    {"gsm.rxlev", "RxLev", -70, -85, -100},    {"lte.tx_power", "TX power", {}, {}, {}},
    {"umts.tx_power", "TX power", {}, {}, {}}, {"gsm.tx_power", "TX power", {}, {}, {}},
};

const LevelRange* rangeOf(std::string_view series) {
  for (const LevelRange& range : kLevels)
    if (range.series == series) return &range;
  return nullptr;
}

}  // namespace

std::optional<std::string_view> qualityOf(std::string_view series, double value) {
  const LevelRange* range = rangeOf(series);
  if (range == nullptr || !range->excellent) return std::nullopt;
  if (value >= *range->excellent) return "excellent";
  if (value >= *range->good) return "good";
  if (value >= *range->fair) return "fair";
  return "poor";
}

std::string_view levelLabel(std::string_view series) {
  const LevelRange* range = rangeOf(series);
  return range == nullptr ? series : range->label;
}

}  // namespace dashboard
