#pragma once

#include <optional>
#include <string_view>

// The usual quality ranges of the levels the serving-cell card colours.
namespace dashboard {

struct LevelRange {
  std::string_view series;  // e.g. "lte.rsrp"
  std::string_view label;   // what the card calls it, e.g. "RSRP"
  // The lowest value of each class; below `fair` is poor. No classes for transmit power.
  std::optional<double> excellent, good, fair;
};

// "excellent", "good", "fair" or "poor"; empty for a level without ranges or an unknown series.
std::optional<std::string_view> qualityOf(std::string_view series, double value);

// The card's name for a series; the series' own name when the table has none.
std::string_view levelLabel(std::string_view series);

}  // namespace dashboard
