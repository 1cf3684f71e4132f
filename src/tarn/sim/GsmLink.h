#pragma once

#include <cstddef>
#include <optional>

#include "tarn/sim/Network.h"
#include "tarn/sim/PhoneState.h"
#include "tarn/sim/Step.h"

namespace tarn::sim {

// GSM radio resource management: cell reselection, the dedicated channel of a location
// update, and the reselection back to UMTS or LTE once either is good enough. Data flows
// over GPRS without changing the reported state.
class GsmLink {
 public:
  enum class Exit { None, ToUmts, ToLte };

  explicit GsmLink(const Network& network) : network_(network) {}

  std::optional<std::size_t> suitableCell(const Step& step) const;
  void enter(const Step& step, std::size_t cell);
  // With `needs.signalling`, seizes a dedicated channel for a location update.
  // Asks to leave GSM with `Exit`; the phone then calls leave() if the other RAT takes it.
  Exit step(const Step& step, const Needs& needs);
  void leave() { state_ = {}; }
  // Whether a location update's dedicated channel was released since the last call.
  bool takeFinishedSignalling();

  const GsmState& state() const { return state_; }

 private:
  void reselect(const Step& step);
  bool umtsInReach(const Step& step) const;
  bool lteInReach(const Step& step) const;

  const Network& network_;
  GsmState state_;
  double dedicatedLeftMs_ = 0.0;
  bool signallingFinished_ = false;
  Candidate candidate_;
  Dwell umtsSeen_;
  Dwell lteSeen_;
};

}  // namespace tarn::sim
