#pragma once

#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>

#include "platform/Value.h"
#include "radio/Plmn.h"

// The subscriber identity (IMSI, TS 23.003 2.2): MCC, MNC and MSIN, 6 to 15 digits in all.
namespace radio {

// The size of EF_IMSI (TS 31.102 4.2.2): a length byte and eight bytes of identity.
inline constexpr std::size_t kEfImsiSize = 9;

// The IMSI of a mobile identity value (TS 24.008 10.5.1.4, without its IEI and length): the
// first byte holds the type of identity (1 = IMSI) in bits 1 to 3, the odd-number-of-digits
// flag in bit 4 and digit 1 in its high nibble; the other digits follow in swapped nibbles, an
// even count closed by a 0xF filler. Empty for another identity type, a non-digit nibble, a
// flag that disagrees with the digits, or fewer than 6 or more than 15 digits.
std::optional<std::string> decodeImsiIdentity(std::span<const std::uint8_t> bytes);

// The IMSI of EF_IMSI: byte 1 counts the bytes of the mobile identity that follows (at most
// 8); bytes after it are ignored. Empty when the count does not fit the file or the identity
// does not decode (an unset file reads 0xFF throughout).
std::optional<std::string> decodeEfImsi(std::span<const std::uint8_t> bytes);

// The kEfImsiSize bytes of EF_IMSI for these 6 to 15 digits, padded with 0xFF; else empty.
std::optional<platform::Bytes> encodeEfImsi(std::string_view imsi);

struct ImsiParts {
  Plmn plmn;
  std::string msin;

  bool operator==(const ImsiParts&) const = default;
};

// The IMSI split after its MNC of `mncLength` (2 or 3) digits; empty for another length or an
// IMSI that is not 6 to 15 digits.
std::optional<ImsiParts> splitImsi(std::string_view imsi, std::size_t mncLength);

// The MNC length a SIM states in byte 4 of EF_AD (TS 31.102 4.2.18, bits 1 to 4); empty when
// the file is shorter or the value is not 2 or 3.
std::optional<std::size_t> mncLengthFromEfAd(std::span<const std::uint8_t> bytes);

// The MNC length to assume when the SIM does not state it: 3 for the MCCs whose networks all
// use three-digit MNCs (the USA, Canada, Mexico, the Caribbean of the North American numbering
// plan, Argentina, Colombia), 2 for every other MCC.
std::size_t usualMncLength(std::string_view mcc);

}  // namespace radio
