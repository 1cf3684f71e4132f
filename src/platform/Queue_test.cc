#include <gtest/gtest.h>

#include <atomic>
#include <chrono>
#include <future>
#include <thread>
#include <vector>

#include "platform/MainQueue.h"
#include "platform/SerialQueue.h"

using namespace std::chrono_literals;
using platform::SerialQueue;

namespace {

void drain(const SerialQueue& queue) {
  std::promise<void> done;
  queue.async([&done] { done.set_value(); });
  done.get_future().wait();
}

TEST(ASerialQueue, RunsTasksOneAtATimeOnItsOwnThreadInTheOrderTheyWereQueuedThroughAnyHandle) {
  SerialQueue queue("org.norvo.test.order");
  const SerialQueue copy = queue;
  std::vector<int> order;
  std::atomic<int> running = 0;
  bool overlapped = false;
  bool alwaysCurrent = true;
  for (int i = 0; i < 200; ++i) {
    (i % 2 == 0 ? queue : copy).async([&, i] {
      overlapped = overlapped || running.fetch_add(1) != 0;
      alwaysCurrent = alwaysCurrent && queue.isCurrent();
      order.push_back(i);
      running.fetch_sub(1);
    });
  }
  drain(queue);

  EXPECT_FALSE(overlapped);
  EXPECT_TRUE(alwaysCurrent);
  EXPECT_FALSE(queue.isCurrent());
  ASSERT_EQ(order.size(), 200u);
  for (int i = 0; i < 200; ++i)
    EXPECT_EQ(order[static_cast<std::size_t>(i)], i);
}

TEST(ASerialQueue, RunsTheTasksAlreadyQueuedBeforeItsLastHandleGoes) {
  std::atomic<int> ran = 0;
  {
    const SerialQueue queue("org.norvo.test.drain");
    queue.async([] { std::this_thread::sleep_for(20ms); });
    for (int i = 0; i < 10; ++i)
      queue.async([&ran] { ran.fetch_add(1); });
  }
  EXPECT_EQ(ran.load(), 10);
}

TEST(ASerialQueue, EndsCleanlyWhenItsLastHandleGoesInsideItsOwnTask) {
  auto queue = std::make_shared<SerialQueue>("org.norvo.test.self");
  std::promise<void> released;
  queue->async([&queue, &released] {
    queue.reset();
    released.set_value();
  });
  EXPECT_EQ(released.get_future().wait_for(5s), std::future_status::ready);
}

TEST(AMainQueue, RunsTasksPostedFromOtherThreadsOnTheThreadThatRunsIt) {
  const SerialQueue queue("org.norvo.test.poster");
  std::atomic<int> ran = 0;
  bool onMainThread = true;
  const std::thread::id mainThread = std::this_thread::get_id();
  for (int i = 0; i < 5; ++i) {
    queue.async([&] {
      platform::postToMainQueue([&] {
        onMainThread =
            onMainThread && platform::isMainQueue() && std::this_thread::get_id() == mainThread;
        ran.fetch_add(1);
      });
    });
  }

  EXPECT_TRUE(platform::runMainQueueUntil([&] { return ran.load() == 5; }, 5s));
  EXPECT_TRUE(onMainThread);
  EXPECT_FALSE(platform::isMainQueue());
}

TEST(AMainQueue, GivesUpWaitingAtTheTimeoutAndRunsAgainAfterItWasStopped) {
  const auto start = std::chrono::steady_clock::now();
  EXPECT_FALSE(platform::runMainQueueUntil([] { return false; }, 50ms));
  EXPECT_GE(std::chrono::steady_clock::now() - start, 50ms);

  platform::postToMainQueue([] { platform::stopMainQueue(); });
  platform::runMainQueue();
  bool ran = false;
  platform::postToMainQueue([&ran] { ran = true; });
  EXPECT_TRUE(platform::runMainQueueUntil([&ran] { return ran; }, 5s));
}

}  // namespace
