#pragma once

#include <cstdint>
#include <optional>
#include <span>
#include <string_view>

#include "platform/Value.h"

namespace messages {

// One row of an enumeration's name table; tables are sorted by value.
struct EnumName {
  std::int32_t value;
  std::string_view name;
};

// The name of `value` in `table`, or nothing when the table has none for it.
std::optional<std::string_view> enumName(std::span<const EnumName> table, std::int32_t value);

// What a dictionary shows for an enum: its name, or "(unknown: %i)".
platform::Value enumText(std::optional<std::string_view> name, std::int32_t value);

}  // namespace messages
