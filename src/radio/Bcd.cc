#include "radio/Bcd.h"

#include <algorithm>
#include <vector>

namespace radio {
namespace {

std::uint8_t nibbleAt(std::span<const std::uint8_t> bytes, std::size_t index) {
  const std::uint8_t byte = bytes[index / 2];
  return index % 2 == 0 ? byte & 0x0F : static_cast<std::uint8_t>(byte >> 4);
}

}  // namespace

bool isDigits(std::string_view text) {
  return !text.empty() &&
         std::all_of(text.begin(), text.end(), [](char c) { return c >= '0' && c <= '9'; });
}

std::optional<std::string> decodeSwappedBcd(std::span<const std::uint8_t> bytes,
                                            std::size_t firstNibble) {
  std::string digits;
  bool filled = false;
  for (std::size_t index = firstNibble; index < 2 * bytes.size(); ++index) {
    const std::uint8_t nibble = nibbleAt(bytes, index);
    if (nibble == kFillerNibble) {
      filled = true;
    } else if (nibble > 9 || filled) {
      return std::nullopt;
    } else {
      digits.push_back(static_cast<char>('0' + nibble));
    }
  }
  return digits;
}

platform::Bytes packNibbles(std::span<const std::uint8_t> nibbles, std::size_t size) {
  platform::Bytes bytes(size, 0xFF);
  for (std::size_t index = 0; index < nibbles.size() && index / 2 < size; ++index) {
    std::uint8_t& byte = bytes[index / 2];
    byte = index % 2 == 0 ? static_cast<std::uint8_t>((byte & 0xF0) | nibbles[index])
                          : static_cast<std::uint8_t>((byte & 0x0F) | (nibbles[index] << 4));
  }
  return bytes;
}

std::optional<platform::Bytes> encodeSwappedBcd(std::string_view digits, std::size_t size) {
  if (!isDigits(digits) || digits.size() > 2 * size) return std::nullopt;
  std::vector<std::uint8_t> nibbles;
  for (const char digit : digits)
    nibbles.push_back(static_cast<std::uint8_t>(digit - '0'));
  return packNibbles(nibbles, size);
}

}  // namespace radio
