#pragma once

#include <cstdint>
#include <optional>
#include <span>
#include <string_view>

#include "platform/Value.h"
#include "store/DisplayDictionaries.h"
#include "store/EntryRules.h"
#include "store/MetricValidator.h"

// What the graphs draw: each series is a row of one table, and each way a value reaches a series
// is a row of another. Values are read from the store after a metric's conversion, so a graph
// shows what the table screens show.
namespace series {

struct SeriesDefinition {
  std::string_view name;   // what the API and alerts call it, e.g. "lte.rsrp"
  std::string_view label;  // the legend, e.g. "LTE RSRP"
  std::string_view unit;   // "dBm" or "dB"
  std::string_view graph;  // the dashboard graph that draws it
};

// How a feed picks one value out of the rows it reads.
enum class Pick {
  First,      // the first row that has the key: the one the detail screen shows first
  Strongest,  // the largest value of any row, e.g. the strongest neighbour
  Indexed,    // the row whose "index" is Feed::index, e.g. one secondary carrier
};

// A row list of the store.
using RowsOf = const platform::List& (*)(const store::MetricValidator&);

// One way a value reaches a series: after a metric of kind `metric` was stored, read `key` from
// the display dictionary it replaced, or from one of the store's row lists.
struct Feed {
  std::string_view series;
  store::DisplayDictionary metric;
  std::string_view key;
  // Null to read the display dictionary itself. A metric that does not carry the list under
  // `carriedBy` leaves the row list as it was, and so brings no new value.
  RowsOf rows = nullptr;
  std::string_view carriedBy = {};
  Pick pick = Pick::First;
  std::int64_t index = 0;
  // For entries the store keeps as the baseband sends them (UMTS serving levels as indexes,
  // carrier SNR in hundredths of a dB): the store's rule for entries of that kind elsewhere.
  std::optional<store::EntryRule> rule = std::nullopt;
};

std::span<const SeriesDefinition> seriesDefinitions();
std::span<const Feed> feeds();

}  // namespace series
