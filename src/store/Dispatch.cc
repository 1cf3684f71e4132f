#include "store/Dispatch.h"

#include <array>
#include <span>
#include <stdexcept>
#include <string>
#include <unordered_map>
#include <utility>

#include "platform/Log.h"
#include "store/Conversions.h"

namespace store {

namespace {

using platform::Dictionary;

// The entries that each row of a list takes over from its parent: the parent's entries under
// the step's parent keys, rewritten by the step's conversions of their keys once for all rows.
// A row is its element with these in place of the element's own entries of the same keys, and
// those the element lacks after its own; one that a conversion drops is in no row.
class InheritedEntries {
 public:
  InheritedEntries(const CopyList& step, const Dictionary& parent,
                   const TimestampFormatter& formatTimestamp) {
    if (step.parentKeys.size() > kMost) throw std::logic_error("a row takes over too many keys");
    for (const std::string_view key : step.parentKeys) {
      const platform::Value* value = parent.find(key);
      if (value == nullptr) continue;
      Inherited& entry = entries_[count_++];
      entry.key = key;
      entry.value = value;
      for (const EntryConversion& conversion : step.conversions) {
        if (conversion.key != key || entry.value == nullptr) continue;
        std::optional<platform::Value> converted =
            convertValue(conversion.rule, *entry.value, formatTimestamp);
        if (!converted) continue;
        entry.converted = std::move(*converted);
        entry.value = entry.converted.isNull() ? nullptr : &entry.converted;
      }
    }
  }

  bool holds(std::string_view key) const { return find(key) != nullptr; }

  void writeRow(const Dictionary& element, Dictionary& row) const {
    std::size_t written = 0;
    const auto write = [&row, &written](std::string_view key, const platform::Value* value) {
      if (value != nullptr) row.writeOver(written++, key, *value);
    };
    for (const auto& [key, value] : element) {
      const Inherited* entry = find(key);
      write(key, entry != nullptr ? entry->value : &value);
    }
    for (const Inherited& entry : entries()) {
      if (!element.contains(entry.key)) write(entry.key, entry.value);
    }
    row.truncate(written);
  }

 private:
  // More than the handlers' rows take over.
  static constexpr std::size_t kMost = 4;

  struct Inherited {
    std::string_view key;
    const platform::Value* value = nullptr;  // null when dropped
    platform::Value converted;
  };

  std::span<const Inherited> entries() const { return {entries_.data(), count_}; }

  const Inherited* find(std::string_view key) const {
    for (const Inherited& entry : entries()) {
      if (entry.key == key) return &entry;
    }
    return nullptr;
  }

  std::array<Inherited, kMost> entries_;
  std::size_t count_ = 0;
};

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
    const InheritedEntries inherited(step, step.parent(store_, display()), formatTimestamp_);
    const platform::List& elements = *source->asList();
    platform::List& rows = step.destination(store_);
    rows.resize(elements.size());
    for (std::size_t i = 0; i < elements.size(); ++i) {
      if (!rows[i].isDictionary()) rows[i] = Dictionary();
      Dictionary& row = *rows[i].asDictionary();
      inherited.writeRow(*elements[i].asDictionary(), row);
      for (const EntryConversion& conversion : step.conversions) {
        if (!inherited.holds(conversion.key)) convertEntry(row, conversion, formatTimestamp_);
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
