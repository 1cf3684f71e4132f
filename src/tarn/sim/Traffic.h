#pragma once

#include "tarn/sim/Random.h"

namespace tarn::sim {

// The user's data traffic, as a drive tester runs it: sessions of streaming or downloading
// (heavy) and of browsing and messaging (light), some started by the network (a push that
// pages the phone), with quiet gaps between them in which the radio connection is released.
class Traffic {
 public:
  enum class Demand { None, Light, Heavy };

  explicit Traffic(Random& random);

  void step(double seconds, Random& random);

  Demand demand() const { return demand_; }
  bool active() const { return demand_ != Demand::None; }
  // Whether the running session was started by the network rather than by the user.
  bool mobileTerminated() const { return mobileTerminated_; }

 private:
  void beginSession(Random& random);

  Demand demand_ = Demand::None;
  bool mobileTerminated_ = false;
  bool firstSession_ = true;  // the drive opens with a long user-started stream
  double remainingS_;
};

}  // namespace tarn::sim
