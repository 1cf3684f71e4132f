#include "ui/Timer.h"

#include <gtest/gtest.h>

#include <optional>

#include "platform/MainQueue.h"

namespace ui {
namespace {

using namespace std::chrono_literals;

bool runFor(std::chrono::milliseconds duration) {
  return platform::runMainQueueUntil([] { return false; }, duration);
}

TEST(ATimer, RepeatsOnTheMainQueueUntilInvalidated) {
  int fired = 0;
  bool onMainQueue = true;
  Timer timer = Timer::scheduledTimer(
      10ms,
      [&] {
        ++fired;
        onMainQueue = onMainQueue && platform::isMainQueue();
      },
      true);
  ASSERT_TRUE(platform::runMainQueueUntil([&] { return fired == 3; }, 2s));
  EXPECT_TRUE(onMainQueue);
  EXPECT_TRUE(timer.isValid());

  timer.invalidate();
  EXPECT_FALSE(timer.isValid());
  runFor(40ms);
  EXPECT_EQ(fired, 3);
}

TEST(ATimer, ThatDoesNotRepeatFiresOnceAndThenIsInvalid) {
  int fired = 0;
  Timer timer = Timer::scheduledTimer(
      5ms, [&] { ++fired; }, false);
  runFor(40ms);
  EXPECT_EQ(fired, 1);
  EXPECT_FALSE(timer.isValid());
}

TEST(ATimer, StopsWhenItsHandleIsDestroyedEvenFromItsOwnAction) {
  int fired = 0;
  std::optional<Timer> timer;
  timer = Timer::scheduledTimer(
      5ms,
      [&] {
        ++fired;
        timer.reset();
      },
      true);
  runFor(40ms);
  EXPECT_EQ(fired, 1);

  {
    Timer gone = Timer::scheduledTimer(
        5ms, [&] { ++fired; }, true);
  }
  runFor(30ms);
  EXPECT_EQ(fired, 1);
}

TEST(ATimer, ThatIsReplacedByAssignmentStops) {
  int old = 0;
  Timer timer = Timer::scheduledTimer(
      5ms, [&] { ++old; }, true);
  timer = Timer::scheduledTimer(
      1h, [] {}, true);
  runFor(30ms);
  EXPECT_EQ(old, 0);
}

}  // namespace
}  // namespace ui
