#include "tarn/sim/Units.h"

#include <gtest/gtest.h>

#include "tarn/sim/Bands.h"
#include "tarn/sim/Identity.h"

namespace tarn::sim {
namespace {

using platform::Bytes;

TEST(MeasurementIndexes, AreClampedToTheirReportingRanges) {
  EXPECT_EQ(units::rsrpIndex(-160.0), 0u);
  EXPECT_EQ(units::rsrpIndex(-20.0), 97u);
  EXPECT_EQ(units::rsrqIndex(-30.0), 0u);
  EXPECT_EQ(units::rsrqIndex(5.0), 34u);
  EXPECT_EQ(units::rscpIndex(-130.0), 0u);
  EXPECT_EQ(units::rscpIndex(0.0), 91u);
  EXPECT_EQ(units::ecnoIndex(-30.0), 0u);
  EXPECT_EQ(units::ecnoIndex(3.0), 49u);
  EXPECT_EQ(units::rxlevIndex(-120.0), 0u);
  EXPECT_EQ(units::rxlevIndex(-20.0), 63u);
}

TEST(FixedPointLevels, RoundToHundredthsAndHalvesOfADecibel) {
  EXPECT_EQ(units::centiDb(-98.5), -9850);
  EXPECT_EQ(units::centiDb(-10.504), -1050);
  EXPECT_EQ(units::halfDb(12.5), 25);
  EXPECT_EQ(units::halfDb(-1.6), -3);
  EXPECT_EQ(units::wholeDb(-84.5), -85);
}

TEST(LteBands, MapDownlinkEarfcnsToFrequenciesAndUplinkEarfcns) {
  EXPECT_DOUBLE_EQ(bands::lteDlMhz(3, 1300), 1815.0);
  EXPECT_EQ(bands::lteUlEarfcn(3, 1300), 19300u);
  EXPECT_DOUBLE_EQ(bands::lteDlMhz(20, 6300), 806.0);
  EXPECT_EQ(bands::lteUlEarfcn(7, 3050), 21050u);
  EXPECT_EQ(bands::lteBandwidth(5).resourceBlocks, 100u);
  EXPECT_THROW(bands::lteBand(2), std::out_of_range);
}

TEST(OtherBands, MapChannelNumbersToDownlinkFrequencies) {
  EXPECT_DOUBLE_EQ(bands::umtsDlMhz(1, 10588), 2117.6);
  EXPECT_DOUBLE_EQ(bands::umtsDlMhz(8, 3011), 942.2);
  EXPECT_DOUBLE_EQ(bands::gsmDlMhz(messages::SYS_BAND_GSM_EGSM_900, 62), 947.4);
  EXPECT_DOUBLE_EQ(bands::gsmDlMhz(messages::SYS_BAND_GSM_DCS_1800, 600), 1822.8);
}

TEST(IdentityEncoding, PutsPlmnDigitsInNasOrderWithFillerForTwoDigitMncs) {
  EXPECT_EQ(identity::encodePlmn({1, 1, 2}), (Bytes{0x00, 0xF1, 0x10}));
  EXPECT_EQ(identity::encodePlmn({310, 260, 3}), (Bytes{0x13, 0x00, 0x62}));
}

TEST(IdentityEncoding, WritesTheImsiAsAMobileIdentityWithOddParity) {
  EXPECT_EQ(identity::encodeImsi("001010123456789"),
            (Bytes{0x08, 0x09, 0x10, 0x10, 0x10, 0x32, 0x54, 0x76, 0x98}));
}

TEST(IdentityEncoding, SwapsNibblesAndPadsIccidsWithF) {
  EXPECT_EQ(identity::encodeSwappedBcd("8901", 3), (Bytes{0x98, 0x10, 0xFF}));
  EXPECT_EQ(identity::encodeSwappedBcd("123", 2), (Bytes{0x21, 0xF3}));
}

TEST(IdentityEncoding, ComputesLuhnCheckDigits) {
  EXPECT_EQ(identity::luhnCheckDigit("7992739871"), '3');
  EXPECT_EQ(identity::luhnCheckDigit("896101950123456789"), '0');
}

TEST(ASubscriber, HasAnImsiOfTheHomeNetworkAndAValidIccid) {
  Random random(42);
  const Subscriber subscriber = makeSubscriber({1, 1, 2}, random);
  ASSERT_EQ(subscriber.imsi.size(), 15u);
  EXPECT_EQ(subscriber.imsi.substr(0, 5), "00101");
  ASSERT_EQ(subscriber.iccid.size(), 19u);
  EXPECT_EQ(subscriber.iccid.substr(0, 2), "89");
  const std::string body = subscriber.iccid.substr(0, 18);
  EXPECT_EQ(identity::luhnCheckDigit(body), subscriber.iccid.back());
}

}  // namespace
}  // namespace tarn::sim
