#pragma once

#include "tarn/sim/GsmLink.h"
#include "tarn/sim/LteLink.h"
#include "tarn/sim/Nas.h"
#include "tarn/sim/Network.h"
#include "tarn/sim/Step.h"
#include "tarn/sim/Traffic.h"
#include "tarn/sim/UmtsLink.h"

namespace tarn::sim {

// The phone's baseband: one RAT at a time, the moves between them, and the registrations
// each move calls for.
class Phone {
 public:
  explicit Phone(const Network& network);

  void step(const Step& step, const Traffic& traffic);

  Rat rat() const { return rat_; }
  const LteState& lte() const { return lte_.state(); }
  const UmtsState& umts() const { return umts_.state(); }
  const GsmState& gsm() const { return gsm_.state(); }
  const NasState& nas() const { return nas_.state(); }

 private:
  void stepLte(const Step& step, Needs needs);
  void stepUmts(const Step& step, Needs needs);
  void stepGsm(const Step& step, Needs needs);
  // Moves to `rat` if it has a cell to camp on; answers whether it did.
  bool switchTo(const Step& step, Rat rat, bool connected);
  Nas::Procedure neededProcedure() const;
  void completeProcedure(const Step& step, Nas::Procedure procedure);

  const Network& network_;
  Rat rat_ = Rat::Lte;
  bool poweredOn_ = false;
  LteLink lte_;
  UmtsLink umts_;
  GsmLink gsm_;
  Nas nas_;
};

}  // namespace tarn::sim
