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
      {599, LteChannel{1, F, 2169900, 1979900, 18599}},
      {600, LteChannel{2, F, 1930000, 1850000, 18600}},
      {2175, LteChannel{4, F, 2132500, 1732500, 20175}},
      {3450, LteChannel{8, F, 925000, 880000, 21450}},
      {3799, LteChannel{8, F, 959900, 914900, 21799}},
      {5230, LteChannel{13, F, 751000, 782000, 23230}},  // uplink above downlink
      {9210, LteChannel{28, F, 758000, 703000, 27210}},
      {9820, LteChannel{30, F, 2355000, 2310000, 27710}},
      {9660, LteChannel{29, S, 717000, none, none}},
      {10359, LteChannel{32, S, 1495900, none, none}},
      {36000, LteChannel{33, T, 1900000, 1900000, 36000}},
      {38000, LteChannel{38, T, 2595000, 2595000, 38000}},
      {40620, LteChannel{41, T, 2593000, 2593000, 40620}},
      {41589, LteChannel{41, T, 2689900, 2689900, 41589}},
      {60254, LteChannel{53, T, 2494900, 2494900, 60254}},
      // Above 65535.
      {65536, LteChannel{65, F, 2110000, 1920000, 131072}},
      {66436, LteChannel{66, F, 2110000, 1710000, 131972}},
      {66536, LteChannel{66, F, 2120000, 1720000, 132072}},
      {67135, LteChannel{66, F, 2179900, 1779900, 132671}},
      {67136, LteChannel{66, F, 2180000, none, none}},  // beyond the uplink of band 66
      {67335, LteChannel{66, F, 2199900, none, none}},
      {68336, LteChannel{70, F, 1995000, 1695000, 132972}},
      {68486, LteChannel{70, F, 2010000, none, none}},
      {68586, LteChannel{71, F, 617000, 663000, 133122}},
      {70645, LteChannel{88, F, 426900, 416900, 134281}},
      // In no band: gaps between bands, uplink EARFCNs, beyond the table.
      {4950, none},
      {5500, none},
      {7450, none},
      {10360, none},
      {35999, none},
      {60255, none},
      {65535, none},
      {70646, none},
      {18000, none},
      {131072, none},
      {262143, none},
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
      {10562, UmtsChannel{1, "I", 2112400, 1922400, 9612}},
      {10838, UmtsChannel{1, "I", 2167600, 1977600, 9888}},
      {9662, UmtsChannel{2, "II", 1932400, 1852400, 9262}},
      {412, UmtsChannel{2, "II", 1932500, 1852500, 12}},
      {437, UmtsChannel{2, "II", 1937500, 1857500, 37}},
      {687, UmtsChannel{2, "II", 1987500, 1907500, 287}},
      {1162, UmtsChannel{3, "III", 1807400, 1712400, 937}},
      {1513, UmtsChannel{3, "III", 1877600, 1782600, 1288}},
      {1537, UmtsChannel{4, "IV", 2112400, 1712400, 1312}},
      {1887, UmtsChannel{4, "IV", 2112500, 1712500, 1662}},
      {4357, UmtsChannel{5, "V", 871400, 826400, 4132}},
      {4400, UmtsChannel{5, "V", 880000, 835000, 4175}},
      {1007, UmtsChannel{5, "V", 871500, 826500, 782}},
      {1037, UmtsChannel{5, "V", 877500, 832500, 812}},
      {1087, UmtsChannel{5, "V", 887500, 842500, 862}},
      {2237, UmtsChannel{7, "VII", 2622400, 2502400, 2012}},
      {2912, UmtsChannel{7, "VII", 2687500, 2567500, 2687}},
      {2937, UmtsChannel{8, "VIII", 927400, 882400, 2712}},
      {3012, UmtsChannel{8, "VIII", 942400, 897400, 2787}},
      {9237, UmtsChannel{9, "IX", 1847400, 1752400, 8762}},
      {3112, UmtsChannel{10, "X", 2112400, 1712400, 2887}},
      {3412, UmtsChannel{10, "X", 2112500, 1712500, 3187}},
      {3712, UmtsChannel{11, "XI", 1478400, 1430400, 3487}},
      {3842, UmtsChannel{12, "XII", 731400, 701400, 3617}},
      {4017, UmtsChannel{13, "XIII", 748400, 779400, 3792}},
      {4117, UmtsChannel{14, "XIV", 760400, 790400, 3892}},
      {712, UmtsChannel{19, "XIX", 877400, 832400, 312}},
      {4512, UmtsChannel{20, "XX", 793400, 834400, 4287}},
      {862, UmtsChannel{21, "XXI", 1498400, 1450400, 462}},
      {4662, UmtsChannel{22, "XXII", 3512400, 3412400, 4437}},
      {5112, UmtsChannel{25, "XXV", 1932400, 1852400, 4887}},
      {5762, UmtsChannel{26, "XXVI", 861400, 816400, 5537}},
      // Off the additional raster, between bands, uplink UARFCNs, beyond the table.
      {413, none},
      {1017, none},
      {0, none},
      {4356, none},
      {9661, none},
      {9939, none},
      {10561, none},
      {10839, none},
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
  const GsmChannel pgsm1{GsmBand::pgsm900, "P-GSM 900", 935200, 890200};
  const Case cases[] = {
      {1, any, pgsm1},
      {1, dcs, pgsm1},
      {124, any, GsmChannel{GsmBand::pgsm900, "P-GSM 900", 959800, 914800}},
      {0, any, GsmChannel{GsmBand::egsm900, "E-GSM 900", 935000, 890000}},
      {975, any, GsmChannel{GsmBand::egsm900, "E-GSM 900", 925200, 880200}},
      {1023, any, GsmChannel{GsmBand::egsm900, "E-GSM 900", 934800, 889800}},
      {955, any, GsmChannel{GsmBand::rgsm900, "R-GSM 900", 921200, 876200}},
      {974, any, GsmChannel{GsmBand::rgsm900, "R-GSM 900", 925000, 880000}},
      {128, any, GsmChannel{GsmBand::gsm850, "GSM 850", 869200, 824200}},
      {251, any, GsmChannel{GsmBand::gsm850, "GSM 850", 893800, 848800}},
      {512, any, std::nullopt},
      {661, any, std::nullopt},
      {810, any, std::nullopt},
      {512, dcs, GsmChannel{GsmBand::dcs1800, "DCS 1800", 1805200, 1710200}},
      {512, pcs, GsmChannel{GsmBand::pcs1900, "PCS 1900", 1930200, 1850200}},
      {810, dcs, GsmChannel{GsmBand::dcs1800, "DCS 1800", 1864800, 1769800}},
      {810, pcs, GsmChannel{GsmBand::pcs1900, "PCS 1900", 1989800, 1909800}},
      {811, any, GsmChannel{GsmBand::dcs1800, "DCS 1800", 1865000, 1770000}},
      {885, pcs, GsmChannel{GsmBand::dcs1800, "DCS 1800", 1879800, 1784800}},
      {259, any, GsmChannel{GsmBand::gsm450, "GSM 450", 460600, 450600}},
      {293, any, GsmChannel{GsmBand::gsm450, "GSM 450", 467400, 457400}},
      {306, any, GsmChannel{GsmBand::gsm480, "GSM 480", 489000, 479000}},
      {340, any, GsmChannel{GsmBand::gsm480, "GSM 480", 495800, 485800}},
      {438, any, GsmChannel{GsmBand::gsm750, "GSM 750", 747200, 777200}},  // uplink above
      {511, any, GsmChannel{GsmBand::gsm750, "GSM 750", 761800, 791800}},
      {125, any, std::nullopt},
      {252, any, std::nullopt},
      {300, any, std::nullopt},
      {437, any, std::nullopt},
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
  EXPECT_EQ(megahertzText(935200), "935.2");
  EXPECT_EQ(megahertzText(1452025), "1452.025");
  EXPECT_EQ(megahertzText(1000001), "1000.001");
  EXPECT_EQ(megahertzText(0), "0.0");
}

}  // namespace
}  // namespace radio
