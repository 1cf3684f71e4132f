#include "codec/PackedRun.h"

#include <gtest/gtest.h>

namespace codec {
namespace {

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

TEST(APackedRun, ReplacesItsValuesWithACopy) {
  PackedRun<std::uint32_t> run;
  run.add(9);
  const std::uint32_t values[] = {1, 2, 3};
  run.set(values, 3);
  EXPECT_EQ(run.count(), 3u);
  EXPECT_EQ(run.values()[2], 3u);
  run.set(nullptr, 5);
  EXPECT_EQ(run.count(), 0u);
}

TEST(APackedRun, ComparesAndHashesByValue) {
  PackedRun<std::uint32_t> a;
  PackedRun<std::uint32_t> b;
  a.add(1);
  b.add(1);
  EXPECT_EQ(a, b);
  EXPECT_EQ(a.hash(), b.hash());
  b.add(2);
  EXPECT_NE(a, b);
  EXPECT_NE(a.hash(), b.hash());
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
