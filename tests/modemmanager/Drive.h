#pragma once

#include <ModemManager.h>

#include <cstdint>
#include <string>

#include "FakeModemManager.h"

// The cells, signal and bearers of the fake modem's scripted drive, as ModemManager reports
// them.
namespace mmtest {

inline constexpr std::string_view kImei = "490154203237518";
inline constexpr std::string_view kSecondImei = "356938035643809";

inline std::string hex(std::uint32_t value) {
  char text[16];
  std::snprintf(text, sizeof text, "%X", value);
  return text;
}

inline Entries lteCell(bool serving, std::uint32_t pci, std::uint32_t earfcn, double rsrp,
                       double rsrq) {
  return {{"cell-type", sdbus::Variant(std::uint32_t{MM_CELL_TYPE_LTE})},
          {"serving", sdbus::Variant(serving)},
          {"operator-id", sdbus::Variant(std::string("21034"))},
          {"tac", sdbus::Variant(std::string("84CD"))},
          {"ci", sdbus::Variant(hex(0xD30100 + pci))},
          {"physical-ci", sdbus::Variant(hex(pci))},
          {"earfcn", sdbus::Variant(earfcn)},
          {"rsrp", sdbus::Variant(rsrp)},
          {"rsrq", sdbus::Variant(rsrq)}};
}

inline Entries umtsCell(bool serving, std::uint32_t psc, std::uint32_t uarfcn, double rscp,
                        double ecio) {
  return {{"cell-type", sdbus::Variant(std::uint32_t{MM_CELL_TYPE_UMTS})},
          {"serving", sdbus::Variant(serving)},
          {"operator-id", sdbus::Variant(std::string("21034"))},
          {"lac", sdbus::Variant(std::string("1F4"))},
          {"ci", sdbus::Variant(std::string("2BAF"))},
          {"uarfcn", sdbus::Variant(uarfcn)},
          {"psc", sdbus::Variant(psc)},
          {"rscp", sdbus::Variant(rscp)},
          {"ecio", sdbus::Variant(ecio)}};
}

inline Entries gsmCell(bool serving, std::uint32_t arfcn, std::uint32_t bsic,
                       std::uint32_t rxLevel) {
  return {{"cell-type", sdbus::Variant(std::uint32_t{MM_CELL_TYPE_GSM})},
          {"serving", sdbus::Variant(serving)},
          {"operator-id", sdbus::Variant(std::string("21034"))},
          {"lac", sdbus::Variant(std::string("1F4"))},
          {"ci", sdbus::Variant(std::string("3A1"))},
          {"arfcn", sdbus::Variant(arfcn)},
          {"base-station-id", sdbus::Variant(hex(bsic))},
          {"rx-level", sdbus::Variant(rxLevel)}};
}

inline Entries lteSignal(double rssi, double rsrp, double rsrq, double snr) {
  return {{"rssi", sdbus::Variant(rssi)},
          {"rsrp", sdbus::Variant(rsrp)},
          {"rsrq", sdbus::Variant(rsrq)},
          {"snr", sdbus::Variant(snr)}};
}

// A registered LTE modem at home.
inline FakeModemManager::Modem lteModem(std::string_view imei) {
  return {
      .modem = {{"EquipmentIdentifier", property(std::string(imei))},
                {"Model", property(std::string("Fake EG25"))},
                {"State", property(std::int32_t{MM_MODEM_STATE_REGISTERED})},
                {"AccessTechnologies", property(std::uint32_t{MM_MODEM_ACCESS_TECHNOLOGY_LTE})}},
      .modem3gpp = {{"Imei", property(std::string(imei))},
                    {"RegistrationState",
                     property(std::uint32_t{MM_MODEM_3GPP_REGISTRATION_STATE_HOME})}},
      .signal = {{"Lte", property(lteSignal(-65, -97, -11, 12.5))}},
  };
}

// Modem `index`: a registered LTE modem of `imei` serving on PCI `pci`, alone.
inline void addServingModem(FakeModemManager& fake, unsigned index, std::string_view imei,
                            std::uint32_t pci, std::uint32_t earfcn = 1300) {
  fake.addModem(index, lteModem(imei));
  fake.setCells(index, {lteCell(true, pci, earfcn, -97, -11)});
}

}  // namespace mmtest
