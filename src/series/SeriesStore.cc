#include "series/SeriesStore.h"

#include <algorithm>
#include <chrono>
#include <stdexcept>
#include <string>

#include "store/MetricValidator.h"

namespace series {

namespace {

using platform::Value;

// A value as a number in the series' unit, after the feed's rule if it has one.
std::optional<double> numberOf(const Value& value, const Feed& feed) {
  if (!feed.rule) return value.asDouble();
  static const store::TimestampFormatter noDates = [](double) { return std::nullopt; };
  const std::optional<Value> converted = store::convertValue(*feed.rule, value, noDates);
  if (!converted) return std::nullopt;
  return converted->asDouble();
}

// Folds the candidates of one feed into the value it picks.
class Picker {
 public:
  explicit Picker(const Feed& feed) : feed_(feed) {}

  // False once the pick is made and later candidates cannot change it.
  bool offer(const Value& candidate) {
    const std::optional<double> number = numberOf(candidate, feed_);
    if (!number) return true;
    if (!picked_ || *number > *picked_) picked_ = number;
    return feed_.pick == Pick::Strongest;
  }

  // A value that is a list of numbers offers each of them.
  bool offerAll(const Value& value) {
    if (const platform::List* numbers = value.asList()) {
      for (const Value& number : *numbers)
        if (!offer(number)) return false;
      return true;
    }
    return offer(value);
  }

  std::optional<double> picked() const { return picked_; }

 private:
  const Feed& feed_;
  std::optional<double> picked_;
};

bool isPicked(const platform::Dictionary& row, const Feed& feed) {
  if (feed.pick != Pick::Indexed) return true;
  const Value* index = row.find("index");
  return index != nullptr && index->asInteger() == feed.index;
}

std::optional<double> valueOf(const Feed& feed, const store::MetricValidator& intake) {
  const std::optional<platform::Dictionary>& display = intake.displayDictionary(feed.metric);
  if (!display) return std::nullopt;
  Picker picker(feed);
  if (feed.rows == nullptr) {
    if (const Value* value = display->find(feed.key)) picker.offerAll(*value);
    return picker.picked();
  }
  const Value* carried = display->find(feed.carriedBy);
  if (carried == nullptr || !store::hasShape(*carried, store::ValueShape::DictionaryList))
    return std::nullopt;
  for (const Value& row : feed.rows(intake)) {
    const platform::Dictionary* fields = row.asDictionary();
    if (fields == nullptr || !isPicked(*fields, feed)) continue;
    const Value* value = fields->find(feed.key);
    if (value != nullptr && !picker.offer(*value)) break;
  }
  return picker.picked();
}

}  // namespace

std::int64_t systemClockMs() {
  return std::chrono::duration_cast<std::chrono::milliseconds>(
             std::chrono::system_clock::now().time_since_epoch())
      .count();
}

SeriesStore::SeriesStore(Clock clock, std::size_t capacity) : clock_(std::move(clock)) {
  const std::span<const SeriesDefinition> definitions = seriesDefinitions();
  rings_.reserve(definitions.size());
  for (std::size_t i = 0; i < definitions.size(); ++i)
    rings_.emplace_back(capacity);
  const std::span<const Feed> all = feeds();
  for (std::size_t feed = 0; feed < all.size(); ++feed) {
    const auto found =
        std::find_if(definitions.begin(), definitions.end(),
                     [&](const auto& series) { return series.name == all[feed].series; });
    if (found == definitions.end())
      throw std::logic_error("a feed names no series: " + std::string(all[feed].series));
    routes_[static_cast<std::size_t>(all[feed].metric)].push_back(
        {feed, static_cast<std::size_t>(found - definitions.begin())});
  }
}

void SeriesStore::storeDidUpdate(store::DisplayDictionary replaced,
                                 const store::MetricValidator& intake) {
  const std::vector<Route>& routes = routes_[static_cast<std::size_t>(replaced)];
  if (routes.empty()) return;
  const std::int64_t now = clock_();
  for (const Route& route : routes) {
    if (const std::optional<double> value = valueOf(feeds()[route.feed], intake))
      append(route.series, now, *value);
  }
}

void SeriesStore::clear() {
  for (SampleRing& ring : rings_)
    ring = SampleRing(ring.capacity());
}

void SeriesStore::append(std::size_t series, std::int64_t timeMs, double value) {
  SampleRing& ring = rings_[series];
  ring.append(timeMs, static_cast<float>(value));
  if (listeners_.empty()) return;
  const Sample appended = *ring.latest();
  for (const AppendListener& listener : listeners_)
    listener(seriesDefinitions()[series].name, appended);
}

const SeriesDefinition* SeriesStore::definition(std::string_view name) const {
  for (const SeriesDefinition& series : seriesDefinitions())
    if (series.name == name) return &series;
  return nullptr;
}

const SampleRing* SeriesStore::ring(std::string_view name) const {
  const SeriesDefinition* found = definition(name);
  return found == nullptr ? nullptr
                          : &rings_[static_cast<std::size_t>(found - seriesDefinitions().data())];
}

std::optional<Sample> SeriesStore::latest(std::string_view name) const {
  const SampleRing* found = ring(name);
  return found == nullptr ? std::nullopt : found->latest();
}

std::optional<SampleRange> SeriesStore::since(std::string_view name, std::int64_t sinceMs) const {
  const SampleRing* found = ring(name);
  if (found == nullptr) return std::nullopt;
  return found->since(sinceMs);
}

}  // namespace series
