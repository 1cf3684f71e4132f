#pragma once

#include <charconv>
#include <concepts>
#include <cstddef>
#include <cstdint>
#include <string>

namespace platform {

template <std::integral T>
void appendDecimal(std::string& out, T value) {
  char digits[24];
  const auto result = std::to_chars(digits, digits + sizeof digits, value);
  out.append(digits, result.ptr);
}

// The shortest text that reads back to the same value of the argument's own type, always
// marked as a floating value: "5.0", "-11.75", "1e+20". Non-finite values are "inf", "-inf"
// and "nan".
void appendShortestFloat(std::string& out, float value);
void appendShortestFloat(std::string& out, double value);

// Two lowercase hexadecimal digits.
void appendHexByte(std::string& out, unsigned char byte);

// Lowercase hexadecimal digits of a byte run, with a space after every
// `group` bytes when `group` is not 0. Sized once: payloads can be long and
// are written into every metric's log line.
void appendHex(std::string& out, const std::uint8_t* bytes, std::size_t size, std::size_t group);

}  // namespace platform
