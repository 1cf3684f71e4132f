#include "tarn/sim/Phone.h"

namespace tarn::sim {

Phone::Phone(const Network& network)
    : network_(network), lte_(network), umts_(network), gsm_(network) {}

void Phone::step(const Step& step, const Traffic& traffic) {
  if (!poweredOn_) {
    poweredOn_ = true;
    step.report(Change::SimFiles);
  }
  const Nas::Procedure procedure = neededProcedure();
  nas_.begin(step, procedure);
  const Needs needs = {traffic.active(), traffic.demand() == Traffic::Demand::Heavy,
                       traffic.mobileTerminated(), procedure != Nas::Procedure::None};
  switch (rat_) {
    case Rat::Lte:
      stepLte(step, needs);
      break;
    case Rat::Umts:
      stepUmts(step, needs);
      break;
    case Rat::Gsm:
      stepGsm(step, needs);
      break;
  }
  completeProcedure(step, neededProcedure());
}

void Phone::stepLte(const Step& step, Needs needs) {
  switch (lte_.step(step, needs)) {
    case LteLink::Exit::None:
      break;
    case LteLink::Exit::ToUmts:
      switchTo(step, Rat::Umts, false);
      break;
    case LteLink::Exit::ToUmtsConnected:
      switchTo(step, Rat::Umts, true);
      break;
  }
}

void Phone::stepUmts(const Step& step, Needs needs) {
  switch (umts_.step(step, needs)) {
    case UmtsLink::Exit::None:
      break;
    case UmtsLink::Exit::ToLte:
      switchTo(step, Rat::Lte, false);
      break;
    case UmtsLink::Exit::ToLteConnected:
      switchTo(step, Rat::Lte, true);
      break;
    case UmtsLink::Exit::ToGsm:
      switchTo(step, Rat::Gsm, false);
      break;
  }
}

void Phone::stepGsm(const Step& step, Needs needs) {
  // Only the location update needs a dedicated channel; the routing area update goes over GPRS.
  needs.signalling = neededProcedure() == Nas::Procedure::LocationAreaUpdate;
  switch (gsm_.step(step, needs)) {
    case GsmLink::Exit::None:
      break;
    case GsmLink::Exit::ToUmts:
      switchTo(step, Rat::Umts, false);
      break;
    case GsmLink::Exit::ToLte:
      switchTo(step, Rat::Lte, false);
      break;
  }
}

bool Phone::switchTo(const Step& step, Rat rat, bool connected) {
  const auto cell = rat == Rat::Lte    ? lte_.suitableCell(step)
                    : rat == Rat::Umts ? umts_.suitableCell(step)
                                       : gsm_.suitableCell(step);
  if (!cell) return false;
  switch (rat_) {
    case Rat::Lte:
      lte_.leave(step, connected);
      nas_.leftLte(step);
      break;
    case Rat::Umts:
      umts_.leave(step, connected);
      break;
    case Rat::Gsm:
      gsm_.leave();
      break;
  }
  if (rat == Rat::Lte) nas_.leftGprs(step);
  rat_ = rat;
  switch (rat) {
    case Rat::Lte:
      lte_.enter(step, *cell, connected);
      break;
    case Rat::Umts:
      umts_.enter(step, *cell, connected);
      break;
    case Rat::Gsm:
      gsm_.enter(step, *cell);
      nas_.enteredGsm(step);
      break;
  }
  return true;
}

Nas::Procedure Phone::neededProcedure() const {
  switch (rat_) {
    case Rat::Lte:
      if (lte().serving) return nas_.neededOn(network_.lte[*lte().serving]);
      break;
    case Rat::Umts:
      if (umts().serving) return nas_.neededOn(network_.umts[*umts().serving]);
      break;
    case Rat::Gsm:
      if (gsm().serving) return nas_.neededOn(network_.gsm[*gsm().serving]);
      break;
  }
  return Nas::Procedure::None;
}

void Phone::completeProcedure(const Step& step, Nas::Procedure procedure) {
  using Procedure = Nas::Procedure;
  switch (rat_) {
    case Rat::Lte:
      if (!lte().connected()) return;
      if (procedure == Procedure::Attach) nas_.completeAttach(step, network_.lte[*lte().serving]);
      if (procedure == Procedure::TrackingAreaUpdate) {
        nas_.completeTrackingAreaUpdate(step, network_.lte[*lte().serving]);
      }
      return;
    case Rat::Umts:
      if (procedure == Procedure::RoutingAreaUpdate && umts_.connected()) {
        const UmtsCell& cell = network_.umts[*umts().serving];
        nas_.completeRoutingAreaUpdate(step, cell.lac, cell.rac, true);
      }
      return;
    case Rat::Gsm: {
      if (!gsm().serving) return;
      const GsmCell& cell = network_.gsm[*gsm().serving];
      if (procedure == Procedure::LocationAreaUpdate && gsm_.takeFinishedSignalling()) {
        nas_.completeLocationAreaUpdate(step, cell.lac);
      } else if (procedure == Procedure::RoutingAreaUpdate && !gsm().dedicated) {
        nas_.completeRoutingAreaUpdate(step, cell.lac, cell.rac, false);
      }
      return;
    }
  }
}

}  // namespace tarn::sim
