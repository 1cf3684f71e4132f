#include "messages/EnumNames.h"

#include <algorithm>

#include "platform/Format.h"

namespace messages {

std::optional<std::string_view> enumName(std::span<const EnumName> table, std::int32_t value) {
  // Most tables run 0, 1, 2, ... without gaps, so try the direct slot first.
  if (value >= 0 && static_cast<std::size_t>(value) < table.size() &&
      table[static_cast<std::size_t>(value)].value == value) {
    return table[static_cast<std::size_t>(value)].name;
  }
  const auto found =
      std::lower_bound(table.begin(), table.end(), value,
                       [](const EnumName& row, std::int32_t v) { return row.value < v; });
  if (found == table.end() || found->value != value) return std::nullopt;
  return found->name;
}

platform::Value enumText(std::optional<std::string_view> name, std::int32_t value) {
  if (name) return platform::Value(*name);
  return platform::Value(platform::format("(unknown: %i)", value));
}

}  // namespace messages
