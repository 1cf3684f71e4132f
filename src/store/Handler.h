#pragma once

#include <cstdint>
#include <optional>
#include <span>
#include <string_view>
#include <variant>

#include "messages/Metrics.h"
#include "platform/Log.h"
#include "platform/Value.h"
#include "store/DisplayStore.h"
#include "store/EntryRules.h"

// A metric handler is data: the record class its payload decodes with, the display dictionary
// it replaces, its log prefix and the steps that follow the store. One interpreter
// (Dispatch.h) runs them all.
namespace store {

// Rewrites one entry of the stored display dictionary.
struct ConvertDisplayEntry {
  EntryConversion conversion;
};

// Replaces an entry of the display dictionary that has the given shape by its text form
// ("[3, 7]", "[\"mcc\": 1]"), and logs that text when asked to.
struct ReplaceWithTextForm {
  std::string_view key;
  ValueShape shape;
  bool logText = false;
};

// Logs the handler's prefix followed by the text form of the display dictionary.
struct LogDisplayDictionary {};

// Refreshes a fixed-key dictionary of the store key by key: each of its keys that the display
// dictionary holds takes that value; the others keep theirs. Then rewrites its entries.
struct RefreshKeys {
  platform::Dictionary& (*destination)(DisplayStore&);
  std::span<const EntryConversion> conversions = {};
};

// The dictionary whose entries list elements take over: the display dictionary, or one of the
// store's.
using ParentOf = const platform::Dictionary& (*)(DisplayStore&,
                                                 const platform::Dictionary& display);

// Replaces a row list of the store by the elements of a list of the display dictionary. A key
// that is missing or holds no list of dictionaries leaves the row list as it was. Each element
// takes over the parent's entries under parentKeys (those it has), then has its entries
// rewritten in order.
struct CopyList {
  std::string_view key;
  platform::List& (*destination)(DisplayStore&);
  ParentOf parent;
  std::span<const std::string_view> parentKeys = {};
  std::span<const EntryConversion> conversions = {};
};

using HandlerStep = std::variant<ConvertDisplayEntry, ReplaceWithTextForm, LogDisplayDictionary,
                                 RefreshKeys, CopyList>;

struct Handler {
  std::int64_t metricID;
  // The display dictionary of the payload; empty, after a log line, when it does not decode.
  std::optional<platform::Dictionary> (*decode)(const platform::Bytes* payload);
  DisplayDictionary display;
  std::string_view logPrefix;
  std::span<const HandlerStep> steps;
};

template <class Record>
std::optional<platform::Dictionary> decodeDisplayDictionary(const platform::Bytes* payload) {
  if (const auto record = Record::initWithData(payload)) return record->dictionaryRepresentation();
  platform::log::plainf("The payload (%zu bytes) does not decode as %s; keeping the previous data",
                        payload == nullptr ? std::size_t{0} : payload->size(),
                        Record().className());
  return std::nullopt;
}

// The handler of the metric that carries `Record`: its ID comes from the schemas.
template <class Record>
constexpr Handler recordHandler(DisplayDictionary display, std::string_view logPrefix,
                                std::span<const HandlerStep> steps) {
  return {messages::MetricOf<Record>::id, &decodeDisplayDictionary<Record>, display, logPrefix,
          steps};
}

// A field of one of the store's records, e.g. storeField<&DisplayStore::myLTE, &LTE::TxPower>.
template <auto record, auto field>
auto& storeField(DisplayStore& store) {
  return (store.*record).*field;
}

inline const platform::Dictionary& displayDictionary(DisplayStore&,
                                                     const platform::Dictionary& display) {
  return display;
}

template <auto record>
const platform::Dictionary& reselectionInfoOf(DisplayStore& store, const platform::Dictionary&) {
  return (store.*record).SelReselCellInfo;
}

// The steps most handlers share.
inline constexpr EntryConversion kTimestampText{"timestamp", EntryRule::TimestampText};
inline constexpr HandlerStep kTimestampThenLog[] = {ConvertDisplayEntry{kTimestampText},
                                                    LogDisplayDictionary{}};
inline constexpr std::string_view kTimestampKey[] = {"timestamp"};

}  // namespace store
