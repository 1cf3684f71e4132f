#pragma once

#include <cstddef>
#include <optional>

#include "tarn/sim/Network.h"
#include "tarn/sim/PhoneState.h"
#include "tarn/sim/Step.h"

namespace tarn::sim {

// UMTS radio resource control: idle mode and the connected states (CELL_DCH, CELL_FACH,
// URA_PCH) with their inactivity timers, soft handover of the best cell, radio link failure,
// and the moves to LTE (reselection or handover) and to GSM (reselection or cell change
// order).
class UmtsLink {
 public:
  enum class Exit { None, ToLte, ToLteConnected, ToGsm };

  explicit UmtsLink(const Network& network) : network_(network) {}

  std::optional<std::size_t> suitableCell(const Step& step) const;
  // Camps on `cell`; with `connected`, sets up a connection at once (after a redirection).
  void enter(const Step& step, std::size_t cell, bool connected);
  // Asks to leave UMTS with `Exit`; the phone then calls leave() if the other RAT takes it.
  Exit step(const Step& step, const Needs& needs);
  // Leaves UMTS; `handedOver` when a connection moves to LTE.
  void leave(const Step& step, bool handedOver);

  const UmtsState& state() const { return state_; }
  bool connected() const;

 private:
  Exit stepCamped(const Step& step, const Needs& needs);
  void stepDedicated(const Step& step, const Needs& needs);
  void reselect(const Step& step, double marginDb, double dwellMs);
  void establish(const Step& step, UmtsEstablishment cause);
  void setRrc(const Step& step, UmtsRrc rrc);
  bool lteInReach(const Step& step, double rsrpDbm) const;
  bool gsmInReach(const Step& step, double rxlevDbm) const;

  const Network& network_;
  UmtsState state_;
  Candidate candidate_;
  Dwell inactivity_;
  Dwell pagingOnly_;  // time in URA_PCH without traffic
  Dwell weakLink_;
  Dwell lteSeen_;
  Dwell gsmSeen_;  // compressed-mode measurement before a cell change order to GSM
};

}  // namespace tarn::sim
