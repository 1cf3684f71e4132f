#pragma once

#include <cstdint>
#include <optional>
#include <string_view>

// UTRA FDD channel numbers (UARFCN) and the operating bands of TS 25.101 (5.4.4, tables 5.2
// and 5.2A).
namespace radio {

struct UmtsChannel {
  std::uint32_t band = 0;     // the operating band as a number: 1 for band I
  std::string_view bandName;  // the band as 3GPP writes it: "I"
  std::uint32_t downlinkKHz = 0;
  std::uint32_t uplinkKHz = 0;  // at the band's duplex distance
  std::uint32_t uplinkUarfcn = 0;

  bool operator==(const UmtsChannel&) const = default;
};

// The band and frequencies of a downlink UARFCN, a general channel (N_DL = 5 (F_DL -
// F_DL_Offset)) or an additional one (the 100 kHz shifted carriers of bands II, IV, V, VII and
// X). Empty when no band of the table holds the number, or several do. Band VI, superseded by
// band XIX and on the frequencies of band V, is left out, so its channels read as band V.
std::optional<UmtsChannel> decodeUarfcn(std::uint32_t uarfcn);

}  // namespace radio
