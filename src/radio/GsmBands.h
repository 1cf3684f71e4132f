#pragma once

#include <cstdint>
#include <optional>
#include <string_view>

// GSM channel numbers (ARFCN) and the bands of TS 45.005 section 2.
namespace radio {

enum class GsmBand { gsm450, gsm480, gsm750, gsm850, pgsm900, egsm900, rgsm900, dcs1800, pcs1900 };

// Which band ARFCNs 512 to 810 belong to: DCS 1800 and PCS 1900 both number their channels
// from 512, and only the cell's band indicator (TS 44.018 10.5.2.1b) tells them apart.
enum class GsmBandIndicator { none, dcs1800, pcs1900 };

struct GsmChannel {
  // The narrowest GSM 900 band that holds the channel: ARFCNs 1 to 124 are P-GSM (and in E-GSM
  // and R-GSM too), 0 and 975 to 1023 E-GSM, 955 to 974 R-GSM.
  GsmBand band = GsmBand::pgsm900;
  std::string_view bandName;  // "P-GSM 900", "DCS 1800", ...
  std::uint32_t downlinkKHz = 0;
  std::uint32_t uplinkKHz = 0;

  bool operator==(const GsmChannel&) const = default;
};

// The band and frequencies of an ARFCN. ARFCNs 512 to 810 need a band indicator; without one
// they, like numbers outside every band, give no channel.
std::optional<GsmChannel> decodeArfcn(std::uint32_t arfcn,
                                      GsmBandIndicator indicator = GsmBandIndicator::none);

}  // namespace radio
