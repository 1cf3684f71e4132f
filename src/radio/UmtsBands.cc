#include "radio/UmtsBands.h"

#include "radio/Channel.h"

namespace radio {
namespace {

// The downlink UARFCNs first, first + step, ... last of one band, from TS 25.101 table 5.2
// (general channels, step 1) or 5.2A (additional channels), with the band's offsets (F_DL =
// F_DL_Offset + 0.2 N_DL, F_UL = F_UL_Offset + 0.2 N_UL) and its duplex distance (table 5.0:
// F_DL - F_UL, negative where the uplink lies above). Frequencies in kHz.
struct UmtsChannels {
  std::uint32_t band;
  std::string_view name;
  std::uint32_t first;
  std::uint32_t last;
  std::uint32_t step;
  std::int32_t downlinkOffset;
  std::int32_t uplinkOffset;
  std::int32_t duplexDistance;
};

constexpr std::uint32_t kGeneral = 1;
constexpr std::uint32_t kAdditional = 25;  // one additional carrier every 5 MHz

constexpr UmtsChannels kUmtsBands[] = {
    // band, name, first, last N_DL, step, F_DL_Offset, F_UL_Offset, F_DL - F_UL
    {1, "I", 10562, 10838, kGeneral, 0, 0, 190000},
    {2, "II", 9662, 9938, kGeneral, 0, 0, 80000},
    {2, "II", 412, 687, kAdditional, 1850100, 1850100, 80000},
    {3, "III", 1162, 1513, kGeneral, 1575000, 1525000, 95000},
    {4, "IV", 1537, 1738, kGeneral, 1805000, 1450000, 400000},
    {4, "IV", 1887, 2087, kAdditional, 1735100, 1380100, 400000},
    {5, "V", 4357, 4458, kGeneral, 0, 0, 45000},
    {5, "V", 1007, 1032, kAdditional, 670100, 670100, 45000},
    {5, "V", 1012, 1037, kAdditional, 670100, 670100, 45000},
    {5, "V", 1062, 1087, kAdditional, 670100, 670100, 45000},
    {7, "VII", 2237, 2563, kGeneral, 2175000, 2100000, 120000},
    {7, "VII", 2587, 2912, kAdditional, 2105100, 2030100, 120000},
    {8, "VIII", 2937, 3088, kGeneral, 340000, 340000, 45000},
    {9, "IX", 9237, 9387, kGeneral, 0, 0, 95000},
    {10, "X", 3112, 3388, kGeneral, 1490000, 1135000, 400000},
    {10, "X", 3412, 3687, kAdditional, 1430100, 1075100, 400000},
    {11, "XI", 3712, 3787, kGeneral, 736000, 733000, 48000},
    {12, "XII", 3842, 3903, kGeneral, -37000, -22000, 30000},
    {13, "XIII", 4017, 4043, kGeneral, -55000, 21000, -31000},
    {14, "XIV", 4117, 4143, kGeneral, -63000, 12000, -30000},
    {19, "XIX", 712, 763, kGeneral, 735000, 770000, 45000},
    {20, "XX", 4512, 4638, kGeneral, -109000, -23000, -41000},
    {21, "XXI", 862, 912, kGeneral, 1326000, 1358000, 48000},
    {22, "XXII", 4662, 5038, kGeneral, 2580000, 2525000, 100000},
    {25, "XXV", 5112, 5413, kGeneral, 910000, 875000, 80000},
    {26, "XXVI", 5762, 5913, kGeneral, -291000, -291000, 45000},
};

constexpr bool isWellFormed() {
  for (const UmtsChannels& row : kUmtsBands) {
    if (row.last < row.first || (row.last - row.first) % row.step != 0) return false;
  }
  return true;
}
static_assert(isWellFormed());

constexpr std::int32_t kKHzPerChannel = 200;

}  // namespace

std::optional<UmtsChannel> decodeUarfcn(std::uint32_t uarfcn) {
  const UmtsChannels* row = onlyMatchingRow(kUmtsBands, [uarfcn](const UmtsChannels& channels) {
    return uarfcn >= channels.first && uarfcn <= channels.last &&
           (uarfcn - channels.first) % channels.step == 0;
  });
  if (row == nullptr) return std::nullopt;
  const std::int32_t downlink =
      row->downlinkOffset + kKHzPerChannel * static_cast<std::int32_t>(uarfcn);
  const std::int32_t uplink = downlink - row->duplexDistance;
  return UmtsChannel{row->band, row->name, static_cast<std::uint32_t>(downlink),
                     static_cast<std::uint32_t>(uplink),
                     static_cast<std::uint32_t>((uplink - row->uplinkOffset) / kKHzPerChannel)};
}

}  // namespace radio
