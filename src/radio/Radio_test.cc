#include <gtest/gtest.h>

#include <cstdint>
#include <optional>
#include <ostream>
#include <string>
#include <vector>

#include "radio/CellIdentity.h"
#include "radio/Channel.h"
#include "radio/EpsIdentity.h"
#include "radio/GsmBands.h"
#include "radio/Iccid.h"
#include "radio/Imsi.h"
#include "radio/LteBands.h"
#include "radio/Plmn.h"
#include "radio/UmtsBands.h"

namespace radio {

void PrintTo(const Plmn& plmn, std::ostream* out) {
  *out << plmnText(plmn);
}

void PrintTo(const ImsiParts& parts, std::ostream* out) {
  *out << plmnText(parts.plmn) << " / " << parts.msin;
}

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

using platform::Bytes;

TEST(Plmn, DecodesAndEncodesTwoAndThreeDigitMncs) {
  struct Case {
    Bytes bytes;
    std::string text;
  };
  const Case cases[] = {
      {{0x00, 0xF1, 0x10}, "001-01"},   // the test network
      {{0x13, 0x00, 0x62}, "310-260"},  // MNC digit 3 in the high nibble of byte 2
      {{0x32, 0x54, 0x10}, "234-015"},  // a three-digit MNC with leading zero
      {{0x32, 0xF4, 0x51}, "234-15"},
  };
  for (const Case& c : cases) {
    const std::optional<Plmn> plmn = decodePlmn(c.bytes);
    ASSERT_TRUE(plmn) << c.text;
    EXPECT_EQ(plmnText(*plmn), c.text);
    EXPECT_EQ(parsePlmnText(c.text), plmn);
    const std::optional<PlmnBytes> encoded = encodePlmn(*plmn);
    ASSERT_TRUE(encoded) << c.text;
    EXPECT_EQ(Bytes(encoded->begin(), encoded->end()), c.bytes) << c.text;
  }
}

TEST(Plmn, RefusesMalformedBytesAndTexts) {
  const Bytes badBytes[] = {
      {},
      {0x00, 0xF1},
      {0x00, 0xF1, 0x10, 0x00},
      {0x0A, 0xF1, 0x10},  // MCC digit 1 is not a digit
      {0x00, 0xFF, 0x10},  // MCC digit 3 is a filler
      {0x00, 0xF1, 0xF0},  // a one-digit MNC
      {0x00, 0xF1, 0x1F},  // a digit after the filler
      {0xFF, 0xFF, 0xFF},  // an unset identity
  };
  for (const Bytes& bytes : badBytes)
    EXPECT_FALSE(decodePlmn(bytes)) << testing::PrintToString(bytes);

  for (const char* text :
       {"", "310", "310-", "310260", "310-2a0", "310-2600", "3100-26", "-310-26"}) {
    EXPECT_FALSE(parsePlmnText(text)) << text;
  }
  EXPECT_FALSE(encodePlmn(Plmn{"31", "260"}));
  EXPECT_FALSE(encodePlmn(Plmn{"310", "2"}));
  EXPECT_FALSE(encodePlmn(Plmn{"310", "2F0"}));
}

TEST(Plmn, KeepsLeadingZerosOfNumbersAndOperatorCodes) {
  EXPECT_EQ(plmnFromNumbers(1, 1, 2), (Plmn{"001", "01"}));
  EXPECT_EQ(plmnFromNumbers(234, 15, 3), (Plmn{"234", "015"}));
  EXPECT_FALSE(plmnFromNumbers(1000, 1, 2));
  EXPECT_FALSE(plmnFromNumbers(310, 100, 2));
  EXPECT_FALSE(plmnFromNumbers(310, 1, 1));

  EXPECT_EQ(plmnFromOperatorCode("31026"), (Plmn{"310", "26"}));
  EXPECT_EQ(plmnFromOperatorCode("310260"), (Plmn{"310", "260"}));
  for (const char* code : {"", "3102", "3102601", "31a26", "310-26"}) {
    EXPECT_FALSE(plmnFromOperatorCode(code)) << code;
  }
}

TEST(Imsi, DecodesAndEncodesEfImsiOfOddAndEvenLengths) {
  struct Case {
    Bytes file;
    std::string imsi;
  };
  const Case cases[] = {
      {{0x08, 0x09, 0x10, 0x10, 0x10, 0x32, 0x54, 0x76, 0x98}, "001010123456789"},
      {{0x08, 0x31, 0x01, 0x62, 0x10, 0x32, 0x54, 0x76, 0xF8}, "31026012345678"},  // 14 digits
      {{0x04, 0x01, 0x10, 0x10, 0xF1, 0xFF, 0xFF, 0xFF, 0xFF}, "001011"},          // 6 digits
  };
  for (const Case& c : cases) {
    EXPECT_EQ(decodeEfImsi(c.file), c.imsi);
    EXPECT_EQ(encodeEfImsi(c.imsi), c.file) << c.imsi;
    EXPECT_EQ(decodeImsiIdentity(std::span(c.file).subspan(1, c.file[0])), c.imsi);
  }
  // What follows the identity is not part of it.
  EXPECT_EQ(decodeEfImsi(Bytes{0x04, 0x01, 0x10, 0x10, 0xF1}), "001011");
}

TEST(Imsi, RefusesMalformedFilesAndDigits) {
  const Bytes badFiles[] = {
      {},
      Bytes(9, 0xFF),                                                // unset
      {0x00, 0xFF, 0xFF, 0xFF, 0xFF, 0xFF, 0xFF, 0xFF, 0xFF},        // no identity
      {0x09, 0x09, 0x10, 0x10, 0x10, 0x32, 0x54, 0x76, 0x98, 0x10},  // longer than the file allows
      {0x08, 0x09, 0x10, 0x10, 0x10},                                // shorter than it says
      {0x08, 0x0A, 0x10, 0x10, 0x10, 0x32, 0x54, 0x76, 0x98},        // type 2 (IMEI)
      {0x08, 0x09, 0x10, 0x10, 0x10, 0x32, 0x54, 0x76, 0xF8},        // odd flag, 14 digits
      {0x08, 0x09, 0x10, 0x1A, 0x10, 0x32, 0x54, 0x76, 0x98},        // a nibble that is no digit
      {0x08, 0x09, 0x10, 0xF0, 0x10, 0x32, 0x54, 0x76, 0x98},        // a digit after a filler
  };
  for (const Bytes& file : badFiles)
    EXPECT_FALSE(decodeEfImsi(file)) << testing::PrintToString(file);

  for (const char* imsi : {"", "00101", "0010101234567890", "00101012345678a", "-01010123456789"}) {
    EXPECT_FALSE(encodeEfImsi(imsi)) << imsi;
  }
}

TEST(Imsi, SplitsAfterTheMncLengthTheSimStatesOrTheUsualOne) {
  EXPECT_EQ(splitImsi("310260123456789", 3), (ImsiParts{{"310", "260"}, "123456789"}));
  EXPECT_EQ(splitImsi("310260123456789", 2), (ImsiParts{{"310", "26"}, "0123456789"}));
  EXPECT_EQ(splitImsi("001011", 2), (ImsiParts{{"001", "01"}, "1"}));
  EXPECT_FALSE(splitImsi("001011", 3));  // no MSIN left
  EXPECT_FALSE(splitImsi("310260123456789", 1));
  EXPECT_FALSE(splitImsi("31026012345678x", 3));

  EXPECT_EQ(mncLengthFromEfAd(Bytes{0x00, 0x00, 0x00, 0x02}), 2u);
  EXPECT_EQ(mncLengthFromEfAd(Bytes{0x00, 0x00, 0x00, 0xF3}), 3u);  // bits 5 to 8 are reserved
  EXPECT_FALSE(mncLengthFromEfAd(Bytes{0x00, 0x00, 0x00}));         // a file from before the byte
  EXPECT_FALSE(mncLengthFromEfAd(Bytes{0x00, 0x00, 0x00, 0x04}));

  for (const char* mcc : {"310", "732"}) {
    EXPECT_EQ(usualMncLength(mcc), 3u) << mcc;
  }
  for (const char* mcc : {"001", "317", "", "3100", "abc"}) {
    EXPECT_EQ(usualMncLength(mcc), 2u) << mcc;
  }
}

TEST(Iccid, DecodesAndEncodesNineteenAndTwentyDigits) {
  struct Case {
    Bytes file;
    std::string iccid;
  };
  const Case cases[] = {
      {{0x98, 0x94, 0x22, 0x06, 0x21, 0x43, 0x65, 0x87, 0x09, 0xF1}, "8949226012345678901"},
      {{0x98, 0x10, 0x14, 0x30, 0x12, 0x11, 0x81, 0x15, 0x70, 0x02}, "89014103211118510720"},
  };
  for (const Case& c : cases) {
    EXPECT_EQ(decodeEfIccid(c.file), c.iccid);
    EXPECT_EQ(encodeEfIccid(c.iccid), c.file) << c.iccid;
  }
}

TEST(Iccid, RefusesMalformedFilesAndDigits) {
  const Bytes badFiles[] = {
      {},
      {0x98, 0x94, 0x22, 0x06, 0x21, 0x43, 0x65, 0x87, 0x09},        // 9 bytes
      {0x98, 0x94, 0x22, 0x06, 0x21, 0x43, 0x65, 0x87, 0x09, 0xFF},  // 18 digits
      {0x98, 0x94, 0x2B, 0x06, 0x21, 0x43, 0x65, 0x87, 0x09, 0xF1},  // no digit
      {0x98, 0xF4, 0x22, 0x06, 0x21, 0x43, 0x65, 0x87, 0x09, 0x01},  // digits after a filler
  };
  for (const Bytes& file : badFiles)
    EXPECT_FALSE(decodeEfIccid(file)) << testing::PrintToString(file);

  for (const char* iccid :
       {"", "894922601234567890", "894922601234567890123", "894922601234567890F"}) {
    EXPECT_FALSE(encodeEfIccid(iccid)) << iccid;
  }
}

TEST(EpsIdentity, DecodesGutiAndTaiAndWritesThemInHex) {
  const std::optional<Guti> guti =
      decodeGuti(Bytes{0xF6, 0x13, 0x00, 0x62, 0x80, 0x01, 0x01, 0xC0, 0x00, 0x00, 0x01});
  ASSERT_TRUE(guti);
  EXPECT_EQ(*guti, (Guti{{"310", "260"}, 0x8001, 0x01, 0xC0000001}));
  EXPECT_EQ(gutiText(*guti), "310-260-8001-01-C0000001");
  EXPECT_EQ(gutiText(Guti{{"001", "01"}, 0x1, 0xAB, 0x12}), "001-01-0001-AB-00000012");

  const std::optional<Tai> tai = decodeTai(Bytes{0x62, 0xF2, 0x10, 0x1A, 0x2B});
  ASSERT_TRUE(tai);
  EXPECT_EQ(*tai, (Tai{{"262", "01"}, 0x1A2B}));
  EXPECT_EQ(taiText(*tai), "262-01-1A2B");
  EXPECT_EQ(taiText(Tai{{"001", "01"}, 1}), "001-01-0001");
}

TEST(EpsIdentity, RefusesMalformedIdentities) {
  const Bytes badGutis[] = {
      {},
      {0xF6, 0x13, 0x00, 0x62, 0x80, 0x01, 0x01, 0xC0, 0x00, 0x00},              // 10 bytes
      {0xF6, 0x13, 0x00, 0x62, 0x80, 0x01, 0x01, 0xC0, 0x00, 0x00, 0x01, 0x00},  // 12 bytes
      {0xF1, 0x13, 0x00, 0x62, 0x80, 0x01, 0x01, 0xC0, 0x00, 0x00, 0x01},        // an IMSI
      {0xF6, 0x1A, 0x00, 0x62, 0x80, 0x01, 0x01, 0xC0, 0x00, 0x00, 0x01},        // bad PLMN
  };
  for (const Bytes& bytes : badGutis)
    EXPECT_FALSE(decodeGuti(bytes)) << testing::PrintToString(bytes);
  EXPECT_FALSE(decodeTai(Bytes{0x62, 0xF2, 0x10, 0x1A}));
  EXPECT_FALSE(decodeTai(Bytes{0x62, 0xF2, 0x10, 0x1A, 0x2B, 0x00}));
  EXPECT_FALSE(decodeTai(Bytes{0x62, 0xFF, 0x10, 0x1A, 0x2B}));
}

TEST(CellIdentity, SplitsTwentyEightBitsIntoSiteAndCell) {
  EXPECT_EQ(splitEutranCellId(0x1A2D001), (EutranCell{0x1A2D0, 0x01}));  // eNB 107216, cell 1
  EXPECT_EQ(splitEutranCellId(0xFFFFFFF), (EutranCell{0xFFFFF, 0xFF}));
  EXPECT_EQ(splitEutranCellId(0), (EutranCell{0, 0}));
  EXPECT_FALSE(splitEutranCellId(0x10000000));
  EXPECT_EQ(splitUtranCellId(0x0C8A1B3), (UtranCell{0x0C8, 0xA1B3}));
  EXPECT_EQ(splitUtranCellId(0xFFFFFFF), (UtranCell{0xFFF, 0xFFFF}));
  EXPECT_FALSE(splitUtranCellId(UINT32_MAX));
}

// A fixed pseudo-random sequence, so that a failure repeats.
class Numbers {
 public:
  std::uint32_t next() {
    state_ = state_ * 6364136223846793005u + 1442695040888963407u;
    return static_cast<std::uint32_t>(state_ >> 33);
  }

