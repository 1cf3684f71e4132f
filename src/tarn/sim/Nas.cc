#include "tarn/sim/Nas.h"

#include <algorithm>

namespace tarn::sim {
namespace {

using Emm = messages::KCellularEmmContext;
using Gmm = messages::KCellularGmmContext;
using Pdp = messages::BearerContext;

constexpr std::uint32_t kMmeGroup = 0x8001;

std::uint32_t randomTmsi(Random& random) {
  return static_cast<std::uint32_t>(random.between(0x00000001, 0xFFFFFFFE));
}

platform::Bytes randomBytes(std::size_t count, Random& random) {
  platform::Bytes bytes(count);
  for (std::uint8_t& byte : bytes)
    byte = static_cast<std::uint8_t>(random.between(0, 255));
  return bytes;
}

// An address in the 2001:db8::/32 documentation prefix with a random interface identifier.
platform::Bytes ipv6Address(Random& random) {
  platform::Bytes address = {0x20, 0x01, 0x0D, 0xB8};
  const platform::Bytes rest = randomBytes(12, random);
  address.insert(address.end(), rest.begin(), rest.end());
  return address;
}

// Carrier-grade NAT space, 100.64.0.0/10.
platform::Bytes ipv4Address(Random& random) {
  return {100, static_cast<std::uint8_t>(random.between(64, 127)),
          static_cast<std::uint8_t>(random.between(0, 255)),
          static_cast<std::uint8_t>(random.between(1, 254))};
}

platform::Bytes ipv6Dns(std::uint8_t last) {
  return {0x20, 0x01, 0x0D, 0xB8, 0, 0, 0, 0x53, 0, 0, 0, 0, 0, 0, 0, last};
}

}  // namespace

Nas::Procedure Nas::neededOn(const LteCell& cell) const {
  if (!attached_) return Procedure::Attach;
  const auto& areas = state_.trackingAreas;
  const bool listed = std::find(areas.begin(), areas.end(), cell.tac) != areas.end();
  if (state_.emmStatus != Emm::KREG_STATUS_NORMAL_SERVICE || !listed) {
    return Procedure::TrackingAreaUpdate;
  }
  return Procedure::None;
}

Nas::Procedure Nas::neededOn(const UmtsCell& cell) const {
  const bool sameArea = state_.routingLac == cell.lac && state_.rac == cell.rac;
  if (state_.gmmStatus != Emm::KREG_STATUS_NORMAL_SERVICE || !sameArea) {
    return Procedure::RoutingAreaUpdate;
  }
  return Procedure::None;
}

Nas::Procedure Nas::neededOn(const GsmCell& cell) const {
  if (state_.lac != cell.lac) return Procedure::LocationAreaUpdate;
  const bool sameArea = state_.routingLac == cell.lac && state_.rac == cell.rac;
  if (state_.gmmStatus != Emm::KREG_STATUS_NORMAL_SERVICE || !sameArea) {
    return Procedure::RoutingAreaUpdate;
  }
  return Procedure::None;
}

void Nas::begin(const Step& step, Procedure procedure) {
  if (procedure != Procedure::Attach || attachReported_) return;
  attachReported_ = true;
  state_.emmStatus = Emm::KREG_STATUS_REGISTRATION_IN_PROGRESS;
  state_.emmProcedure = Emm::EMM_PROC_ATTACH_COMB;
  step.report(Change::Emm);
  step.report(Change::Gmm);
}

void Nas::completeAttach(const Step& step, const LteCell& cell) {
  attached_ = true;
  state_.emmStatus = Emm::KREG_STATUS_NORMAL_SERVICE;
  state_.emmUpdate = Emm::EPS_STATUS_UPDATED;
  state_.emmProcedure = Emm::EMM_PROC_ATTACH_COMB;
  state_.trackingAreas = {cell.tac};
  state_.lastTac = cell.tac;
  state_.guti = {kMmeGroup, static_cast<std::uint32_t>(step.random.between(1, 254)),
                 randomTmsi(step.random)};
  step.report(Change::Emm);

  state_.mmStatus = Emm::KREG_STATUS_NORMAL_SERVICE;
  state_.lac = cell.lac;
  state_.tmsi = randomTmsi(step.random);
  state_.combined = true;
  step.report(Change::Mm);

  state_.bearers = {internetBearer(step.random), imsBearer(step.random)};
  step.report(Change::Bearers);
  step.report(Change::MmCommon);
}

void Nas::completeTrackingAreaUpdate(const Step& step, const LteCell& cell) {
  const bool fromOtherRat = state_.emmStatus != Emm::KREG_STATUS_NORMAL_SERVICE;
  state_.emmStatus = Emm::KREG_STATUS_NORMAL_SERVICE;
  state_.emmUpdate = Emm::EPS_STATUS_UPDATED;
  state_.emmProcedure = fromOtherRat ? Emm::EMM_PROC_TAU_COMB : Emm::EMM_PROC_TAU;
  state_.trackingAreas = {cell.tac};
  state_.lastTac = cell.tac;
  if (fromOtherRat) state_.guti.mTmsi = randomTmsi(step.random);
  step.report(Change::Emm);

  if (state_.lac != cell.lac || !state_.combined) {
    state_.lac = cell.lac;
    state_.tmsi = randomTmsi(step.random);
    state_.combined = true;
    step.report(Change::Mm);
  }
  if (!hasIms()) {
    state_.bearers.push_back(imsBearer(step.random));
    step.report(Change::Bearers);
  }
  step.report(Change::MmCommon);
}

void Nas::completeRoutingAreaUpdate(const Step& step, std::uint32_t lac, std::uint32_t rac,
                                    bool combined) {
  if (state_.routingLac != lac || state_.rac != rac) state_.pTmsi = randomTmsi(step.random);
  state_.gmmStatus = Emm::KREG_STATUS_NORMAL_SERVICE;
  state_.gmmProcedure =
      combined ? Gmm::KNAS_MM_REG_PROC_COMBINED_RAU : Gmm::KNAS_MM_REG_PROC_ROUTING_AREA_UPDATE;
  state_.routingLac = lac;
  state_.rac = rac;
  step.report(Change::Gmm);
  if (combined && (state_.lac != lac || !state_.combined)) {
    if (state_.lac != lac) state_.tmsi = randomTmsi(step.random);
    state_.lac = lac;
    state_.combined = true;
    step.report(Change::Mm);
  }
  // The EPS bearers now live on as PDP contexts.
  step.report(Change::Bearers);
  step.report(Change::MmCommon);
}

void Nas::completeLocationAreaUpdate(const Step& step, std::uint32_t lac) {
  state_.mmStatus = Emm::KREG_STATUS_NORMAL_SERVICE;
  state_.lac = lac;
  state_.tmsi = randomTmsi(step.random);
  state_.combined = false;
  step.report(Change::Mm);
  step.report(Change::MmCommon);
}

void Nas::leftLte(const Step& step) {
  state_.emmStatus = Emm::KREG_STATUS_NO_SERVICE;
  step.report(Change::Emm);
}

void Nas::leftGprs(const Step& step) {
  state_.gmmStatus = Emm::KREG_STATUS_NO_SERVICE;
  step.report(Change::Gmm);
}

void Nas::enteredGsm(const Step& step) {
  if (!hasIms()) return;
  std::erase_if(state_.bearers, [](const Bearer& bearer) { return bearer.apn == "ims"; });
  step.report(Change::Bearers);
}

bool Nas::hasIms() const {
  return std::any_of(state_.bearers.begin(), state_.bearers.end(),
                     [](const Bearer& bearer) { return bearer.apn == "ims"; });
}

Bearer Nas::internetBearer(Random& random) const {
  platform::Bytes address = ipv4Address(random);
  const platform::Bytes v6 = ipv6Address(random);
  address.insert(address.end(), v6.begin(), v6.end());
  return {1,
          5,
          "internet",
          Pdp::PDP_TYPE_IPv4v6,
          address,
          Pdp::PDP_TYPE_IPv4,
          {10, 66, 1, 10},
          {10, 66, 1, 11},
          true};
}

Bearer Nas::imsBearer(Random& random) const {
  return {2,
          6,
          "ims",
          Pdp::PDP_TYPE_IPv6,
          ipv6Address(random),
          Pdp::PDP_TYPE_IPv6,
          ipv6Dns(0x10),
          ipv6Dns(0x11),
          false};
}

}  // namespace tarn::sim
