#pragma once

#include <cstdint>
#include <optional>
#include <span>
#include <string>

#include "radio/Plmn.h"

// The identities an LTE network gives a phone: its GUTI (TS 23.003 2.8) and the tracking area
// it is in (TAI, TS 23.003 19.4.2.3).
namespace radio {

struct Guti {
  Plmn plmn;
  std::uint16_t mmeGroupId = 0;
  std::uint8_t mmeCode = 0;
  std::uint32_t mTmsi = 0;

  bool operator==(const Guti&) const = default;
};

struct Tai {
  Plmn plmn;
  std::uint16_t tac = 0;

  bool operator==(const Tai&) const = default;
};

// The GUTI of an EPS mobile identity value (TS 24.301 9.9.3.12, without its IEI and length):
// 11 bytes, the identity type 6 in bits 1 to 3 of the first, then the PLMN, MME group ID, MME
// code and M-TMSI, numbers most significant byte first. Empty for anything else.
std::optional<Guti> decodeGuti(std::span<const std::uint8_t> bytes);

// The TAI of a tracking area identity value (TS 24.301 9.9.3.32, without its IEI): the PLMN,
// then the TAC most significant byte first; 5 bytes. Empty for anything else.
std::optional<Tai> decodeTai(std::span<const std::uint8_t> bytes);

// MCC-MNC, then the MME group ID, MME code and M-TMSI in upper-case hexadecimal of their full
// widths: "310-260-8001-01-C0000001".
std::string gutiText(const Guti& guti);

// MCC-MNC, then the TAC in upper-case hexadecimal of its full width: "001-01-0001".
std::string taiText(const Tai& tai);

}  // namespace radio
