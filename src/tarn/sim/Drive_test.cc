#include "tarn/sim/Drive.h"

#include <gtest/gtest.h>

#include <algorithm>

#include "tarn/sim/Route.h"

namespace tarn::sim {
namespace {

TEST(ADrive, KeepsToTheRoadAndToTheSpeedOfEachStretch) {
  Random random(4);
  Drive drive;
  for (int step = 0; step < 20 * 60 * 10; ++step) {
    drive.step(0.1, random);
    ASSERT_GE(drive.positionM(), 0.0);
    ASSERT_LE(drive.positionM(), route::kLengthM);
    // The car slows down over a few seconds after entering a slower stretch.
    const double at = drive.positionM();
    const double limitKmh = std::max({route::zoneAt(at - 150.0).maxKmh, route::zoneAt(at).maxKmh,
                                      route::zoneAt(at + 150.0).maxKmh});
    EXPECT_LE(drive.speedMps(), limitKmh / 3.6 + 0.01);
  }
}

TEST(ADrive, StopsAtCityLightsAndDrivesOutAndBackBetweenTheEndsOfTheRoad) {
  Random random(4);
  Drive drive;
  bool stoppedInTown = false;
  bool reachedFarEnd = false;
  bool cameBack = false;
  for (int step = 0; step < 20 * 60 * 10; ++step) {
    drive.step(0.1, random);
    const double at = drive.positionM();
    if (drive.speedMps() == 0.0 && at > 1.0 && at < 2200.0) stoppedInTown = true;
    if (at > route::kLengthM - 1.0) reachedFarEnd = true;
    if (reachedFarEnd && at < 1.0) cameBack = true;
  }
  EXPECT_TRUE(stoppedInTown);
  EXPECT_TRUE(reachedFarEnd);
  EXPECT_TRUE(cameBack);
}

}  // namespace
}  // namespace tarn::sim
