#pragma once

#include <charconv>
#include <concepts>
#include <cstddef>
#include <cstdint>
#include <string>

namespace platform {

// The most characters writeDecimal writes: 20 digits of 2^64 - 1, or a sign and 19 digits.
inline constexpr std::size_t kDecimalCapacity = 20;
// The most characters writeShortestFloat writes, with room to spare.
inline constexpr std::size_t kShortestFloatCapacity = 32;

// Writes the value at `at`, which has room for kDecimalCapacity characters; returns the end.
template <std::integral T>
char* writeDecimal(char* at, T value) {
  return std::to_chars(at, at + kDecimalCapacity, value).ptr;
}

template <std::integral T>
void appendDecimal(std::string& out, T value) {
  char digits[kDecimalCapacity];
  out.append(digits, writeDecimal(digits, value));
}

// The shortest text that reads back to the same value of the argument's own type, always
// marked as a floating value: "5.0", "-11.75", "1e+20". Non-finite values are "inf", "-inf"
// and "nan". Written at `at`, which has room for kShortestFloatCapacity characters; returns the
// end.
char* writeShortestFloat(char* at, float value);
char* writeShortestFloat(char* at, double value);

template <std::floating_point F>
void appendShortestFloat(std::string& out, F value) {
  char text[kShortestFloatCapacity];
  out.append(text, writeShortestFloat(text, value));
}

// Two lowercase hexadecimal digits.
void appendHexByte(std::string& out, unsigned char byte);

// How many characters writeHex writes for `size` bytes.
constexpr std::size_t hexLength(std::size_t size, std::size_t group) {
  if (size == 0) return 0;
  return 2 * size + (group == 0 ? 0 : (size - 1) / group);
}

// Lowercase hexadecimal digits of a byte run, with a space after every `group` bytes when
// `group` is not 0; returns the end.
char* writeHex(char* at, const std::uint8_t* bytes, std::size_t size, std::size_t group);

// As writeHex, appended in one step: payloads can be long and are written into every metric's
// log line.
void appendHex(std::string& out, const std::uint8_t* bytes, std::size_t size, std::size_t group);

}  // namespace platform
