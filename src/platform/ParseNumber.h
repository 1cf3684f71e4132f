#pragma once

#include <charconv>
#include <cmath>
#include <optional>
#include <string_view>

// Numbers given on a command line.
namespace platform {

// The whole of `text` as a `Number`, or empty: no sign for unsigned types, nothing left over.
template <class Number>
std::optional<Number> parseNumber(std::string_view text) {
  Number number{};
  const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
  if (error != std::errc() || end != text.data() + text.size()) return std::nullopt;
  return number;
}

// The value of a --speed option: a finite number above 0, or empty.
inline std::optional<double> parseSpeedFactor(std::string_view text) {
  const std::optional<double> speed = parseNumber<double>(text);
  if (!speed || !std::isfinite(*speed) || !(*speed > 0.0)) return std::nullopt;
  return speed;
}

}  // namespace platform
