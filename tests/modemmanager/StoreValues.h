#pragma once

#include <algorithm>
#include <cstddef>
#include <optional>
#include <span>
#include <string_view>

#include "platform/Value.h"
#include "store/MetricValidator.h"
#include "store/StoreDump.h"

// Numbers in a store named by their path in its dump, for tables of expected values.
namespace mmtest {

// What the store shows at `path`: keys of its dump joined by '/', taking the first row of a list.
inline std::optional<platform::Value> valueAt(const store::MetricValidator& store,
                                              std::string_view path) {
  platform::Value value = store::dumpStore(store);
  for (std::size_t start = 0; !path.empty() && start <= path.size();) {
    const std::size_t slash = std::min(path.find('/', start), path.size());
    const std::string_view key = path.substr(start, slash - start);
    start = slash + 1;
    const platform::List* list = value.asList();
    const platform::Value& whole = list != nullptr && !list->empty() ? list->at(0) : value;
    const platform::Dictionary* dictionary = whole.asDictionary();
    const platform::Value* found = dictionary != nullptr ? dictionary->find(key) : nullptr;
    if (found == nullptr) return std::nullopt;
    value = platform::Value(*found);  // a copy: `found` lies within `value`
  }
  return value;
}

// The number the store shows at `path`.
inline std::optional<double> shownAt(const store::MetricValidator& store, std::string_view path) {
  const std::optional<platform::Value> value = valueAt(store, path);
  return value ? value->asDouble() : std::nullopt;
}

struct Shown {
  std::string_view path;
  double expected;
};

// Whether the store shows every one of `values`.
inline bool showsAll(const store::MetricValidator& store, std::span<const Shown> values) {
  for (const Shown& value : values) {
    if (shownAt(store, value.path) != value.expected) return false;
  }
  return true;
}

}  // namespace mmtest
