#include "tarn/sim/GsmLink.h"

namespace tarn::sim {
namespace {

constexpr double kGsmSuitableDbm = -104.0;
constexpr double kReselectHysteresisDb = 4.0;  // CELL_RESELECT_HYSTERESIS
constexpr double kUmtsRscpDbm = -98.0;
constexpr double kUmtsEcnoDb = -12.0;
constexpr double kLteRsrpDbm = -108.0;

constexpr double kGsmReselectionMs = 5000.0;
constexpr double kInterRatMs = 3000.0;

}  // namespace

std::optional<std::size_t> GsmLink::suitableCell(const Step& step) const {
  const auto best = step.radio.bestGsm([](std::size_t) { return true; });
  if (best && step.radio.gsm()[*best].rxlevDbm > kGsmSuitableDbm) return best;
  return std::nullopt;
}

void GsmLink::enter(const Step& step, std::size_t cell) {
  state_ = {cell, false};
  candidate_.reset();
  umtsSeen_.reset();
  lteSeen_.reset();
  step.report(Change::GsmCell);
}

GsmLink::Exit GsmLink::step(const Step& step, const Needs& needs) {
  if (state_.dedicated) {
    dedicatedLeftMs_ -= step.ms;
    if (dedicatedLeftMs_ <= 0.0) {
      state_.dedicated = false;
      signallingFinished_ = true;
      step.report(Change::GsmState);
    }
    return Exit::None;
  }
  if (lteSeen_.track(lteInReach(step), step.ms, kInterRatMs)) return Exit::ToLte;
  if (umtsSeen_.track(umtsInReach(step), step.ms, kInterRatMs)) return Exit::ToUmts;
  reselect(step);
  if (needs.signalling) {
    state_.dedicated = true;
    dedicatedLeftMs_ = step.random.uniform(1800.0, 3200.0);
    step.report(Change::GsmState);
  }
  return Exit::None;
}

bool GsmLink::takeFinishedSignalling() {
  const bool finished = signallingFinished_;
  signallingFinished_ = false;
  return finished;
}

void GsmLink::reselect(const Step& step) {
  const auto best = step.radio.bestGsm([](std::size_t) { return true; });
  const auto& levels = step.radio.gsm();
  const bool better =
      best && *best != *state_.serving &&
      levels[*best].rxlevDbm > levels[*state_.serving].rxlevDbm + kReselectHysteresisDb;
  if (!candidate_.settled(better ? best : std::nullopt, step.ms, kGsmReselectionMs)) return;
  state_.serving = best;
  step.report(Change::GsmCell);
}

bool GsmLink::umtsInReach(const Step& step) const {
  const auto best = step.radio.bestUmts([](std::size_t) { return true; });
  if (!best) return false;
  const UmtsLevel& level = step.radio.umts()[*best];
  return level.rscpDbm > kUmtsRscpDbm && level.ecnoDb > kUmtsEcnoDb;
}

bool GsmLink::lteInReach(const Step& step) const {
  const auto best = step.radio.bestLte([this](std::size_t i) { return network_.lte[i].anchor; });
  return best && step.radio.lte()[*best].rsrpDbm > kLteRsrpDbm;
}

}  // namespace tarn::sim
