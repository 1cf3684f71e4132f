#include <gtest/gtest.h>

#include <cstdint>
#include <optional>
#include <ostream>

#include "radio/Channel.h"
#include "radio/GsmBands.h"
#include "radio/LteBands.h"
#include "radio/UmtsBands.h"

namespace radio {

void PrintTo(const LteChannel& c, std::ostream* out) {
  *out << "band " << c.band << " DL " << c.downlinkKHz << " UL "
       << testing::PrintToString(c.uplinkKHz) << " UL EARFCN "
       << testing::PrintToString(c.uplinkEarfcn);
}

void PrintTo(const UmtsChannel& c, std::ostream* out) {
  *out << "band " << c.bandName << " DL " << c.downlinkKHz << " UL " << c.uplinkKHz << " UL UARFCN "
       << c.uplinkUarfcn;
}

void PrintTo(const GsmChannel& c, std::ostream* out) {
  *out << c.bandName << " DL " << c.downlinkKHz << " UL " << c.uplinkKHz;
}

namespace {

constexpr auto F = Duplex::fdd;
constexpr auto T = Duplex::tdd;
constexpr auto S = Duplex::downlinkOnly;
constexpr std::nullopt_t none = std::nullopt;

TEST(LteBands, DecodesEarfcnsAtExamplesAndBandEdges) {
  struct Case {
    std::uint32_t earfcn;
    std::optional<LteChannel> channel;
  };
  const Case cases[] = {
      {6300, LteChannel{20, F, 806000, 847000, 24300}},
      {1575, LteChannel{3, F, 1842500, 1747500, 19575}},
      {0, LteChannel{1, F, 2110000, 1920000, 18000}},
      {600, LteChannel{2, F, 1930000, 1850000, 18600}},
      {3450, LteChannel{8, F, 925000, 880000, 21450}},
      {5230, LteChannel{13, F, 751000, 782000, 23230}},  // uplink above downlink
      {9820, LteChannel{30, F, 2355000, 2310000, 27710}},
      {9660, LteChannel{29, S, 717000, none, none}},
      {36000, LteChannel{33, T, 1900000, 1900000, 36000}},
      {40620, LteChannel{41, T, 2593000, 2593000, 40620}},
      {60254, LteChannel{53, T, 2494900, 2494900, 60254}},
      // Above 65535.
      {65536, LteChannel{65, F, 2110000, 1920000, 131072}},
      {66436, LteChannel{66, F, 2110000, 1710000, 131972}},
      {67135, LteChannel{66, F, 2179900, 1779900, 132671}},
      {67136, LteChannel{66, F, 2180000, none, none}},  // beyond the uplink of band 66
      {68336, LteChannel{70, F, 1995000, 1695000, 132972}},
      {68586, LteChannel{71, F, 617000, 663000, 133122}},
      {70645, LteChannel{88, F, 426900, 416900, 134281}},
      // In no band: gaps between bands, uplink EARFCNs, beyond the table.
      {4950, none},
      {10360, none},
      {35999, none},
      {60255, none},
      {65535, none},
      {70646, none},
      {18000, none},
      {UINT32_MAX, none},
  };
  for (const Case& c : cases)
    EXPECT_EQ(decodeEarfcn(c.earfcn), c.channel) << "EARFCN " << c.earfcn;
}

TEST(UmtsBands, DecodesGeneralAndAdditionalUarfcns) {
  struct Case {
    std::uint32_t uarfcn;
    std::optional<UmtsChannel> channel;
  };
  const Case cases[] = {
      {10700, UmtsChannel{1, "I", 2140000, 1950000, 9750}},
      {9662, UmtsChannel{2, "II", 1932400, 1852400, 9262}},
      {412, UmtsChannel{2, "II", 1932500, 1852500, 12}},
      {1162, UmtsChannel{3, "III", 1807400, 1712400, 937}},
      {1537, UmtsChannel{4, "IV", 2112400, 1712400, 1312}},
      {4357, UmtsChannel{5, "V", 871400, 826400, 4132}},
      {1007, UmtsChannel{5, "V", 871500, 826500, 782}},
      {2237, UmtsChannel{7, "VII", 2622400, 2502400, 2012}},
      {2937, UmtsChannel{8, "VIII", 927400, 882400, 2712}},
      {9237, UmtsChannel{9, "IX", 1847400, 1752400, 8762}},
      {3112, UmtsChannel{10, "X", 2112400, 1712400, 2887}},
      {3712, UmtsChannel{11, "XI", 1478400, 1430400, 3487}},
      {4017, UmtsChannel{13, "XIII", 748400, 779400, 3792}},
      {712, UmtsChannel{19, "XIX", 877400, 832400, 312}},
      {4512, UmtsChannel{20, "XX", 793400, 834400, 4287}},
      {862, UmtsChannel{21, "XXI", 1498400, 1450400, 462}},
      {5762, UmtsChannel{26, "XXVI", 861400, 816400, 5537}},
      // Off the additional raster, between bands, uplink UARFCNs, beyond the table.
      {413, none},
      {0, none},
      {4356, none},
      {9661, none},
      {10561, none},
      {9612, none},
      {UINT32_MAX, none},
  };
  for (const Case& c : cases)
    EXPECT_EQ(decodeUarfcn(c.uarfcn), c.channel) << "UARFCN " << c.uarfcn;
}

TEST(GsmBands, DecodesArfcnsAndLeavesTheDcsPcsOverlapToTheIndicator) {
  constexpr auto any = GsmBandIndicator::none;
  constexpr auto dcs = GsmBandIndicator::dcs1800;
  constexpr auto pcs = GsmBandIndicator::pcs1900;
  struct Case {
    std::uint32_t arfcn;
    GsmBandIndicator indicator;
    std::optional<GsmChannel> channel;
  };
  const Case cases[] = {
      {1, any, GsmChannel{GsmBand::pgsm900, "P-GSM 900", 935200, 890200}},
      {124, any, GsmChannel{GsmBand::pgsm900, "P-GSM 900", 959800, 914800}},
      {0, any, GsmChannel{GsmBand::egsm900, "E-GSM 900", 935000, 890000}},
      {975, any, GsmChannel{GsmBand::egsm900, "E-GSM 900", 925200, 880200}},
      {955, any, GsmChannel{GsmBand::rgsm900, "R-GSM 900", 921200, 876200}},
      {128, any, GsmChannel{GsmBand::gsm850, "GSM 850", 869200, 824200}},
      {512, any, std::nullopt},
      {810, any, std::nullopt},
      {512, dcs, GsmChannel{GsmBand::dcs1800, "DCS 1800", 1805200, 1710200}},
      {512, pcs, GsmChannel{GsmBand::pcs1900, "PCS 1900", 1930200, 1850200}},
      {810, pcs, GsmChannel{GsmBand::pcs1900, "PCS 1900", 1989800, 1909800}},
      {811, any, GsmChannel{GsmBand::dcs1800, "DCS 1800", 1865000, 1770000}},
      {885, pcs, GsmChannel{GsmBand::dcs1800, "DCS 1800", 1879800, 1784800}},
      {259, any, GsmChannel{GsmBand::gsm450, "GSM 450", 460600, 450600}},
      {306, any, GsmChannel{GsmBand::gsm480, "GSM 480", 489000, 479000}},
      {438, any, GsmChannel{GsmBand::gsm750, "GSM 750", 747200, 777200}},  // uplink above
      {125, any, std::nullopt},
      {886, dcs, std::nullopt},
      {954, any, std::nullopt},
      {1024, any, std::nullopt},
      {UINT32_MAX, pcs, std::nullopt},
  };
  for (const Case& c : cases) {
    EXPECT_EQ(decodeArfcn(c.arfcn, c.indicator), c.channel)
        << "ARFCN " << c.arfcn << " indicator " << static_cast<int>(c.indicator);
  }
}

TEST(Channel, WritesMegahertzWithTheDecimalsItNeeds) {
  EXPECT_EQ(megahertzText(806000), "806.0");
  EXPECT_EQ(megahertzText(1842500), "1842.5");
  EXPECT_EQ(megahertzText(1452025), "1452.025");
  EXPECT_EQ(megahertzText(0), "0.0");
}

}  // namespace
}  // namespace radio
