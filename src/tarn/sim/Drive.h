#pragma once

#include <optional>

#include "tarn/sim/Random.h"

namespace tarn::sim {

// The car: it cruises at a speed that suits each stretch of road, stops at red lights in the
// city, and parks for a while at either end of the road before driving back.
class Drive {
 public:
  Drive();

  void step(double seconds, Random& random);

  double positionM() const { return positionM_; }
  double speedMps() const { return speedMps_; }

 private:
  // Where the car must next come to a halt, if anywhere within braking reach.
  std::optional<double> stopAheadM(Random& random);
  void arrive(Random& random);

  double positionM_;
  double speedMps_ = 0.0;
  double heading_ = 1.0;  // +1 driving out, -1 driving back
  double cruiseMps_ = 0.0;
  double cruiseHeldS_ = 0.0;
  double waitS_ = 0.0;
  std::optional<double> decidedLightM_;
  bool lightIsRed_ = false;
};

}  // namespace tarn::sim
