#include "app/SharedIntake.h"

#include <gtest/gtest.h>

#include "client/TarnWrapper.h"

namespace app {
namespace {

TEST(TheSharedIntake, ListensOnTheSharedSessionAndIsItsDelegate) {
  store::MetricValidator& intake = sharedIntake();
  EXPECT_EQ(&intake, &store::MetricValidator::sharedInstance());
  EXPECT_EQ(&sharedIntake(), &intake);
  ASSERT_NE(intake.mySharedTarnInstance(), nullptr);
  EXPECT_EQ(TarnWrapper::sharedInstance().delegate().lock().get(), &intake);
}

}  // namespace
}  // namespace app
