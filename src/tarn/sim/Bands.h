#pragma once

#include <cstdint>

#include "messages/Records.h"

// The frequency plans of the bands the simulated operator uses.
namespace tarn::sim::bands {

// An LTE channel bandwidth: its code as reported (0..5), its width and resource blocks.
struct LteBandwidth {
  std::uint32_t code;
  double mhz;
  std::uint32_t resourceBlocks;
};
const LteBandwidth& lteBandwidth(std::uint32_t code);

// An FDD LTE band with its downlink and uplink EARFCN ranges.
struct LteBand {
  std::uint32_t number;
  double dlLowMhz;
  std::uint32_t dlFirstEarfcn;
  std::uint32_t dlLastEarfcn;
  std::uint32_t ulFirstEarfcn;
};
// Bands 3, 7 and 20.
const LteBand& lteBand(std::uint32_t number);
double lteDlMhz(std::uint32_t band, std::uint32_t dlEarfcn);
std::uint32_t lteUlEarfcn(std::uint32_t band, std::uint32_t dlEarfcn);

// A UMTS FDD band: downlink UARFCN range, uplink distance and downlink offset.
struct UmtsBand {
  std::uint32_t number;
  messages::SysBand sysBand;
  std::uint32_t dlFirstUarfcn;
  std::uint32_t dlLastUarfcn;
  double dlOffsetMhz;
};
// Bands I (2100 MHz) and VIII (900 MHz).
const UmtsBand& umtsBand(std::uint32_t number);
double umtsDlMhz(std::uint32_t band, std::uint32_t uarfcn);

// A GSM band: ARFCN range and the downlink frequency of its first ARFCN.
struct GsmBand {
  messages::SysBand sysBand;
  std::uint32_t firstArfcn;
  std::uint32_t lastArfcn;
  double firstDlMhz;
};
// E-GSM 900 (ARFCN 1..124) and DCS 1800 (512..885).
const GsmBand& gsmBand(messages::SysBand sysBand);
double gsmDlMhz(messages::SysBand sysBand, std::uint32_t arfcn);

}  // namespace tarn::sim::bands
