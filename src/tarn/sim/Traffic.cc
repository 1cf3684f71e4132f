#include "tarn/sim/Traffic.h"

namespace tarn::sim {
namespace {

constexpr double kHeavyShare = 0.4;
constexpr double kNetworkStartedShare = 0.25;

}  // namespace

Traffic::Traffic(Random& random) : remainingS_(random.uniform(4.0, 8.0)) {}

void Traffic::step(double seconds, Random& random) {
  remainingS_ -= seconds;
  if (remainingS_ > 0.0) return;
  if (demand_ == Demand::None) {
    beginSession(random);
  } else {
    demand_ = Demand::None;
    remainingS_ = random.uniform(8.0, 40.0);
  }
}

void Traffic::beginSession(Random& random) {
  if (firstSession_) {
    firstSession_ = false;
    demand_ = Demand::Heavy;
    mobileTerminated_ = false;
    remainingS_ = random.uniform(100.0, 200.0);
    return;
  }
  const bool heavy = random.chance(kHeavyShare);
  demand_ = heavy ? Demand::Heavy : Demand::Light;
  mobileTerminated_ = random.chance(kNetworkStartedShare);
  remainingS_ = heavy ? random.uniform(30.0, 150.0) : random.uniform(3.0, 20.0);
}

}  // namespace tarn::sim
