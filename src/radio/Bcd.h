#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>

#include "platform/Value.h"

// Swapped-nibble BCD, the digit coding of SIM files and NAS identities: two digits a byte, the
// earlier digit in the low nibble, unused nibbles filled with 0xF.
namespace radio {

inline constexpr std::uint8_t kFillerNibble = 0xF;

// True when `text` is not empty and holds only the digits 0 to 9.
bool isDigits(std::string_view text);

// The digits from nibble `firstNibble` on (nibble 0 is the low nibble of byte 0). Filler
// nibbles may only close the run. Empty when a nibble is 0xA to 0xE, or a digit follows a
// filler.
std::optional<std::string> decodeSwappedBcd(std::span<const std::uint8_t> bytes,
                                            std::size_t firstNibble = 0);

// `nibbles` (each 0 to 15) packed low nibble first into `size` bytes, the rest filled with
// 0xF. The caller makes sure they fit: nibbles.size() <= 2 * size.
platform::Bytes packNibbles(std::span<const std::uint8_t> nibbles, std::size_t size);

// The digits packed into `size` bytes; empty when `digits` holds anything but 0 to 9 or more
// than 2 * size digits.
std::optional<platform::Bytes> encodeSwappedBcd(std::string_view digits, std::size_t size);

}  // namespace radio
