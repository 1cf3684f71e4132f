#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>

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

// A better cell that must stay the better one for a dwell time before the phone moves to it.
class Candidate {
 public:
  // Answers whether `cell` (none when no cell beats the serving one) has now been the candidate
  // for `neededMs`; a new cell starts the dwell anew.
  bool settled(std::optional<std::size_t> cell, double stepMs, double neededMs) {
    if (!cell) {
      cell_.reset();
      return false;
    }
    if (cell_ != cell) {
      cell_ = cell;
      dwell_.reset();
    }
    if (!dwell_.track(true, stepMs, neededMs)) return false;
    cell_.reset();
    return true;
  }
  void reset() { cell_.reset(); }

 private:
  std::optional<std::size_t> cell_;
  Dwell dwell_;
};

}  // namespace tarn::sim
