#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <vector>

#include "messages/Records.h"
#include "platform/Value.h"

// The phone's protocol state, as the reports read it.
namespace tarn::sim {

enum class Rat { Lte, Umts, Gsm };

// Something the baseband reports when it happens; each change is described by one or more
// metrics, built at the moment of the change.
enum class Change {
  LteRrc,
  LteCell,
  LteDrx,
  LteCarriers,
  LteCaState,
  LteRadioLinkFailure,
  UmtsRrc,
  UmtsCell,
  GsmCell,
  GsmState,
  Emm,
  Mm,
  Gmm,
  Bearers,
  MmCommon,
  SimFiles,
};
using ChangeSink = std::function<void(Change)>;

using LteRrc = messages::KCellularLteRrcState::State;
using LteCause = messages::KCellularLteRrcState::Cause;
using SccState = messages::SecondaryComponentCarrier::State;
using UmtsRrc = messages::KCellularWcdmaRrcConnectionState::State;
using UmtsEstablishment = messages::KCellularWcdmaRrcConnectionState::EstablishmentCause;
using UmtsRelease = messages::KCellularWcdmaRrcConnectionState::ReleaseCause;
using RegStatus = messages::KCellularEmmContext::RegStatus;
using PdpType = messages::BearerContext::PdpType;

struct SecondaryCarrier {
  std::size_t cell;
  SccState state;
};

struct LteState {
  std::optional<std::size_t> serving;
  LteRrc rrc = messages::KCellularLteRrcState::KLTE_RRC_STATE_NULL;
  LteRrc previousRrc = messages::KCellularLteRrcState::KLTE_RRC_STATE_NULL;
  LteCause cause = messages::KCellularLteRrcState::KLTE_RRC_CAUSE_NA;
  std::optional<std::uint64_t> rrcSinceMs;  // absent before the first state
  std::uint32_t previousDurationMs = 0;
  // Secondary cells in SCell index order (index 1 first); a deconfigured one is reported
  // once more and then dropped.
  std::vector<SecondaryCarrier> secondaries;
  bool connected() const { return rrc == messages::KCellularLteRrcState::KLTE_RRC_STATE_CONNECTED; }
};

struct UmtsState {
  std::optional<std::size_t> serving;
  UmtsRrc rrc = messages::KCellularWcdmaRrcConnectionState::KWCDMA_RRC_CONN_STATE_INACTIVE;
  UmtsEstablishment establishment =
      messages::KCellularWcdmaRrcConnectionState::KRRC_EST_ORIG_BACKGND_CALL;
  UmtsRelease release = messages::KCellularWcdmaRrcConnectionState::KRRC_REL_NO_CAUSE;
  bool dedicated() const {
    return rrc == messages::KCellularWcdmaRrcConnectionState::KWCDMA_RRC_CONN_STATE_CELL_DCH;
  }
};

struct GsmState {
  std::optional<std::size_t> serving;
  bool dedicated = false;  // on an SDCCH for a location update
};

struct Guti {
  std::uint32_t mmegi;
  std::uint32_t mmec;
  std::uint32_t mTmsi;
};

struct Bearer {
  std::uint32_t cid;
  std::uint32_t nsapi;
  std::string apn;
  PdpType type;
  platform::Bytes address;  // IPv4, IPv6, or IPv4 followed by IPv6
  PdpType dnsType;
  platform::Bytes primaryDns;
  platform::Bytes secondaryDns;
  bool iratMobile;
};

struct NasState {
  // EPS mobility management.
  RegStatus emmStatus = messages::KCellularEmmContext::KREG_STATUS_NO_SERVICE;
  messages::KCellularEmmContext::UpdateStatus emmUpdate =
      messages::KCellularEmmContext::EPS_STATUS_NOT_UPDATED;
  messages::KCellularEmmContext::RegProc emmProcedure =
      messages::KCellularEmmContext::EMM_PROC_NO_PROC;
  std::vector<std::uint32_t> trackingAreas;
  Guti guti{};
  std::uint32_t lastTac = 0;
  // Circuit-switched mobility management.
  RegStatus mmStatus = messages::KCellularEmmContext::KREG_STATUS_NO_SERVICE;
  std::uint32_t lac = 0;
  std::uint32_t tmsi = 0;
  bool combined = false;
  // GPRS mobility management.
  RegStatus gmmStatus = messages::KCellularEmmContext::KREG_STATUS_NO_SERVICE;
  messages::KCellularGmmContext::RegProc gmmProcedure =
      messages::KCellularGmmContext::KNAS_MM_REG_PROC_PROC_NONE;
  std::uint32_t routingLac = 0;
  std::uint32_t rac = 0;
  std::uint32_t pTmsi = 0;
  std::vector<Bearer> bearers;
};

}  // namespace tarn::sim
