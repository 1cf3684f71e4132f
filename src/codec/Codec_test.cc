#include <gtest/gtest.h>

#include <limits>
#include <utility>
#include <vector>

#include "codec/Cursor.h"
#include "codec/PackedRun.h"
#include "codec/Reader.h"
#include "codec/Writer.h"

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
      EXPECT_EQ(reader.readVarint(), 0u) << "zero from then on";
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

// Where the cursor stands, as the reader it is stored into tells.
struct State {
  std::uint64_t position;
  std::uint64_t length;
  bool error;
  bool operator==(const State&) const = default;
};
State stateOf(const Cursor& cursor, const platform::Bytes& bytes) {
  Reader reader(bytes);
  cursor.storeTo(reader);
  return {reader.position(), reader.length(), reader.hasError()};
}

// A cursor over its own bytes.
struct CursorOver {
  explicit CursorOver(platform::Bytes input) : bytes(std::move(input)) {}
  State state() const { return stateOf(cursor, bytes); }
  platform::Bytes bytes;
  Reader reader{bytes};
  Cursor cursor{reader};
};

// A record that reads varints to the end of what the reader lets it read.
struct Varints {
  std::vector<std::uint64_t> values;
  std::uint64_t readableLength = 0;

  bool readFrom(Reader& reader) {
    readableLength = reader.length();
    while (reader.position() < reader.length() && !reader.hasError())
      values.push_back(reader.readVarint());
    return !reader.hasError();
  }
};

TEST(ACursor, ReadsVarintsAsTheReaderDoes) {
  // Every string of up to five bytes drawn from these, and long varints at any distance from
  // the end: one-byte, two-byte and longer varints, ending early or cut short.
  const std::uint8_t alphabet[] = {0x00, 0x01, 0x7F, 0x80, 0x81, 0xFF};
  std::vector<platform::Bytes> inputs = {{}};
  for (std::size_t from = 0; inputs.back().size() < 5;) {
    const std::size_t to = inputs.size();
    for (std::size_t index = from; index < to; ++index) {
      for (const std::uint8_t byte : alphabet) {
        platform::Bytes longer = inputs[index];
        longer.push_back(byte);
        inputs.push_back(longer);
      }
    }
    from = to;
  }
  for (std::size_t length = 3; length <= 11; ++length) {
    for (std::size_t padding = 0; padding <= 9; ++padding) {
      platform::Bytes bytes(length - 1, 0xA5);
      bytes.push_back(0x3C);
      bytes.resize(length + padding, 0x81);
      inputs.push_back(bytes);
    }
  }
  for (const auto& bytes : inputs) {
    Reader reader(bytes);
    Cursor cursor(reader);
    while (!reader.hasError() && reader.position() < reader.length()) {
      const std::uint64_t expected = reader.readVarint();
      ASSERT_EQ(cursor.readVarint(), expected) << testing::PrintToString(bytes);
      ASSERT_EQ(stateOf(cursor, bytes),
                (State{reader.position(), reader.length(), reader.hasError()}));
    }
  }
}

TEST(ACursor, ReadsAKeyCutShortAsAnEndGroupKeyWithTheErrorFlagSet) {
  CursorOver over({0x08, 0x96});
  EXPECT_EQ(over.cursor.readKey(), 0x08u);
  EXPECT_FALSE(over.cursor.hasError());
  EXPECT_EQ(over.cursor.readKey(), kWireEndGroup);
  EXPECT_EQ(over.state(), (State{2, 2, true}));
}

TEST(ACursor, ReadsTextAndBytesOrNothingWhenCutShort) {
  CursorOver over({0x02, 'h', 'i', 0x03, 0x00, 0xFF, 0x10, 0x04, 0x01});
  EXPECT_EQ(over.cursor.readString(), std::optional<std::string>("hi"));
  EXPECT_EQ(over.cursor.readBytes(), std::optional<platform::Bytes>({0x00, 0xFF, 0x10}));
  EXPECT_EQ(over.cursor.readBytes(), std::nullopt);
  EXPECT_EQ(over.state(), (State{8, 9, true})) << "just past the length";
}

std::uint32_t narrow(std::uint64_t value) {
  return static_cast<std::uint32_t>(value);
}

std::vector<std::uint32_t> valuesOf(const PackedRun<std::uint32_t>& run) {
  return {run.begin(), run.end()};
}

TEST(ACursor, ReadsAPackedRunWithinItsRegionOrASingleValueSentUnpacked) {
  CursorOver over({0x03, 0x01, 0x96, 0x01, 0x07, 0x05});
  PackedRun<std::uint32_t> run;
  ASSERT_TRUE(over.cursor.readPacked(kWireLengthDelimited, run, narrow));
  ASSERT_TRUE(over.cursor.readPacked(kWireVarint, run, narrow));
  EXPECT_EQ(valuesOf(run), (std::vector<std::uint32_t>{1, 150, 7}));
  EXPECT_EQ(over.cursor.readVarint(), 5u);
  EXPECT_EQ(over.state(), (State{6, 6, false}));
}

