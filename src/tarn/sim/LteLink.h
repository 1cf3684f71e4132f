#pragma once

#include <cstddef>
#include <optional>

#include "tarn/sim/Network.h"
#include "tarn/sim/PhoneState.h"
#include "tarn/sim/Step.h"

namespace tarn::sim {

// LTE radio resource control: cell selection and reselection in idle mode, connection set-up
// and release, handovers, carrier aggregation, radio link failure with re-establishment, and
// the decision to leave LTE for UMTS when coverage ends.
class LteLink {
 public:
  enum class Exit { None, ToUmts, ToUmtsConnected };

  explicit LteLink(const Network& network) : network_(network) {}

  // Whether a cell good enough to camp on is in reach.
  std::optional<std::size_t> suitableCell(const Step& step) const;
  // Camps on `cell`; with `connected`, takes over a connection handed in from another RAT.
  void enter(const Step& step, std::size_t cell, bool connected);
  // Asks to leave LTE with `Exit`; the phone then calls leave() if the other RAT takes it.
  Exit step(const Step& step, const Needs& needs);
  // Leaves LTE; `redirected` when the network sends the connection to UMTS.
  void leave(const Step& step, bool redirected);

  const LteState& state() const { return state_; }

 private:
  Exit stepIdle(const Step& step, const Needs& needs);
  void stepConnecting(const Step& step);
  Exit stepConnected(const Step& step, const Needs& needs);
  std::optional<std::size_t> preferredCell(const Step& step, bool connected) const;
  bool reselect(const Step& step, bool connected);
  void manageCarrierAggregation(const Step& step, const Needs& needs);
  void addSecondaries(const Step& step);
  void dropSecondaries(const Step& step);
  void setRrc(const Step& step, LteRrc rrc, LteCause cause);
  bool umtsInReach(const Step& step, double rscpDbm) const;
  const LteLevel& serving(const Step& step) const { return step.radio.lte()[*state_.serving]; }

  const Network& network_;
  LteState state_;
  LteCause connectCause_ = messages::KCellularLteRrcState::KLTE_RRC_CAUSE_EST_MO_DATA;
  Candidate candidate_;
  Dwell cellSearch_;
  Dwell outOfSync_;       // radio link monitoring (T310)
  Dwell edgeOfCoverage_;  // inter-RAT measurement before a redirection
  Dwell inactivity_;
  Dwell connectedFor_;
  Dwell lightTraffic_;          // the secondary cell deactivation timer
  double reestablishMs_ = 0.0;  // T311 left while re-establishing
};

}  // namespace tarn::sim
