#include "codec/Writer.h"

#include <gtest/gtest.h>

#include "codec/Reader.h"

namespace codec {
namespace {

TEST(AWriter, WritesEachScalarKindWithItsKey) {
  Writer writer;
  writer.writeUint64(300, 1);
  writer.writeUint32(1, 2);
  writer.writeSint32(-2, 3);
  writer.writeBool(true, 4);
  writer.writeString("ab", 5);
  writer.writeBytes({0xFF}, 6);
  EXPECT_EQ(writer.data(), platform::Bytes({0x08, 0xAC, 0x02, 0x10, 0x01, 0x18, 0x03, 0x20, 0x01,
                                            0x2A, 0x02, 'a', 'b', 0x32, 0x01, 0xFF}));
}

TEST(AWriter, SignExtendsNegativeInt32ToTenBytes) {
  Writer writer;
  writer.writeInt32(-1, 1);
  platform::Bytes expected = {0x08};
  expected.insert(expected.end(), 9, 0xFF);
  expected.push_back(0x01);
  EXPECT_EQ(writer.data(), expected);
}

TEST(AWriter, WritesBareValuesWithoutAKey) {
  Writer writer;
  writer.writeUint32(5, Writer::kBare);
  writer.writeSint32(-1, Writer::kBare);
  EXPECT_EQ(writer.data(), platform::Bytes({0x05, 0x01}));
}

TEST(AWriter, FixesTheLengthOfALengthDelimitedFieldOfAnySize) {
  for (const std::size_t size : {0u, 1u, 127u, 128u, 16383u, 16384u, 70000u}) {
    Writer writer;
    const auto outer = writer.openLengthDelimited(7);
    const auto inner = writer.openLengthDelimited(1);
    for (std::size_t i = 0; i < size; ++i)
      writer.writeUint32(static_cast<std::uint32_t>(i % 100), Writer::kBare);
    writer.closeLengthDelimited(inner);
    writer.writeBool(true, 2);
    writer.closeLengthDelimited(outer);

    Reader reader(writer.data());
    EXPECT_EQ(reader.readVarint(), (7u << 3) | 2);
    const std::uint64_t outerLength = reader.readVarint();
    EXPECT_EQ(reader.position() + outerLength, reader.length()) << size;
    EXPECT_EQ(reader.readVarint(), (1u << 3) | 2);
    EXPECT_EQ(reader.readVarint(), size);
    for (std::size_t i = 0; i < size; ++i)
      ASSERT_EQ(reader.readVarint(), i % 100);
    EXPECT_EQ(reader.readVarint(), (2u << 3));
    EXPECT_EQ(reader.readVarint(), 1u);
    EXPECT_FALSE(reader.hasError());
  }
}

}  // namespace
}  // namespace codec
