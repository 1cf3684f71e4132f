#pragma once

#include "tarn/sim/Network.h"
#include "tarn/sim/PhoneState.h"
#include "tarn/sim/Step.h"

namespace tarn::sim {

// Non-access stratum: registration with the core network in each domain (EPS, circuit
// switched, GPRS), the identities it hands out, and the packet data connections that follow
// the phone from one RAT to another.
class Nas {
 public:
  enum class Procedure { None, Attach, TrackingAreaUpdate, RoutingAreaUpdate, LocationAreaUpdate };

  // The procedure that camping on a cell calls for.
  Procedure neededOn(const LteCell& cell) const;
  Procedure neededOn(const UmtsCell& cell) const;
  Procedure neededOn(const GsmCell& cell) const;

  // Reports the registration under way, for an attach.
  void begin(const Step& step, Procedure procedure);
  void completeAttach(const Step& step, const LteCell& cell);
  void completeTrackingAreaUpdate(const Step& step, const LteCell& cell);
  // In network operation mode I (UMTS), the routing area update also updates the location.
  void completeRoutingAreaUpdate(const Step& step, std::uint32_t lac, std::uint32_t rac,
                                 bool combined);
  void completeLocationAreaUpdate(const Step& step, std::uint32_t lac);

  void leftLte(const Step& step);
  void leftGprs(const Step& step);
  // The IMS connection does not survive on GSM.
  void enteredGsm(const Step& step);

  const NasState& state() const { return state_; }

 private:
  bool hasIms() const;
  Bearer internetBearer(Random& random) const;
  Bearer imsBearer(Random& random) const;

  NasState state_;
  bool attached_ = false;
  bool attachReported_ = false;
};

}  // namespace tarn::sim
