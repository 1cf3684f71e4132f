#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "platform/Value.h"

// What the source knows of one modem, read and checked: every field is what ModemManager
// reported, in its units (dBm, dB), or empty when it reported nothing usable.
namespace tarn::mm {

enum class Rat { Gsm, Umts, Lte };

struct Plmn {
  std::uint32_t mcc = 0;
  std::uint32_t mnc = 0;
  std::uint32_t mncDigits = 0;  // 2 or 3
  std::string digits;           // "21034"
  bool operator==(const Plmn&) const = default;
};

// One cell of GetCellInfo.
struct Cell {
  Rat rat = Rat::Lte;
  bool serving = false;
  std::optional<Plmn> plmn;
  std::optional<std::uint32_t> lac;      // GSM, UMTS
  std::optional<std::uint32_t> tac;      // LTE
  std::optional<std::uint32_t> cellId;   // "ci"
  std::optional<std::uint32_t> pci;      // LTE "physical-ci"
  std::optional<std::uint32_t> channel;  // EARFCN, UARFCN or ARFCN
  std::optional<std::uint32_t> psc;      // UMTS
  std::optional<std::uint32_t> bsic;     // GSM "base-station-id"
  std::optional<std::uint32_t> rxLevel;  // GSM "rx-level", 0 to 63
  std::optional<double> rsrp, rsrq;      // LTE, dBm and dB
  std::optional<double> rscp, ecio;      // UMTS, dBm and dB
  bool operator==(const Cell&) const = default;
};

// The Signal interface's dictionaries.
struct LteSignal {
  std::optional<double> rssi, rsrp, rsrq, snr;
  bool empty() const { return !rssi && !rsrp && !rsrq && !snr; }
};
struct UmtsSignal {
  std::optional<double> rssi, rscp, ecio;
  bool empty() const { return !rssi && !rscp && !ecio; }
};
struct GsmSignal {
  std::optional<double> rssi;
  bool empty() const { return !rssi; }
};

// Modem and Modem3gpp.
struct Registration {
  std::optional<std::uint32_t> accessTechnologies;  // MMModemAccessTechnology bits
  std::optional<std::uint32_t> state;               // MMModem3gppRegistrationState
  std::optional<std::uint32_t> epsUeMode;           // MMModem3gppEpsUeModeOperation
  std::optional<std::uint32_t> packetService;       // MMModem3gppPacketServiceState
  std::optional<Plmn> operatorPlmn;                 // the PLMN registered on
};

// One connected bearer.
struct Bearer {
  std::optional<std::string> apn;
  std::optional<std::uint32_t> ipFamily;  // MMBearerIpFamily asked for
  std::optional<std::int32_t> profileId;
  std::optional<platform::Bytes> ip4, ip6;  // the addresses
  std::vector<platform::Bytes> dns;         // in order of preference, 4 or 16 bytes each
};

struct Sim {
  std::optional<std::string> iccid, imsi, operatorId, serviceProvider;
  bool empty() const { return !iccid && !imsi && !operatorId && !serviceProvider; }
};

struct Snapshot {
  std::vector<Cell> cells;
  LteSignal lte;
  UmtsSignal umts;
  GsmSignal gsm;
  Registration registration;
};

}  // namespace tarn::mm