TEST(ACursor, KeepsThePackedValuesReadBeforeTheInputWasCutShort) {
  // The second value runs past its region: appended as 0, the position at the region's end.
  CursorOver cutInside({0x02, 0x04, 0x80, 0x05});
  PackedRun<std::uint32_t> run;
  EXPECT_FALSE(cutInside.cursor.readPacked(kWireLengthDelimited, run, narrow));
  EXPECT_EQ(valuesOf(run), (std::vector<std::uint32_t>{4, 0}));
  EXPECT_EQ(cutInside.state(), (State{3, 4, true}));

  CursorOver longRegion({0x05, 0x01});
  PackedRun<std::uint32_t> none;
  EXPECT_FALSE(longRegion.cursor.readPacked(kWireLengthDelimited, none, narrow));
  EXPECT_EQ(none.count(), 0u);
  EXPECT_EQ(longRegion.state(), (State{1, 2, true}));
}

TEST(ACursor, HandsANestedRecordTheReaderNarrowedToItsRegion) {
  CursorOver over({0x02, 0x08, 0x01, 0x7F});
  Varints nested;
  ASSERT_TRUE(over.cursor.readNested(over.reader, nested));
  EXPECT_EQ(nested.values, (std::vector<std::uint64_t>{8, 1}));
  EXPECT_EQ(nested.readableLength, 3u);
  EXPECT_EQ(over.cursor.readVarint(), 0x7Fu);
  EXPECT_EQ(over.state(), (State{4, 4, false}));
}

TEST(ACursor, LeavesTheReaderWhereANestedRecordFailed) {
  const auto readerState = [](const Reader& reader) {
    return State{reader.position(), reader.length(), reader.hasError()};
  };
  // Cut short inside the record: the reader stays as the record left it, inside the region.
  CursorOver cutInside({0x02, 0x08, 0x80, 0x7F});
  Varints nested;
  EXPECT_FALSE(cutInside.cursor.readNested(cutInside.reader, nested));
  EXPECT_EQ(nested.values, (std::vector<std::uint64_t>{8, 0}));
  EXPECT_EQ(readerState(cutInside.reader), (State{3, 3, true}));

  // A region longer than what is left: the record reads nothing.
  CursorOver longRegion({0x05, 0x01});
  Varints none;
  EXPECT_FALSE(longRegion.cursor.readNested(longRegion.reader, none));
  EXPECT_TRUE(none.values.empty());
  EXPECT_EQ(readerState(longRegion.reader), (State{1, 2, true}));
}

TEST(ACursor, CountsTheValuesOfAKeyThatFollowOneAnotherWithoutMoving) {
  // After the key 0x82 0x01 (field 16, length-delimited): three values under it, then another.
  CursorOver over({0x01, 0xAA, 0x82, 0x01, 0x00, 0x82, 0x01, 0x02, 0xBB, 0xCC, 0x8A, 0x01, 0x01,
                   0xDD, 0x82, 0x01});
  EXPECT_EQ(over.cursor.countAdjacent(130), 3u);
  EXPECT_EQ(over.state(), (State{0, over.bytes.size(), false}));

  // A value whose length runs past the end still counts once its key is read.
  EXPECT_EQ(CursorOver({0x01, 0xAA, 0x12, 0x05, 0xBB}).cursor.countAdjacent(0x12), 2u);
  EXPECT_EQ(CursorOver({0x09}).cursor.countAdjacent(0x12), 1u);
}

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

TEST(APackedRun, RaisesARangeErrorNamingTheIndexAndTheCount) {
  PackedRun<std::int32_t> run;
  run.add(-5);
  run.add(7);
  EXPECT_EQ(run.at(1), 7);
  try {
    (void)run.at(2);
    FAIL() << "no exception";
  } catch (const std::out_of_range& error) {
    EXPECT_STREQ(error.what(), "idx (2) is out of range (2)");
  }
}

TEST(APackedRun, ReplacesItsValuesWithACopyAndComparesAndHashesByValue) {
  PackedRun<std::uint32_t> run;
  run.add(9);
  const std::uint32_t values[] = {1, 2, 3};
  run.set(values, 3);
  EXPECT_EQ(valuesOf(run), (std::vector<std::uint32_t>{1, 2, 3}));
  PackedRun<std::uint32_t> same;
  for (const std::uint32_t value : values)
    same.add(value);
  EXPECT_EQ(run, same);
  EXPECT_EQ(run.hash(), same.hash());
  same.add(4);
  EXPECT_NE(run, same);
  EXPECT_NE(run.hash(), same.hash());
  run.set(nullptr, 5);
  EXPECT_EQ(run.count(), 0u);
}

TEST(APackedRun, BecomesAListOfNumbersOfItsOwnSignedness) {
  PackedRun<std::int32_t> signedRun;
  signedRun.add(-3);
  PackedRun<std::uint32_t> unsignedRun;
  unsignedRun.add(3);
  EXPECT_EQ(platform::Value(signedRun.toList()).description(), "[-3]");
  EXPECT_EQ(signedRun.toList().front().kind(), platform::Value::Kind::Int32);
  EXPECT_EQ(unsignedRun.toList().front().kind(), platform::Value::Kind::UInt32);
}

}  // namespace
}  // namespace codec
