#include "tarn/sim/LteLink.h"

#include <algorithm>

namespace tarn::sim {
namespace {

using Rrc = messages::KCellularLteRrcState;
using Scc = messages::SecondaryComponentCarrier;

// Idle-mode thresholds (as broadcast in the system information) and connected-mode
// measurement events, in dBm and dB.
constexpr double kSuitableDbm = -120.0;
constexpr double kPrimaryBandKeepDbm = -114.0;    // stay on 1800 MHz above this
constexpr double kPrimaryBandReturnDbm = -108.0;  // go back to 1800 MHz above this
constexpr double kIdleHysteresisDb = 4.0;
constexpr double kHandoverOffsetDb = 3.0;
constexpr double kLeaveIdleDbm = -118.0;
constexpr double kUmtsAcceptDbm = -108.0;
constexpr double kRedirectServingDbm = -112.0;
constexpr double kRedirectUmtsDbm = -100.0;
constexpr double kOutOfSyncSinrDb = -8.0;
constexpr double kReestablishSinrDb = -6.0;
constexpr double kSecondaryAddDbm = -112.0;
constexpr double kSecondaryDropDbm = -118.0;

// Timers, in milliseconds.
constexpr double kCellSearchMs = 1000.0;
constexpr double kReselectionMs = 1000.0;
constexpr double kTimeToTriggerMs = 320.0;
constexpr double kT310Ms = 1000.0;
constexpr double kT311Ms = 5000.0;
constexpr double kInactivityMs = 10000.0;
constexpr double kRedirectMeasurementMs = 1280.0;
constexpr double kCarrierAggregationAfterMs = 1500.0;
constexpr double kSecondaryDeactivationMs = 3000.0;
// Each step at the edge of coverage, the network may already have sent the redirection.
constexpr double kRedirectChancePerStep = 0.15;

}  // namespace

std::optional<std::size_t> LteLink::suitableCell(const Step& step) const {
  const auto preferred = preferredCell(step, false);
  if (preferred && step.radio.lte()[*preferred].rsrpDbm > kSuitableDbm) return preferred;
  return std::nullopt;
}

void LteLink::enter(const Step& step, std::size_t cell, bool connected) {
  cellSearch_.reset();
  state_.serving = cell;
  candidate_.reset();
  step.report(Change::LteCell);
  if (!connected) {
    setRrc(step, Rrc::KLTE_RRC_STATE_IDLE, Rrc::KLTE_RRC_CAUSE_NA);
    return;
  }
  setRrc(step, Rrc::KLTE_RRC_STATE_ATMPT_INBND_MOBILITY,
         Rrc::KLTE_RRC_CAUSE_EST_SUCC_MOB_TO_EUTRAN);
  setRrc(step, Rrc::KLTE_RRC_STATE_CONNECTED, Rrc::KLTE_RRC_CAUSE_EST_SUCC_MOB_TO_EUTRAN);
  inactivity_.reset();
  connectedFor_.reset();
  step.report(Change::LteDrx);
}

void LteLink::leave(const Step& step, bool redirected) {
  if (redirected) {
    dropSecondaries(step);
    setRrc(step, Rrc::KLTE_RRC_STATE_ATMPT_OUTBND_MOBILITY, Rrc::KLTE_RRC_CAUSE_NA);
    setRrc(step, Rrc::KLTE_RRC_STATE_NULL, Rrc::KLTE_RRC_CAUSE_REL_SUCC_MOB_FROM_EUTRAN);
  } else if (state_.rrc != Rrc::KLTE_RRC_STATE_NULL) {
    setRrc(step, Rrc::KLTE_RRC_STATE_NULL, Rrc::KLTE_RRC_CAUSE_NA);
  }
  state_.serving.reset();
  candidate_.reset();
}

LteLink::Exit LteLink::step(const Step& step, const Needs& needs) {
  switch (state_.rrc) {
    case Rrc::KLTE_RRC_STATE_NULL:
      if (!cellSearch_.track(true, step.ms, kCellSearchMs)) return Exit::None;
      if (const auto cell = suitableCell(step)) {
        enter(step, *cell, false);
      } else if (umtsInReach(step, kUmtsAcceptDbm)) {
        return Exit::ToUmts;
      }
      return Exit::None;
    case Rrc::KLTE_RRC_STATE_IDLE:
      return stepIdle(step, needs);
    case Rrc::KLTE_RRC_STATE_ATMPT_CONNECTION:
      stepConnecting(step);
      return Exit::None;
    case Rrc::KLTE_RRC_STATE_CONNECTED:
      return stepConnected(step, needs);
    default:  // a release in progress ends in idle mode
      setRrc(step, Rrc::KLTE_RRC_STATE_IDLE, Rrc::KLTE_RRC_CAUSE_REL_OTHER);
      step.report(Change::LteDrx);
      return Exit::None;
  }
}

LteLink::Exit LteLink::stepIdle(const Step& step, const Needs& needs) {
  const LteLevel& level = serving(step);
  if (level.rsrpDbm < kLeaveIdleDbm && umtsInReach(step, kUmtsAcceptDbm)) return Exit::ToUmts;
  if (level.rsrpDbm < kLteDetectableDbm) {
    setRrc(step, Rrc::KLTE_RRC_STATE_NULL, Rrc::KLTE_RRC_CAUSE_NO_SERVICE);
    state_.serving.reset();
    return Exit::None;
  }
  reselect(step, false);
  if (needs.signalling || needs.data) {
    connectCause_ = needs.signalling         ? Rrc::KLTE_RRC_CAUSE_EST_MO_SIGNAL
                    : needs.mobileTerminated ? Rrc::KLTE_RRC_CAUSE_EST_MT_ACC
                                             : Rrc::KLTE_RRC_CAUSE_EST_MO_DATA;
    setRrc(step, Rrc::KLTE_RRC_STATE_ATMPT_CONNECTION, connectCause_);
  }
  return Exit::None;
}

void LteLink::stepConnecting(const Step& step) {
  if (reestablishMs_ <= 0.0) {
    setRrc(step, Rrc::KLTE_RRC_STATE_CONNECTED, connectCause_);
  } else {
    reestablishMs_ -= step.ms;
    const auto cell = suitableCell(step);
    if (cell && step.radio.lte()[*cell].sinrDb > kReestablishSinrDb) {
      reestablishMs_ = 0.0;
      if (cell != state_.serving) {
        state_.serving = cell;
        step.report(Change::LteCell);
      }
      setRrc(step, Rrc::KLTE_RRC_STATE_CONNECTED, Rrc::KLTE_RRC_CAUSE_REEST_OTHER_FAIL_T310_EXP);
    } else if (reestablishMs_ <= 0.0) {
      setRrc(step, Rrc::KLTE_RRC_STATE_IDLE, Rrc::KLTE_RRC_CAUSE_REL_CONN_FAIL_T311_EXP);
      step.report(Change::LteDrx);
      return;
    } else {
      return;
    }
  }
  inactivity_.reset();
  connectedFor_.reset();
  outOfSync_.reset();
  edgeOfCoverage_.reset();
  step.report(Change::LteDrx);
}

LteLink::Exit LteLink::stepConnected(const Step& step, const Needs& needs) {
  if (inactivity_.track(!needs.data && !needs.signalling, step.ms, kInactivityMs)) {
    dropSecondaries(step);
    setRrc(step, Rrc::KLTE_RRC_STATE_ENDING, Rrc::KLTE_RRC_CAUSE_REL_OTHER);
    return Exit::None;
  }
  const LteLevel& level = serving(step);
  const bool outOfSync = level.sinrDb < kOutOfSyncSinrDb || level.rsrpDbm < kLteDetectableDbm;
  if (outOfSync_.track(outOfSync, step.ms, kT310Ms)) {
    step.report(Change::LteRadioLinkFailure);
    dropSecondaries(step);
    outOfSync_.reset();
    reestablishMs_ = kT311Ms;
    setRrc(step, Rrc::KLTE_RRC_STATE_ATMPT_CONNECTION,
           Rrc::KLTE_RRC_CAUSE_REEST_OTHER_FAIL_T310_EXP);
    return Exit::None;
  }
  const auto preferred = preferredCell(step, true);
  const bool lteEnds =
      level.rsrpDbm < kRedirectServingDbm && (!preferred || preferred == state_.serving);
  if (edgeOfCoverage_.track(lteEnds && umtsInReach(step, kRedirectUmtsDbm), step.ms,
                            kRedirectMeasurementMs) &&
      step.random.chance(kRedirectChancePerStep)) {
    return Exit::ToUmtsConnected;
  }
  reselect(step, true);
  manageCarrierAggregation(step, needs);
  return Exit::None;
}

std::optional<std::size_t> LteLink::preferredCell(const Step& step, bool connected) const {
  const auto& levels = step.radio.lte();
  const auto onBand = [this](std::uint32_t band) {
    return [this, band](std::size_t i) {
      return network_.lte[i].anchor && network_.lte[i].band == band;
    };
  };
  const auto primary = step.radio.bestLte(onBand(3));
  const auto coverage = step.radio.bestLte(onBand(20));
  const bool onPrimary = state_.serving && network_.lte[*state_.serving].band == 3;
  const double primaryNeededDbm = onPrimary ? kPrimaryBandKeepDbm : kPrimaryBandReturnDbm;
  auto choice = primary && levels[*primary].rsrpDbm > primaryNeededDbm ? primary : coverage;
  if (!choice) choice = primary;
  if (!choice || !state_.serving || *choice == *state_.serving) return choice;

  // On the serving carrier a neighbour must be better by the hysteresis.
  const std::size_t current = *state_.serving;
  if (network_.lte[*choice].dlEarfcn != network_.lte[current].dlEarfcn) return choice;
  const double margin = connected ? kHandoverOffsetDb : kIdleHysteresisDb;
  return levels[*choice].rsrpDbm > levels[current].rsrpDbm + margin ? choice : state_.serving;
}

bool LteLink::reselect(const Step& step, bool connected) {
  auto target = preferredCell(step, connected);
  if (target == state_.serving) target.reset();
  if (!candidate_.settled(target, step.ms, connected ? kTimeToTriggerMs : kReselectionMs))
    return false;
  if (connected) dropSecondaries(step);
  state_.serving = target;
  step.report(Change::LteCell);
  return true;
}

void LteLink::manageCarrierAggregation(const Step& step, const Needs& needs) {
  const bool established = connectedFor_.track(true, step.ms, kCarrierAggregationAfterMs);
  const bool quiet = lightTraffic_.track(!needs.heavy, step.ms, kSecondaryDeactivationMs);
  if (state_.secondaries.empty()) {
    if (established && needs.heavy) addSecondaries(step);
    return;
  }
  const auto fading = [&step](const SecondaryCarrier& scc) {
    return step.radio.lte()[scc.cell].rsrpDbm < kSecondaryDropDbm;
  };
  if (std::any_of(state_.secondaries.begin(), state_.secondaries.end(), fading)) {
    for (SecondaryCarrier& scc : state_.secondaries) {
      if (fading(scc)) scc.state = Scc::SCC_STATE_DECONFIGURED;
    }
    step.report(Change::LteCarriers);
    std::erase_if(state_.secondaries, fading);
    return;
  }
  bool changed = false;
  for (SecondaryCarrier& scc : state_.secondaries) {
    if (needs.heavy && scc.state == Scc::SCC_STATE_CONFIGURED_DEACTIVATED) {
      scc.state = Scc::SCC_STATE_ACTIVATED;
      changed = true;
    } else if (quiet && scc.state == Scc::SCC_STATE_ACTIVATED) {
      scc.state = Scc::SCC_STATE_CONFIGURED_DEACTIVATED;
      changed = true;
    }
  }
  if (changed) step.report(Change::LteCaState);
}

// The secondary carriers are the other carriers of the primary cell's site.
void LteLink::addSecondaries(const Step& step) {
  const LteCell& primary = network_.lte[*state_.serving];
  for (std::size_t i = 0; i < network_.lte.size() && state_.secondaries.size() < 2; ++i) {
    const LteCell& cell = network_.lte[i];
    if (cell.site != primary.site || cell.dlEarfcn == primary.dlEarfcn) continue;
    if (step.radio.lte()[i].rsrpDbm < kSecondaryAddDbm) continue;
    state_.secondaries.push_back({i, Scc::SCC_STATE_CONFIGURED_DEACTIVATED});
  }
  if (!state_.secondaries.empty()) step.report(Change::LteCarriers);
}

void LteLink::dropSecondaries(const Step& step) {
  if (state_.secondaries.empty()) return;
  for (SecondaryCarrier& scc : state_.secondaries)
    scc.state = Scc::SCC_STATE_DECONFIGURED;
  step.report(Change::LteCarriers);
  state_.secondaries.clear();
}

void LteLink::setRrc(const Step& step, LteRrc rrc, LteCause cause) {
  state_.previousRrc = state_.rrc;
  state_.previousDurationMs =
      static_cast<std::uint32_t>(step.nowMs - state_.rrcSinceMs.value_or(step.nowMs));
  state_.rrcSinceMs = step.nowMs;
  state_.rrc = rrc;
  state_.cause = cause;
  step.report(Change::LteRrc);
}

bool LteLink::umtsInReach(const Step& step, double rscpDbm) const {
  const auto best = step.radio.bestUmts([](std::size_t) { return true; });
  return best && step.radio.umts()[*best].rscpDbm > rscpDbm;
}

}  // namespace tarn::sim