  std::string digits(std::size_t count) {
    std::string text;
    for (std::size_t i = 0; i < count; ++i)
      text += static_cast<char>('0' + next() % 10);
    return text;
  }

 private:
  std::uint64_t state_ = 1;
};

TEST(RoundTrip, EncodedIdentitiesOfEveryLengthDecodeToTheirDigits) {
  Numbers numbers;
  for (int round = 0; round < 200; ++round) {
    for (std::size_t length = 6; length <= 15; ++length) {
      const std::string imsi = numbers.digits(length);
      const std::optional<Bytes> file = encodeEfImsi(imsi);
      ASSERT_TRUE(file) << imsi;
      EXPECT_EQ(file->size(), kEfImsiSize);
      EXPECT_EQ(decodeEfImsi(*file), imsi);
    }
    for (std::size_t length : {19u, 20u}) {
      const std::string iccid = numbers.digits(length);
      const std::optional<Bytes> file = encodeEfIccid(iccid);
      ASSERT_TRUE(file) << iccid;
      EXPECT_EQ(decodeEfIccid(*file), iccid);
    }
    for (std::size_t mncLength : {kShortMncLength, kLongMncLength}) {
      const Plmn plmn{numbers.digits(kMccLength), numbers.digits(mncLength)};
      const std::optional<PlmnBytes> bytes = encodePlmn(plmn);
      ASSERT_TRUE(bytes) << plmnText(plmn);
      EXPECT_EQ(decodePlmn(*bytes), plmn);
    }
  }
}

// Whatever the bytes, the decoders answer (under the sanitizers: without reading past them),
// and what they accept encodes back to the same bytes where the coding has one form.
TEST(RoundTrip, ArbitraryBytesDecodeToNothingOrToWhatEncodesBack) {
  Numbers numbers;
  for (std::size_t size = 0; size <= 12; ++size) {
    for (int round = 0; round < 3000; ++round) {
      Bytes bytes(size);
      for (std::uint8_t& byte : bytes)
        byte = static_cast<std::uint8_t>(numbers.next());
      if (const auto plmn = decodePlmn(bytes)) {
        const auto encoded = encodePlmn(*plmn);
        ASSERT_TRUE(encoded);
        EXPECT_EQ(Bytes(encoded->begin(), encoded->end()), bytes);
      }
      if (const auto iccid = decodeEfIccid(bytes)) {
        EXPECT_EQ(encodeEfIccid(*iccid), bytes);
      }
      if (const auto imsi = decodeEfImsi(bytes)) {
        EXPECT_EQ(decodeEfImsi(*encodeEfImsi(*imsi)), imsi);
      }
      if (const auto imsi = decodeImsiIdentity(bytes)) {
        EXPECT_TRUE(encodeEfImsi(*imsi));
      }
      if (const auto guti = decodeGuti(bytes)) {
        EXPECT_EQ(gutiText(*guti).size(), plmnText(guti->plmn).size() + 17);
      }
      if (const auto tai = decodeTai(bytes)) {
        EXPECT_EQ(taiText(*tai).size(), plmnText(tai->plmn).size() + 5);
      }
      (void)mncLengthFromEfAd(bytes);
    }
  }
}

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
