#include "series/SampleRing.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <vector>

namespace series {
namespace {

using ::testing::ElementsAreArray;

std::vector<Sample> samplesOf(const SampleRange& range) {
  return {range.begin(), range.end()};
}

// A ring holding the samples (t, t / 10) for t = 10, 20, ... count * 10.
SampleRing filled(std::size_t capacity, int count) {
  SampleRing ring(capacity);
  for (int i = 1; i <= count; ++i)
    ring.append(i * 10, static_cast<float>(i));
  return ring;
}

TEST(SampleRingTest, HoldsThePowerOfTwoAtOrAboveItsCapacity) {
  for (const auto& [asked, held] : std::vector<std::pair<std::size_t, std::size_t>>{
           {0, 1}, {1, 1}, {3, 4}, {4, 4}, {5, 8}, {8192, 8192}}) {
    EXPECT_EQ(SampleRing(asked).capacity(), held) << asked;
  }
}

TEST(SampleRingTest, KeepsTheLatestSamplesOldestFirst) {
  struct Case {
    int appended;
    std::vector<Sample> held;
  };
  const Case cases[] = {
      {0, {}},
      {1, {{10, 1}}},
      {4, {{10, 1}, {20, 2}, {30, 3}, {40, 4}}},
      {5, {{20, 2}, {30, 3}, {40, 4}, {50, 5}}},
      {11, {{80, 8}, {90, 9}, {100, 10}, {110, 11}}},
  };
  for (const Case& c : cases) {
    const SampleRing ring = filled(4, c.appended);
    EXPECT_THAT(samplesOf(ring.all()), ElementsAreArray(c.held)) << c.appended;
    EXPECT_EQ(ring.size(), c.held.size());
    EXPECT_EQ(ring.latest(), c.held.empty() ? std::nullopt : std::optional(c.held.back()));
  }
}

TEST(SampleRingTest, FindsTheSamplesSinceATimeAcrossTheWrap) {
  const SampleRing ring = filled(8, 13);  // holds t = 60 ... 130
  struct Case {
    std::int64_t since;
    std::size_t count;
    std::int64_t first;
  };
  const Case cases[] = {
      {-1000, 8, 60}, {60, 8, 60},   {61, 7, 70}, {100, 4, 100},
      {125, 1, 130},  {130, 1, 130}, {131, 0, 0},
  };
  for (const Case& c : cases) {
    const SampleRange range = ring.since(c.since);
    ASSERT_EQ(range.size(), c.count) << c.since;
    if (c.count > 0) {
      EXPECT_EQ(range[0].timeMs, c.first) << c.since;
      EXPECT_EQ(range[c.count - 1].timeMs, 130) << c.since;
    }
  }
  EXPECT_TRUE(SampleRing(4).since(0).empty());
}

TEST(SampleRingTest, ASampleFromThePastTakesTheLatestTime) {
  SampleRing ring(4);
  ring.append(100, 1.0F);
  ring.append(90, 2.0F);  // the wall clock stepped back
  ring.append(100, 3.0F);
  EXPECT_THAT(samplesOf(ring.all()),
              ElementsAreArray(std::vector<Sample>{{100, 1}, {100, 2}, {100, 3}}));
  EXPECT_EQ(ring.since(100).size(), 3u);
}

}  // namespace
}  // namespace series
