#include "codec/Cursor.h"

#include <gtest/gtest.h>

#include <vector>

#include "codec/PackedRun.h"

namespace codec {
namespace {

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
  const platform::Bytes bytes = {0x08, 0x96};
  Reader reader(bytes);
  Cursor cursor(reader);
  EXPECT_EQ(cursor.readKey(), 0x08u);
  EXPECT_FALSE(cursor.hasError());
  EXPECT_EQ(cursor.readKey(), kWireEndGroup);
  EXPECT_EQ(stateOf(cursor, bytes), (State{2, 2, true}));
}

TEST(ACursor, ReadsTextAndBytesOrNothingWhenCutShort) {
  const platform::Bytes bytes = {0x02, 'h', 'i', 0x03, 0x00, 0xFF, 0x10, 0x04, 0x01};
  Reader reader(bytes);
  Cursor cursor(reader);
  EXPECT_EQ(cursor.readString(), std::optional<std::string>("hi"));
  EXPECT_EQ(cursor.readBytes(), std::optional<platform::Bytes>({0x00, 0xFF, 0x10}));
  EXPECT_EQ(cursor.readBytes(), std::nullopt);
  EXPECT_EQ(stateOf(cursor, bytes), (State{8, 9, true})) << "just past the length";
}

TEST(ACursor, ReadsAPackedRunWithinItsRegionOrASingleValueSentUnpacked) {
  const platform::Bytes bytes = {0x03, 0x01, 0x96, 0x01, 0x07, 0x05};
  Reader reader(bytes);
  Cursor cursor(reader);
  PackedRun<std::uint32_t> run;
  const auto narrow = [](std::uint64_t value) { return static_cast<std::uint32_t>(value); };
  ASSERT_TRUE(cursor.readPacked(kWireLengthDelimited, run, narrow));
  ASSERT_TRUE(cursor.readPacked(kWireVarint, run, narrow));
  EXPECT_EQ(std::vector<std::uint32_t>(run.begin(), run.end()),
            (std::vector<std::uint32_t>{1, 150, 7}));
  EXPECT_EQ(cursor.readVarint(), 5u);
  EXPECT_EQ(stateOf(cursor, bytes), (State{6, 6, false}));
}

TEST(ACursor, KeepsThePackedValuesReadBeforeTheInputWasCutShort) {
  const auto narrow = [](std::uint64_t value) { return static_cast<std::uint32_t>(value); };
  // The second value runs past its region: appended as 0, the position at the region's end.
  const platform::Bytes cutInside = {0x02, 0x04, 0x80, 0x05};
  Reader reader(cutInside);
  Cursor cursor(reader);
  PackedRun<std::uint32_t> run;
  EXPECT_FALSE(cursor.readPacked(kWireLengthDelimited, run, narrow));
  EXPECT_EQ(std::vector<std::uint32_t>(run.begin(), run.end()), (std::vector<std::uint32_t>{4, 0}));
  EXPECT_EQ(stateOf(cursor, cutInside), (State{3, 4, true}));

  const platform::Bytes longRegion = {0x05, 0x01};
  Reader longReader(longRegion);
  Cursor longCursor(longReader);
  PackedRun<std::uint32_t> none;
  EXPECT_FALSE(longCursor.readPacked(kWireLengthDelimited, none, narrow));
  EXPECT_EQ(none.count(), 0u);
  EXPECT_EQ(stateOf(longCursor, longRegion), (State{1, 2, true}));
}

TEST(ACursor, HandsANestedRecordTheReaderNarrowedToItsRegion) {
  const platform::Bytes bytes = {0x02, 0x08, 0x01, 0x7F};
  Reader reader(bytes);
  Cursor cursor(reader);
  Varints nested;
  ASSERT_TRUE(cursor.readNested(reader, nested));
  EXPECT_EQ(nested.values, (std::vector<std::uint64_t>{8, 1}));
  EXPECT_EQ(nested.readableLength, 3u);
  EXPECT_EQ(cursor.readVarint(), 0x7Fu);
  EXPECT_EQ(stateOf(cursor, bytes), (State{4, 4, false}));
}

TEST(ACursor, LeavesTheReaderWhereANestedRecordFailed) {
  // Cut short inside the record: the reader stays as the record left it, inside the region.
  const platform::Bytes cutInside = {0x02, 0x08, 0x80, 0x7F};
  Reader reader(cutInside);
  Cursor cursor(reader);
  Varints nested;
  EXPECT_FALSE(cursor.readNested(reader, nested));
  EXPECT_EQ(nested.values, (std::vector<std::uint64_t>{8, 0}));
  EXPECT_EQ((State{reader.position(), reader.length(), reader.hasError()}), (State{3, 3, true}));

  // A region longer than what is left: the record reads nothing.
  const platform::Bytes longRegion = {0x05, 0x01};
  Reader longReader(longRegion);
  Cursor longCursor(longReader);
  Varints none;
  EXPECT_FALSE(longCursor.readNested(longReader, none));
  EXPECT_TRUE(none.values.empty());
  EXPECT_EQ((State{longReader.position(), longReader.length(), longReader.hasError()}),
            (State{1, 2, true}));
}

TEST(ACursor, CountsTheValuesOfAKeyThatFollowOneAnotherWithoutMoving) {
  // After the key 0x82 0x01 (field 16, length-delimited): three values under it, then another.
  const platform::Bytes bytes = {0x01, 0xAA, 0x82, 0x01, 0x00, 0x82, 0x01, 0x02,
                                 0xBB, 0xCC, 0x8A, 0x01, 0x01, 0xDD, 0x82, 0x01};
  Reader reader(bytes);
  Cursor cursor(reader);
  EXPECT_EQ(cursor.countAdjacent(130), 3u);
  EXPECT_EQ(stateOf(cursor, bytes), (State{0, bytes.size(), false}));

  // A value whose length runs past the end still counts once its key is read.
  const platform::Bytes cut = {0x01, 0xAA, 0x12, 0x05, 0xBB};
  Reader cutReader(cut);
  EXPECT_EQ(Cursor(cutReader).countAdjacent(0x12), 2u);
  const platform::Bytes alone = {0x09};
  Reader aloneReader(alone);
  EXPECT_EQ(Cursor(aloneReader).countAdjacent(0x12), 1u);
}

}  // namespace
}  // namespace codec
