#include "tarn/sim/UmtsLink.h"

namespace tarn::sim {
namespace {

using Rrc = messages::KCellularWcdmaRrcConnectionState;

// Thresholds in dBm and dB.
constexpr double kSuitableRscpDbm = -112.0;
constexpr double kSuitableEcnoDb = -16.0;
constexpr double kGsmAcceptDbm = -100.0;
constexpr double kLteReselectDbm = -110.0;
constexpr double kLteHandoverDbm = -105.0;
constexpr double kWeakRscpDbm = -114.0;
constexpr double kGsmHandoverRscpDbm = -108.0;  // event 3A: the used frequency is poor
constexpr double kGsmHandoverDbm = -95.0;       // and the GSM cell good
constexpr double kWeakEcnoDb = -20.0;
constexpr double kUmtsIdleHysteresisDb = 4.0;
constexpr double kSoftHandoverDb = 3.0;

// Timers in milliseconds.
constexpr double kUmtsReselectionMs = 1000.0;
constexpr double kSoftHandoverMs = 640.0;
constexpr double kLteReselectionMs = 2000.0;
constexpr double kLteHandoverMs = 3000.0;
constexpr double kDchInactivityMs = 5000.0;
constexpr double kFachInactivityMs = 10000.0;
constexpr double kPagingToIdleMs = 60000.0;
constexpr double kRadioLinkFailureMs = 2000.0;
constexpr double kGsmHandoverMs = 1280.0;

}  // namespace

std::optional<std::size_t> UmtsLink::suitableCell(const Step& step) const {
  const auto best = step.radio.bestUmts([](std::size_t) { return true; });
  if (!best) return std::nullopt;
  const UmtsLevel& level = step.radio.umts()[*best];
  if (level.rscpDbm < kSuitableRscpDbm || level.ecnoDb < kSuitableEcnoDb) return std::nullopt;
  return best;
}

void UmtsLink::enter(const Step& step, std::size_t cell, bool connected) {
  state_.serving = cell;
  candidate_.reset();
  lteSeen_.reset();
  gsmSeen_.reset();
  weakLink_.reset();
  step.report(Change::UmtsCell);
  if (connected) {
    establish(step, Rrc::KRRC_EST_REGISTRATION);
  } else {
    setRrc(step, Rrc::KWCDMA_RRC_CONN_STATE_IDLE);
  }
}

bool UmtsLink::connected() const {
  return state_.rrc == Rrc::KWCDMA_RRC_CONN_STATE_CELL_DCH ||
         state_.rrc == Rrc::KWCDMA_RRC_CONN_STATE_CELL_FACH;
}

UmtsLink::Exit UmtsLink::step(const Step& step, const Needs& needs) {
  switch (state_.rrc) {
    case Rrc::KWCDMA_RRC_CONN_STATE_IDLE:
    case Rrc::KWCDMA_RRC_CONN_STATE_URA_PCH:
      return stepCamped(step, needs);
    case Rrc::KWCDMA_RRC_CONN_STATE_ESTABLISH:
      inactivity_.reset();
      setRrc(step, Rrc::KWCDMA_RRC_CONN_STATE_CELL_DCH);
      return Exit::None;
    case Rrc::KWCDMA_RRC_CONN_STATE_CELL_DCH:
      if (lteSeen_.track(lteInReach(step, kLteHandoverDbm), step.ms, kLteHandoverMs)) {
        return Exit::ToLteConnected;
      }
      if (gsmSeen_.track(step.radio.umts()[*state_.serving].rscpDbm < kGsmHandoverRscpDbm &&
                             gsmInReach(step, kGsmHandoverDbm),
                         step.ms, kGsmHandoverMs)) {
        return Exit::ToGsm;
      }
      stepDedicated(step, needs);
      return Exit::None;
    case Rrc::KWCDMA_RRC_CONN_STATE_CELL_FACH:
      if (needs.heavy || needs.signalling) {
        inactivity_.reset();
        setRrc(step, Rrc::KWCDMA_RRC_CONN_STATE_CELL_DCH);
      } else if (inactivity_.track(!needs.data, step.ms, kFachInactivityMs)) {
        pagingOnly_.reset();
        setRrc(step, Rrc::KWCDMA_RRC_CONN_STATE_URA_PCH);
      } else {
        reselect(step, kUmtsIdleHysteresisDb, kUmtsReselectionMs);
      }
      return Exit::None;
    case Rrc::KWCDMA_RRC_CONN_STATE_RADIO_LINK_FAILURE:
      state_.release = Rrc::KRRC_REL_CONN_REL_LOWER_LAYER_FAILURE_DL;
      setRrc(step, Rrc::KWCDMA_RRC_CONN_STATE_IDLE);
      return Exit::None;
    default:
      return Exit::None;
  }
}

UmtsLink::Exit UmtsLink::stepCamped(const Step& step, const Needs& needs) {
  if (state_.rrc == Rrc::KWCDMA_RRC_CONN_STATE_URA_PCH &&
      pagingOnly_.track(!needs.data, step.ms, kPagingToIdleMs)) {
    state_.release = Rrc::KRRC_REL_NORMAL_EVENT;
    setRrc(step, Rrc::KWCDMA_RRC_CONN_STATE_IDLE);
  }
  if (lteSeen_.track(lteInReach(step, kLteReselectDbm), step.ms, kLteReselectionMs)) {
    return Exit::ToLte;
  }
  const UmtsLevel& level = step.radio.umts()[*state_.serving];
  const bool poor = level.rscpDbm < kSuitableRscpDbm + 2.0 || level.ecnoDb < kSuitableEcnoDb;
  if (poor && gsmInReach(step, kGsmAcceptDbm)) return Exit::ToGsm;
  reselect(step, kUmtsIdleHysteresisDb, kUmtsReselectionMs);

  if (!needs.data && !needs.signalling) return Exit::None;
  if (state_.rrc == Rrc::KWCDMA_RRC_CONN_STATE_IDLE) {
    establish(step, needs.signalling         ? Rrc::KRRC_EST_REGISTRATION
                    : needs.mobileTerminated ? Rrc::KRRC_EST_TERM_BACKGND_CALL
                    : needs.heavy            ? Rrc::KRRC_EST_ORIG_BACKGND_CALL
                                             : Rrc::KRRC_EST_ORIG_INTERACT_CALL);
  } else {
    inactivity_.reset();
    setRrc(step, Rrc::KWCDMA_RRC_CONN_STATE_CELL_FACH);
  }
  return Exit::None;
}

void UmtsLink::stepDedicated(const Step& step, const Needs& needs) {
  if (inactivity_.track(!needs.data && !needs.signalling, step.ms, kDchInactivityMs)) {
    inactivity_.reset();
    setRrc(step, Rrc::KWCDMA_RRC_CONN_STATE_CELL_FACH);
    return;
  }
  const UmtsLevel& level = step.radio.umts()[*state_.serving];
  const bool weak = level.rscpDbm < kWeakRscpDbm || level.ecnoDb < kWeakEcnoDb;
  if (weakLink_.track(weak, step.ms, kRadioLinkFailureMs)) {
    weakLink_.reset();
    setRrc(step, Rrc::KWCDMA_RRC_CONN_STATE_RADIO_LINK_FAILURE);
    return;
  }
  reselect(step, kSoftHandoverDb, kSoftHandoverMs);
}

void UmtsLink::reselect(const Step& step, double marginDb, double dwellMs) {
  const auto best = step.radio.bestUmts([](std::size_t) { return true; });
  const auto& levels = step.radio.umts();
  const bool better = best && *best != *state_.serving &&
                      levels[*best].rscpDbm > levels[*state_.serving].rscpDbm + marginDb;
  if (!candidate_.settled(better ? best : std::nullopt, step.ms, dwellMs)) return;
  state_.serving = best;
  step.report(Change::UmtsCell);
}

void UmtsLink::establish(const Step& step, UmtsEstablishment cause) {
  state_.establishment = cause;
  setRrc(step, Rrc::KWCDMA_RRC_CONN_STATE_ESTABLISH);
}

void UmtsLink::setRrc(const Step& step, UmtsRrc rrc) {
  state_.rrc = rrc;
  step.report(Change::UmtsRrc);
}

void UmtsLink::leave(const Step& step, bool handedOver) {
  if (handedOver) state_.release = Rrc::KRRC_REL_NORMAL_EVENT;
  setRrc(step, Rrc::KWCDMA_RRC_CONN_STATE_INACTIVE);
  state_.serving.reset();
}

bool UmtsLink::lteInReach(const Step& step, double rsrpDbm) const {
  const auto best = step.radio.bestLte([this](std::size_t i) { return network_.lte[i].anchor; });
  return best && step.radio.lte()[*best].rsrpDbm > rsrpDbm;
}

bool UmtsLink::gsmInReach(const Step& step, double rxlevDbm) const {
  const auto best = step.radio.bestGsm([](std::size_t) { return true; });
  return best && step.radio.gsm()[*best].rxlevDbm > rxlevDbm;
}

}  // namespace tarn::sim
