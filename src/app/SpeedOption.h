#pragma once

#include <charconv>
#include <cmath>
#include <optional>
#include <string_view>

namespace app {

// The value of a --speed option: a finite number above 0, or empty.
inline std::optional<double> parseSpeedFactor(std::string_view text) {
  double speed = 0.0;
  const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), speed);
  if (error != std::errc() || end != text.data() + text.size() || !std::isfinite(speed) ||
      !(speed > 0.0))
    return std::nullopt;
  return speed;
}

}  // namespace app
