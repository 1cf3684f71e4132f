#include "radio/GsmBands.h"

#include "radio/Channel.h"

namespace radio {
namespace {

// ARFCNs first to last of one band, F_UL = uplinkBase + 0.2 (n - baseArfcn) MHz and F_DL =
// F_UL + the duplex distance (TS 45.005 2). Rows that DCS 1800 and PCS 1900 share hold only
// under their band indicator. Frequencies in kHz.
struct GsmChannels {
  GsmBand band;
  std::string_view name;
  std::uint32_t first;
  std::uint32_t last;
  std::int32_t uplinkBase;
  std::int32_t baseArfcn;
  std::int32_t duplexDistance;
  GsmBandIndicator onlyUnder;
};

constexpr GsmBandIndicator kAny = GsmBandIndicator::none;

constexpr GsmChannels kGsmBands[] = {
    // band, name, first, last ARFCN, F_UL base, base ARFCN, F_DL - F_UL, indicator
    {GsmBand::pgsm900, "P-GSM 900", 1, 124, 890000, 0, 45000, kAny},
    {GsmBand::egsm900, "E-GSM 900", 0, 0, 890000, 0, 45000, kAny},
    {GsmBand::egsm900, "E-GSM 900", 975, 1023, 890000, 1024, 45000, kAny},
    {GsmBand::rgsm900, "R-GSM 900", 955, 974, 890000, 1024, 45000, kAny},
    {GsmBand::dcs1800, "DCS 1800", 512, 810, 1710200, 512, 95000, GsmBandIndicator::dcs1800},
    {GsmBand::dcs1800, "DCS 1800", 811, 885, 1710200, 512, 95000, kAny},
    {GsmBand::pcs1900, "PCS 1900", 512, 810, 1850200, 512, 80000, GsmBandIndicator::pcs1900},
    {GsmBand::gsm850, "GSM 850", 128, 251, 824200, 128, 45000, kAny},
    {GsmBand::gsm450, "GSM 450", 259, 293, 450600, 259, 10000, kAny},
    {GsmBand::gsm480, "GSM 480", 306, 340, 479000, 306, 10000, kAny},
    {GsmBand::gsm750, "GSM 750", 438, 511, 777200, 438, -30000, kAny},  // uplink above
};

constexpr std::int32_t kKHzPerChannel = 200;

}  // namespace

std::optional<GsmChannel> decodeArfcn(std::uint32_t arfcn, GsmBandIndicator indicator) {
  const GsmChannels* row =
      onlyMatchingRow(kGsmBands, [arfcn, indicator](const GsmChannels& channels) {
        return arfcn >= channels.first && arfcn <= channels.last &&
               (channels.onlyUnder == kAny || channels.onlyUnder == indicator);
      });
  if (row == nullptr) return std::nullopt;
  const std::int32_t uplink =
      row->uplinkBase + kKHzPerChannel * (static_cast<std::int32_t>(arfcn) - row->baseArfcn);
  return GsmChannel{row->band, row->name, static_cast<std::uint32_t>(uplink + row->duplexDistance),
                    static_cast<std::uint32_t>(uplink)};
}

}  // namespace radio
