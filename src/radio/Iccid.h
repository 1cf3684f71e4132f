#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>

#include "platform/Value.h"

// The SIM card number (ICCID, ITU-T E.118): 19 or 20 digits, the last a check digit.
namespace radio {

// The size of EF_ICCID (TS 102.221 13.2).
inline constexpr std::size_t kEfIccidSize = 10;

// The ICCID of EF_ICCID: kEfIccidSize bytes of swapped-nibble BCD, a 19-digit number closed by
// a 0xF filler. Empty for another size, a non-digit nibble or another number of digits.
std::optional<std::string> decodeEfIccid(std::span<const std::uint8_t> bytes);

// The kEfIccidSize bytes of EF_ICCID for 19 or 20 digits; else empty.
std::optional<platform::Bytes> encodeEfIccid(std::string_view iccid);

}  // namespace radio
