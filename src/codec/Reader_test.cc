#include "codec/Reader.h"

#include <gtest/gtest.h>

#include <limits>
#include <utility>

namespace codec {
namespace {

Reader over(const platform::Bytes& bytes) {
  return Reader(bytes);
}

TEST(AReader, ReadsVarintsOfEveryLength) {
  const platform::Bytes bytes = {0x00, 0x7F, 0x80, 0x01, 0xAC, 0x02, 0xFF, 0xFF,
                                 0xFF, 0xFF, 0xFF, 0xFF, 0xFF, 0xFF, 0xFF, 0x01};
  Reader reader = over(bytes);
  EXPECT_EQ(reader.readVarint(), 0u);
  EXPECT_EQ(reader.readVarint(), 127u);
  EXPECT_EQ(reader.readVarint(), 128u);
  EXPECT_EQ(reader.readVarint(), 300u);
  EXPECT_EQ(reader.readVarint(), std::numeric_limits<std::uint64_t>::max());
  EXPECT_FALSE(reader.hasError());
  EXPECT_EQ(reader.position(), bytes.size());
}

// A varint of `length` bytes whose 7-bit groups all differ, so that a group read into the wrong
// place shows.
std::pair<platform::Bytes, std::uint64_t> distinctGroups(unsigned length) {
  platform::Bytes bytes;
  std::uint64_t value = 0;
  for (unsigned index = 0; index < length; ++index) {
    const auto group = static_cast<std::uint8_t>((index * 37 + 5) & 0x7F);
    bytes.push_back(static_cast<std::uint8_t>(index + 1 < length ? group | 0x80 : group));
    value |= static_cast<std::uint64_t>(group) << (7 * index);
  }
  return {bytes, value};
}

TEST(AReader, ReadsAVarintOfAnyLengthAtAnyDistanceFromTheEndAndFlagsOneCutShort) {
  for (unsigned length = 1; length <= 10; ++length) {
    const auto [encoded, value] = distinctGroups(length);
    for (std::size_t padding = 0; padding <= 10; ++padding) {
      platform::Bytes bytes = encoded;
      bytes.resize(bytes.size() + padding, 0x80);
      Reader reader = over(bytes);
      EXPECT_EQ(reader.readVarint(), value) << length << " bytes, padding " << padding;
      EXPECT_EQ(reader.position(), length);
      EXPECT_FALSE(reader.hasError());
    }
    for (unsigned cut = 0; cut < length; ++cut) {
      const platform::Bytes bytes(encoded.begin(), encoded.begin() + cut);
      Reader reader = over(bytes);
      EXPECT_EQ(reader.readVarint(), 0u) << length << " bytes cut to " << cut;
      EXPECT_TRUE(reader.hasError());
      EXPECT_EQ(reader.position(), cut);
    }
  }
}

TEST(AReader, YieldsZeroWithoutErrorForAVarintLongerThanTenBytes) {
  for (const std::size_t padding :
       {std::size_t{0}, std::size_t{20}}) {  // the slow path near the end and the fast path
    platform::Bytes bytes(10, 0x81);
    bytes.push_back(0x01);
    bytes.resize(bytes.size() + padding, 0);
    Reader reader = over(bytes);
    EXPECT_EQ(reader.readVarint(), 0u);
    EXPECT_FALSE(reader.hasError());
    EXPECT_EQ(reader.position(), 10u) << "padding " << padding;
  }
}

TEST(AReader, FlagsAVarintCutShortAndYieldsZeroFromThenOn) {
  const platform::Bytes bytes = {0x96};
  Reader reader = over(bytes);
  EXPECT_EQ(reader.readVarint(), 0u);
  EXPECT_TRUE(reader.hasError());
  EXPECT_EQ(reader.readVarint(), 0u);
  EXPECT_EQ(reader.position(), 1u);
}

TEST(AReader, SkipsEveryWireTypeAValueCanHave) {
  const platform::Bytes bytes = {
      0x96, 0x01,                                   // varint
      1,    2,    3,    4,    5,    6,    7,    8,  // fixed64
      1,    2,    3,    4,                          // fixed32
      0x02, 0xAA, 0xBB,                             // length-delimited
      0x08, 0x01, 0x1B, 0x10, 0x02, 0x1C, 0x24,     // group 4 holding group 3, then its end
      0xFF};
  Reader reader = over(bytes);
  EXPECT_TRUE(reader.skip(1, kWireVarint));
  EXPECT_TRUE(reader.skip(1, kWireFixed64));
  EXPECT_TRUE(reader.skip(1, kWireFixed32));
  EXPECT_TRUE(reader.skip(1, kWireLengthDelimited));
  EXPECT_TRUE(reader.skip(4, kWireStartGroup));
  EXPECT_EQ(reader.position(), bytes.size() - 1);
  EXPECT_FALSE(reader.hasError());
}

TEST(AReader, RefusesToSkipWhatIsCutShortOrMalformed) {
  const platform::Bytes shortFixed = {1, 2, 3};
  EXPECT_FALSE(over(shortFixed).skip(1, kWireFixed64));
  EXPECT_FALSE(over(shortFixed).skip(1, kWireFixed32));
  const platform::Bytes longLength = {0x05, 0xAA};
  EXPECT_FALSE(over(longLength).skip(1, kWireLengthDelimited));
  const platform::Bytes anything = {0x00};
  EXPECT_FALSE(over(anything).skip(1, 6));
  EXPECT_FALSE(over(anything).skip(1, 7));
  EXPECT_FALSE(over(anything).skip(1, kWireEndGroup));
  const platform::Bytes wrongEnd = {0x2C};  // ends group 5 where group 4 was open
  EXPECT_FALSE(over(wrongEnd).skip(4, kWireStartGroup));
  const platform::Bytes unterminated = {0x08, 0x01};
  EXPECT_FALSE(over(unterminated).skip(4, kWireStartGroup));
}

TEST(AReader, CapsGroupNestingSoAHostilePayloadCannotExhaustTheStack) {
  const platform::Bytes deep(100000, 0x0B);  // group 1 opened again and again
  Reader reader = over(deep);
  EXPECT_FALSE(reader.skip(1, kWireStartGroup));
}

TEST(AReader, DecodesZigzagFromTheLowThirtyTwoBits) {
  EXPECT_EQ(decodeZigzag32(0), 0);
  EXPECT_EQ(decodeZigzag32(1), -1);
  EXPECT_EQ(decodeZigzag32(2), 1);
  EXPECT_EQ(decodeZigzag32(0xFFFFFFFEu), std::numeric_limits<std::int32_t>::max());
  EXPECT_EQ(decodeZigzag32(0xFFFFFFFFu), std::numeric_limits<std::int32_t>::min());
  EXPECT_EQ(decodeZigzag32(0x100000003u), -2) << "bits above 32 are dropped";
}

}  // namespace
}  // namespace codec
