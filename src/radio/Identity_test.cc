#include <gtest/gtest.h>

#include <optional>
#include <string>
#include <vector>

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
      {{0x13, 0x00, 0x14}, "310-410"},
      {{0x32, 0x54, 0x10}, "234-015"},  // a three-digit MNC with leading zero
      {{0x32, 0xF4, 0x51}, "234-15"},
      {{0x62, 0xF2, 0x10}, "262-01"},
      {{0x99, 0xF9, 0x99}, "999-99"},
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

  for (const char* text : {"", "310", "310-", "310260", "31-0260", "310-2a0", "310-2600", "3100-26",
                           "310 260", "-310-26"}) {
    EXPECT_FALSE(parsePlmnText(text)) << text;
  }
  EXPECT_FALSE(encodePlmn(Plmn{"31", "260"}));
  EXPECT_FALSE(encodePlmn(Plmn{"310", "2"}));
  EXPECT_FALSE(encodePlmn(Plmn{"310", "2F0"}));
}

TEST(Plmn, KeepsLeadingZerosOfNumbersAndOperatorCodes) {
  EXPECT_EQ(plmnFromNumbers(1, 1, 2), (Plmn{"001", "01"}));
  EXPECT_EQ(plmnFromNumbers(234, 15, 3), (Plmn{"234", "015"}));
  EXPECT_EQ(plmnFromNumbers(234, 15, 2), (Plmn{"234", "15"}));
  EXPECT_EQ(plmnFromNumbers(310, 260, 3), (Plmn{"310", "260"}));
  EXPECT_FALSE(plmnFromNumbers(1000, 1, 2));
  EXPECT_FALSE(plmnFromNumbers(310, 100, 2));
  EXPECT_FALSE(plmnFromNumbers(310, 1, 1));
  EXPECT_FALSE(plmnFromNumbers(310, 1, 4));

  EXPECT_EQ(plmnFromOperatorCode("31026"), (Plmn{"310", "26"}));
  EXPECT_EQ(plmnFromOperatorCode("310260"), (Plmn{"310", "260"}));
  EXPECT_EQ(plmnFromOperatorCode("00101"), (Plmn{"001", "01"}));
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
      {{0x08, 0x29, 0x43, 0x51, 0x90, 0x99, 0x99, 0x99, 0x99}, "234150999999999"},
      {{0x08, 0x31, 0x01, 0x62, 0x10, 0x32, 0x54, 0x76, 0xF8}, "31026012345678"},  // 14 digits
      {{0x04, 0x01, 0x10, 0x10, 0xF1, 0xFF, 0xFF, 0xFF, 0xFF}, "001011"},          // 6 digits
      {{0x04, 0x39, 0x01, 0x62, 0x10, 0xFF, 0xFF, 0xFF, 0xFF}, "3102601"},         // 7 digits
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
      {0x08, 0x01, 0x10, 0x10, 0x10, 0x32, 0x54, 0x76, 0x98},        // even flag, 15 digits
      {0x08, 0x09, 0x10, 0x1A, 0x10, 0x32, 0x54, 0x76, 0x98},        // a nibble that is no digit
      {0x08, 0x09, 0x10, 0xF0, 0x10, 0x32, 0x54, 0x76, 0x98},        // a digit after a filler
      {0x02, 0x09, 0x10, 0xFF, 0xFF, 0xFF, 0xFF, 0xFF, 0xFF},        // 3 digits
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
  EXPECT_FALSE(splitImsi("310260123456789", 4));
  EXPECT_FALSE(splitImsi("31026012345678x", 3));

  EXPECT_EQ(mncLengthFromEfAd(Bytes{0x00, 0x00, 0x00, 0x02}), 2u);
  EXPECT_EQ(mncLengthFromEfAd(Bytes{0x80, 0x00, 0x00, 0x03, 0xFF}), 3u);
  EXPECT_EQ(mncLengthFromEfAd(Bytes{0x00, 0x00, 0x00, 0xF3}), 3u);  // bits 5 to 8 are reserved
  EXPECT_FALSE(mncLengthFromEfAd(Bytes{0x00, 0x00, 0x00}));         // a file from before the byte
  EXPECT_FALSE(mncLengthFromEfAd(Bytes{0x00, 0x00, 0x00, 0x04}));
  EXPECT_FALSE(mncLengthFromEfAd(Bytes{0x00, 0x00, 0x00, 0xFF}));

  for (const char* mcc : {"302", "310", "316", "334", "722", "732"}) {
    EXPECT_EQ(usualMncLength(mcc), 3u) << mcc;
  }
  for (const char* mcc : {"001", "234", "262", "317", "404", "", "31", "3100", "abc"}) {
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
      {0x98, 0x94, 0x22, 0x06, 0x21, 0x43, 0x65, 0x87, 0x09},              // 9 bytes
      {0x98, 0x94, 0x22, 0x06, 0x21, 0x43, 0x65, 0x87, 0x09, 0xF1, 0xFF},  // 11 bytes
      {0x98, 0x94, 0x22, 0x06, 0x21, 0x43, 0x65, 0x87, 0xFF, 0xFF},        // 16 digits
      {0x98, 0x94, 0x22, 0x06, 0x21, 0x43, 0x65, 0x87, 0x09, 0xFF},        // 18 digits
      {0x98, 0x94, 0x2B, 0x06, 0x21, 0x43, 0x65, 0x87, 0x09, 0xF1},        // no digit
      {0x98, 0xF4, 0x22, 0x06, 0x21, 0x43, 0x65, 0x87, 0x09, 0x01},        // digits after a filler
      Bytes(10, 0xFF),
  };
  for (const Bytes& file : badFiles)
    EXPECT_FALSE(decodeEfIccid(file)) << testing::PrintToString(file);

  for (const char* iccid :
       {"", "894922601234567890", "894922601234567890123", "894922601234567890F"}) {
    EXPECT_FALSE(encodeEfIccid(iccid)) << iccid;
  }
}

}  // namespace
}  // namespace radio
