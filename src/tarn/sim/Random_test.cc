#include "tarn/sim/Random.h"

#include <gtest/gtest.h>

#include <cmath>
#include <set>

namespace tarn::sim {
namespace {

TEST(ARandom, FollowsTheReferenceSequenceOfXoshiro256StarStarSeededBySplitmix64) {
  Random random(0);
  EXPECT_EQ(random.next(), 0x99EC5F36CB75F2B4u);
  EXPECT_EQ(random.next(), 0xBF6E1F784956452Au);
  EXPECT_EQ(random.next(), 0x1A5F849D4933E6E0u);
}

TEST(ARandom, RepeatsItselfForTheSameSeedOnly) {
  Random a(17);
  Random b(17);
  Random c(18);
  bool differs = false;
  for (int i = 0; i < 100; ++i) {
    const std::uint64_t value = a.next();
    EXPECT_EQ(value, b.next());
    differs = differs || value != c.next();
  }
  EXPECT_TRUE(differs);
}

TEST(ARandom, DrawsIntegersFromTheWholeClosedRange) {
  Random random(3);
  std::set<std::int64_t> drawn;
  for (int i = 0; i < 1000; ++i) {
    const std::int64_t value = random.between(-2, 2);
    ASSERT_GE(value, -2);
    ASSERT_LE(value, 2);
    drawn.insert(value);
  }
  EXPECT_EQ(drawn.size(), 5u);
}

TEST(ARandom, DrawsUniformNormalAndExponentialValuesWithTheirMoments) {
  Random random(5);
  constexpr int kSamples = 20000;
  double uniformSum = 0.0;
  double normalSum = 0.0;
  double normalSquares = 0.0;
  double exponentialSum = 0.0;
  for (int i = 0; i < kSamples; ++i) {
    const double unit = random.unit();
    ASSERT_GE(unit, 0.0);
    ASSERT_LT(unit, 1.0);
    uniformSum += random.uniform(10.0, 20.0);
    const double normal = random.normal(-3.0, 2.0);
    normalSum += normal;
    normalSquares += normal * normal;
    exponentialSum += random.exponential(4.0);
  }
  const double normalMean = normalSum / kSamples;
  EXPECT_NEAR(uniformSum / kSamples, 15.0, 0.1);
  EXPECT_NEAR(normalMean, -3.0, 0.05);
  EXPECT_NEAR(std::sqrt(normalSquares / kSamples - normalMean * normalMean), 2.0, 0.05);
  EXPECT_NEAR(exponentialSum / kSamples, 4.0, 0.1);
}

}  // namespace
}  // namespace tarn::sim
