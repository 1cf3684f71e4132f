#pragma once

#include <cstdint>
#include <optional>

#include "radio/Channel.h"

// E-UTRA channel numbers (EARFCN) and the operating bands of TS 36.101 table 5.7.3-1.
namespace radio {

struct LteChannel {
  std::uint32_t band = 0;  // the E-UTRA operating band, 1 to 88
  Duplex duplex = Duplex::fdd;
  std::uint32_t downlinkKHz = 0;
  // Empty for a downlink-only band, and for the downlink channels of an FDD band beyond its
  // uplink range (band 66 above 2180 MHz, band 70 above 2010 MHz). For TDD, the downlink
  // frequency and the EARFCN itself.
  std::optional<std::uint32_t> uplinkKHz;
  std::optional<std::uint32_t> uplinkEarfcn;

  bool operator==(const LteChannel&) const = default;
};

// The band and frequencies of a downlink EARFCN (0 to 262143): F_DL = F_DL_low + 0.1 (N_DL -
// N_Offs-DL), the uplink at the band's default duplex distance. Empty when no band of the
// table holds the number (an uplink EARFCN included).
std::optional<LteChannel> decodeEarfcn(std::uint32_t earfcn);

}  // namespace radio
