#include "tarn/flow/KindQueue.h"

#include <gtest/gtest.h>

#include <algorithm>

#include "tarn/flow/DropTally.h"

namespace tarn::flow {
namespace {

using namespace std::chrono_literals;

TEST(AKindQueue, WhenFullDropsTheOldestOfTheKindWithTheMostWaitingAndKeepsTheOrder) {
  KindQueue<int> queue(4);
  // Kind 1 comes often, kind 2 once: the rare one stays however many of the frequent one come.
  EXPECT_EQ(queue.push(1, 10), std::nullopt);
  EXPECT_EQ(queue.push(2, 20), std::nullopt);
  EXPECT_EQ(queue.push(1, 11), std::nullopt);
  EXPECT_EQ(queue.push(1, 12), std::nullopt);
  EXPECT_EQ(queue.push(1, 13), 1u);
  EXPECT_EQ(queue.push(3, 30), 1u);
  EXPECT_EQ(queue.size(), 4u);
  EXPECT_EQ(queue.takeAll(), (std::vector<int>{20, 12, 13, 30}));
  EXPECT_EQ(queue.size(), 0u);
  EXPECT_EQ(queue.push(1, 14), std::nullopt);
  EXPECT_EQ(queue.takeAll(), (std::vector<int>{14}));
}

TEST(AKindQueue, StaysWithinItsCapacityUnderAFlood) {
  KindQueue<std::uint64_t> queue(100);
  std::size_t dropped = 0;
  for (std::uint64_t i = 0; i < 100'000; ++i) {
    if (queue.push(i % 7, i)) ++dropped;
    ASSERT_LE(queue.size(), 100u);
  }
  EXPECT_EQ(dropped, 100'000u - 100u);
  // The newest of each kind survives.
  const std::vector<std::uint64_t> kept = queue.takeAll();
  for (std::uint64_t newest = 100'000 - 7; newest < 100'000; ++newest) {
    EXPECT_NE(std::find(kept.begin(), kept.end(), newest), kept.end()) << newest;
  }
}

TEST(ADropTally, ReportsTheDropsByKindAtMostOnceASecond) {
  DropTally tally("tarnd");
  const auto start = DropTally::Clock::time_point() + 1h;
  EXPECT_EQ(tally.report(start), std::nullopt);
  tally.count(0x3C4E04);
  tally.count(0x3C4E04);
  tally.count(0);
  EXPECT_EQ(tally.report(start),
            "tarnd: fell behind; dropped 3 event(s), the oldest of their kind: events \u00D71, "
            "0x3C4E04 \u00D72");
  tally.count(0x3CD313);
  EXPECT_EQ(tally.report(start + 999ms), std::nullopt);
  EXPECT_EQ(tally.report(start + 1s),
            "tarnd: fell behind; dropped 1 event(s), the oldest of their kind: 0x3CD313 \u00D71");
  EXPECT_EQ(tally.report(start + 5s), std::nullopt);
}

}  // namespace
}  // namespace tarn::flow
