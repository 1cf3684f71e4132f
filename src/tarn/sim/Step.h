#pragma once

#include <cstdint>

#include "tarn/sim/PhoneState.h"
#include "tarn/sim/Radio.h"
#include "tarn/sim/Random.h"

namespace tarn::sim {

// One step of simulated time, as the phone's protocol layers see it.
struct Step {
  std::uint64_t nowMs;
  double ms;
  const Radio& radio;
  Random& random;
  const ChangeSink& report;
};

// What the phone wants from its radio connection in a step.
struct Needs {
  bool data;              // user traffic is flowing
  bool heavy;             // enough of it to use extra carriers or a dedicated channel
  bool mobileTerminated;  // the traffic was started by the network, which paged the phone
  bool signalling;        // a mobility management procedure waits for a connection
};

// Time spent while a condition holds; reset when it stops holding.
class Dwell {
 public:
  // Adds the step when `holds`, and answers whether it has held for `neededMs`.
  bool track(bool holds, double stepMs, double neededMs) {
    heldMs_ = holds ? heldMs_ + stepMs : 0.0;
    return holds && heldMs_ >= neededMs;
  }
  void reset() { heldMs_ = 0.0; }

 private:
  double heldMs_ = 0.0;
};

}  // namespace tarn::sim
