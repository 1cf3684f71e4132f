#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <variant>

#include "platform/Value.h"
#include "store/DisplayDictionaries.h"
#include "store/MetricValidator.h"

// What the detail screen shows for each category key: the launch item name, one space, and the
// first-level item name ("LTE CA Status").
namespace screens {

// One display dictionary, a row per entry.
struct DictionaryCategory {
  store::DisplayDictionary dictionary;
};

// The reselection dictionary of a list record, a row per entry.
struct RecordDictionaryCategory {
  const platform::Dictionary& (*read)(const store::MetricValidator&);
};

// A list of dictionaries, a section per element (only element 0 when `firstOnly`), a row per
// entry of the element.
struct ListCategory {
  const platform::List& (*read)(const store::MetricValidator&);
  // Section s is titled this followed by s; no header without it.
  std::optional<std::string_view> headerPrefix;
  bool firstOnly = false;
};

using Category = std::variant<DictionaryCategory, RecordDictionaryCategory, ListCategory>;

// Null for a key without data behind it (the two identity items, or anything else).
const Category* categoryFor(std::string_view key);

}  // namespace screens
