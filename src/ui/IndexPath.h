#pragma once

#include <compare>
#include <cstddef>

namespace ui {

// One row of a table: its section, and its row within that section.
struct IndexPath {
  std::size_t section = 0;
  std::size_t row = 0;

  auto operator<=>(const IndexPath&) const = default;
};

}  // namespace ui
