#include "store/Dispatch.h"

#include <string>
#include <unordered_map>
#include <utility>

#include "platform/Log.h"
#include "store/Conversions.h"

namespace store {

namespace {

using platform::Dictionary;

// Runs the steps of one handler over the display dictionary it has just stored. Once its log
// line holds the dictionary, a step that changes it changes a copy.
class StepRunner {
 public:
  StepRunner(const Handler& handler, StoredDictionary& display, DisplayStore& store,
             const TimestampFormatter& formatTimestamp)
      : handler_(handler), display_(display), store_(store), formatTimestamp_(formatTimestamp) {}

  void operator()(const ConvertDisplayEntry& step) const {
    if (display().contains(step.conversion.key))
      convertEntry(mutableDictionary(display_), step.conversion, formatTimestamp_);
  }

  void operator()(const ReplaceWithTextForm& step) const {
    const platform::Value* found = display().find(step.key);
    if (found == nullptr || !hasShape(*found, step.shape)) return;
    std::string text = found->description();
    if (step.logText) platform::log::plain(text);
    *mutableDictionary(display_).find(step.key) = std::move(text);
  }

  void operator()(const LogDisplayDictionary&) const {
    platform::log::plainDescribed(handler_.logPrefix,
                                  std::shared_ptr<const Dictionary>(display_, &display()));
  }

  void operator()(const RefreshKeys& step) const {
    Dictionary& destination = step.destination(store_);
    Dictionary refreshed;
    refreshed.reserve(destination.size());
    for (const auto& [key, value] : destination) {
      const platform::Value* fresh = display().find(key);
      refreshed.append(key, fresh != nullptr ? *fresh : value);
    }
    for (const EntryConversion& conversion : step.conversions) {
      convertEntry(refreshed, conversion, formatTimestamp_);
    }
    destination = std::move(refreshed);
  }

  // Each metric of a kind brings rows of much the same shape, so the new rows are written over
  // the ones they replace and reuse their storage.
  void operator()(const CopyList& step) const {
    const platform::Value* source = display().find(step.key);
    if (source == nullptr || !hasShape(*source, ValueShape::DictionaryList)) return;
    const Dictionary& parent = step.parent(store_, display());
    const platform::List& elements = *source->asList();
    platform::List& rows = step.destination(store_);
    rows.resize(elements.size());
    for (std::size_t i = 0; i < elements.size(); ++i) {
      if (!rows[i].isDictionary()) rows[i] = Dictionary();
      Dictionary& row = *rows[i].asDictionary();
      row = *elements[i].asDictionary();
      for (const std::string_view key : step.parentKeys) {
        if (const platform::Value* inherited = parent.find(key))
          row.set(std::string(key), *inherited);
      }
      for (const EntryConversion& conversion : step.conversions) {
        convertEntry(row, conversion, formatTimestamp_);
      }
    }
  }

 private:
  const Dictionary& display() const { return **display_; }

  const Handler& handler_;
  StoredDictionary& display_;
  DisplayStore& store_;
  const TimestampFormatter& formatTimestamp_;
};

// A metric's list elements carry its own time, so within one metric the text of a time is
// made once.
class LastTimestampText {
 public:
  explicit LastTimestampText(const TimestampFormatter& formatTimestamp)
      : formatTimestamp_(formatTimestamp) {}

  std::optional<std::string> operator()(double milliseconds) {
    if (lastTime_ != milliseconds) {
      lastText_ = formatTimestamp_(milliseconds);
      lastTime_ = milliseconds;
    }
    return lastText_;
  }

 private:
  const TimestampFormatter& formatTimestamp_;
  std::optional<double> lastTime_;
  std::optional<std::string> lastText_;
};

const std::unordered_map<std::int64_t, const Handler*>& handlersByMetricID() {
  static const auto* const handlers = [] {
    auto* byID = new std::unordered_map<std::int64_t, const Handler*>;
    for (const auto table : {lteHandlers(), umtsHandlers(), gsmNasHandlers()}) {
      for (const Handler& handler : table)
        byID->emplace(handler.metricID, &handler);
    }
    return byID;
  }();
  return *handlers;
}

}  // namespace

const Handler* handlerFor(std::int64_t metricID) {
  const auto& handlers = handlersByMetricID();
  const auto found = handlers.find(metricID);
  return found == handlers.end() ? nullptr : found->second;
}

bool runHandler(const Handler& handler, const platform::Bytes* payload, DisplayStore& store,
                const TimestampFormatter& formatTimestamp, const DecodedObserver& observeDecoded) {
  std::optional<Dictionary> decoded = handler.decode(payload);
  if (!decoded) return false;
  StoredDictionary& stored = store.slot(handler.display);
  stored = std::make_shared<std::optional<Dictionary>>(std::move(decoded));
  if (observeDecoded) observeDecoded(**stored);
  LastTimestampText lastText(formatTimestamp);
  // Holds a reference only, so it needs no allocation.
  const TimestampFormatter formatEachTimeOnce = [&lastText](double milliseconds) {
    return lastText(milliseconds);
  };
  const StepRunner runStep(handler, stored, store, formatEachTimeOnce);
  for (const HandlerStep& step : handler.steps)
    std::visit(runStep, step);
  return true;
}

}  // namespace store
