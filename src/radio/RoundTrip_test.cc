#include <gtest/gtest.h>

#include <cstdint>
#include <string>

#include "radio/EpsIdentity.h"
#include "radio/Iccid.h"
#include "radio/Imsi.h"
#include "radio/Plmn.h"

namespace radio {
namespace {

using platform::Bytes;

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
