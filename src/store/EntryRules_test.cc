#include "store/EntryRules.h"

#include <gtest/gtest.h>

#include <cstdint>
#include <limits>

#include "tarn/sim/Units.h"

namespace store {
namespace {

using platform::Dictionary;
using platform::List;
using platform::Value;

// A formatter that shows which number it was given.
std::optional<std::string> tagged(double milliseconds) {
  if (milliseconds < 0) return std::nullopt;
  return "at " + std::to_string(static_cast<long long>(milliseconds));
}

Dictionary converted(Dictionary dictionary, EntryConversion conversion) {
  convertEntry(dictionary, conversion, tagged);
  return dictionary;
}

// The value the intake shows for a level the simulator encoded.
double shown(std::int64_t encoded, EntryRule rule) {
  const Dictionary level = converted({{"level", encoded}}, {"level", rule});
  return level.find("level")->asDouble().value_or(0.0);
}

TEST(EntryRules, ShowTheLevelsTheSimulatorEncodesWithinHalfAStep) {
  namespace units = tarn::sim::units;
  struct Range {
    EntryRule rule;
    std::uint32_t (*encode)(double);
    double low, high, tolerance;
  };
  const Range ranges[] = {
      {EntryRule::RsrpIndex, units::rsrpIndex, -139.0, -44.0, 0.5},
      {EntryRule::RsrqIndex, units::rsrqIndex, -19.5, -3.0, 0.25},
      {EntryRule::RscpIndex, units::rscpIndex, -116.0, -25.0, 0.5},
      {EntryRule::EcNoIndex, units::ecnoIndex, -24.5, 0.0, 0.25},
      {EntryRule::RxLevIndex, units::rxlevIndex, -110.0, -47.0, 0.5},
  };
  for (const Range& range : ranges) {
    for (double level = range.low; level <= range.high; level += 0.1)
      EXPECT_NEAR(shown(range.encode(level), range.rule), level, range.tolerance) << level;
  }
  EXPECT_NEAR(shown(units::centiDb(-98.504), EntryRule::CentiDbFloat), -98.5, 0.005);
  EXPECT_NEAR(shown(units::halfDb(12.4), EntryRule::SinrHalfDb), 12.5, 0.25);
}

TEST(EntryRules, LeaveEntriesOfAnotherTypeAsTheyAre) {
  for (const EntryRule rule : {EntryRule::CentiDbInteger, EntryRule::CentiDbFloat,
                               EntryRule::RsrpIndex, EntryRule::RsrqIndex, EntryRule::BandwidthCode,
                               EntryRule::HalvedBandwidth, EntryRule::TimestampText}) {
    const Dictionary text{{"level", "-98 dBm"}, {"other", 1}};
    EXPECT_EQ(converted(text, {"level", rule}), text);
    EXPECT_EQ(converted(text, {"missing", rule}), text);
  }
  // A fraction is no integer and no bandwidth code.
  const Dictionary fraction{{"dl_bw", 2.5}};
  EXPECT_EQ(converted(fraction, {"dl_bw", EntryRule::BandwidthCode}), fraction);
  EXPECT_EQ(converted(fraction, {"dl_bw", EntryRule::RxLevIndex}), fraction);
}

TEST(EntryRules, DropEveryBandwidthCodeOutsideTheTableButKeepWhatIsNoCode) {
  for (const Value& code : {Value(-1), Value(6), Value(std::int64_t{9})}) {
    EXPECT_EQ(converted({{"dl_bw", code}, {"earfcn", 300}}, {"dl_bw", EntryRule::BandwidthCode}),
              (Dictionary{{"earfcn", 300}}))
        << code.description();
  }
  for (const Value& notACode :
       {Value(std::uint32_t{4294967295u}), Value(std::int64_t{1} << 40), Value("3")}) {
    EXPECT_EQ(converted({{"dl_bw", notACode}}, {"dl_bw", EntryRule::BandwidthCode}),
              (Dictionary{{"dl_bw", notACode}}))
        << notACode.description();
  }
  EXPECT_EQ(converted({{"dl_bw", 0}}, {"dl_bw", EntryRule::BandwidthCode}),
            (Dictionary{{"dl_bw", 1.4f}}));
}

TEST(EntryRules, LeaveIndexesWhoseResultWouldOverflow) {
  const Dictionary lowest{{"rscp", std::numeric_limits<std::int64_t>::min()}};
  EXPECT_EQ(converted(lowest, {"rscp", EntryRule::RscpIndex}), lowest);
  const Dictionary huge{{"rscp", std::numeric_limits<std::uint64_t>::max()}};
  EXPECT_EQ(converted(huge, {"rscp", EntryRule::RscpIndex}), huge);
}

TEST(EntryRules, HalveOnly32BitBandwidths) {
  EXPECT_EQ(converted({{"dl_bw", -7}}, {"dl_bw", EntryRule::HalvedBandwidth}),
            (Dictionary{{"dl_bw", -3}}));
  const Dictionary wide{{"dl_bw", std::uint32_t{4000000000u}}};
  EXPECT_EQ(converted(wide, {"dl_bw", EntryRule::HalvedBandwidth}), wide);
}

TEST(EntryRules, KeepATimestampTheFormatterCannotShow) {
  EXPECT_EQ(
      converted({{"timestamp", std::uint64_t{1500}}}, {"timestamp", EntryRule::TimestampText}),
      (Dictionary{{"timestamp", "at 1500"}}));
  const Dictionary early{{"timestamp", -5}};
  EXPECT_EQ(converted(early, {"timestamp", EntryRule::TimestampText}), early);
}

TEST(EntryRules, RecogniseTheShapesThatBecomeText) {
  EXPECT_TRUE(hasShape(List{1, 3u, std::int64_t{7}}, ValueShape::IntegerList));
  EXPECT_TRUE(hasShape(List{}, ValueShape::IntegerList));
  EXPECT_FALSE(hasShape(List{1, 2.0}, ValueShape::IntegerList));
  EXPECT_FALSE(hasShape(List{true}, ValueShape::IntegerList));
  EXPECT_TRUE(hasShape(Dictionary{}, ValueShape::Dictionary));
  EXPECT_FALSE(hasShape(List{}, ValueShape::Dictionary));
  EXPECT_TRUE(hasShape(List{Dictionary{}, Dictionary{{"a", 1}}}, ValueShape::DictionaryList));
  EXPECT_FALSE(hasShape(List{Dictionary{}, 1}, ValueShape::DictionaryList));
  EXPECT_FALSE(hasShape(Dictionary{}, ValueShape::DictionaryList));
}

}  // namespace
}  // namespace store
