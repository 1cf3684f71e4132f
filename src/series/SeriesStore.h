#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <optional>
#include <span>
#include <string_view>
#include <vector>

#include "series/SampleRing.h"
#include "series/SeriesTable.h"
#include "store/DisplayDictionaries.h"

namespace store {
class MetricValidator;
}

// The time series of every value the dashboard graphs, kept beside the display store on the
// main queue: one fixed-size ring per series, taken when the store is made, so its memory is
// bounded by design and appending never allocates. Not thread-safe: read it on the main queue.
namespace series {

// Milliseconds since 1970.
using Clock = std::function<std::int64_t()>;
std::int64_t systemClockMs();

class SeriesStore {
 public:
  // An hour of the fastest series (GSM dedicated measurements every 480 ms) and some to spare.
  static constexpr std::size_t kCapacity = 8192;

  explicit SeriesStore(Clock clock = &systemClockMs, std::size_t capacity = kCapacity);

  // For the intake's store observer: after a metric replaced `replaced` and its conversion is
  // done, appends each value that metric brings, at the clock's time.
  void storeDidUpdate(store::DisplayDictionary replaced, const store::MetricValidator& intake);

  // Every series in table order, whether or not it holds samples yet.
  std::span<const SeriesDefinition> definitions() const { return seriesDefinitions(); }
  // Null for a name that is no series.
  const SeriesDefinition* definition(std::string_view name) const;

  // The latest sample; empty for an unknown name or a series without samples yet.
  std::optional<Sample> latest(std::string_view name) const;
  // The samples at or after `sinceMs`, oldest first, valid until the next append; empty for an
  // unknown name.
  std::optional<SampleRange> since(std::string_view name, std::int64_t sinceMs) const;
  // Forgets every sample, as before the first metric: a replay that seeks starts over.
  void clear();

  // How many samples a series holds at most.
  std::size_t capacity() const { return rings_.front().capacity(); }

  // Called for each sample appended, after the append, with the series' name.
  using AppendListener = std::function<void(std::string_view name, Sample sample)>;
  void addAppendListener(AppendListener listener) { listeners_.push_back(std::move(listener)); }

  // The clock the samples are stamped with.
  std::int64_t now() const { return clock_(); }

 private:
  const SampleRing* ring(std::string_view name) const;
  void append(std::size_t series, std::int64_t timeMs, double value);

  Clock clock_;
  std::vector<SampleRing> rings_;  // one per definition, in table order
  // By kind of metric, the feeds it triggers: indexes into feeds(), and the ring of each.
  struct Route {
    std::size_t feed;
    std::size_t series;
  };
  std::array<std::vector<Route>, store::kDisplayDictionaryCount> routes_;
  std::vector<AppendListener> listeners_;
};

}  // namespace series
