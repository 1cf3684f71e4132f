#include <gtest/gtest.h>

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "radio/CellIdentity.h"
#include "radio/EpsIdentity.h"
#include "radio/Iccid.h"
#include "radio/Imsi.h"
#include "radio/Plmn.h"

namespace radio {

void PrintTo(const Plmn& plmn, std::ostream* out) {
  *out << plmnText(plmn);
}

void PrintTo(const ImsiParts& parts, std::ostream* out) {
  *out << plmnText(parts.plmn) << " / " << parts.msin;
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

}  // namespace
}  // namespace radio
