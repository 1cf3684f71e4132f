#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

#include "messages/Records.h"
#include "tarn/sim/Random.h"
#include "tarn/sim/Route.h"

// The operator's radio network along the route: sites and the LTE, UMTS and GSM cells on
// them, with the area codes each cell broadcasts.
namespace tarn::sim {

// Antenna gain less feeder loss: the transmit levels below include it, the powers the
// cells broadcast do not.
inline constexpr double kNetAntennaGainDb = 12.0;

struct Plmn {
  std::uint32_t mcc;
  std::uint32_t mnc;
  std::uint32_t mncDigits;
};

struct Site {
  double alongM;   // position of the foot point on the road
  double offsetM;  // distance from the road
  route::Area area;
};

struct LteCell {
  std::size_t site;
  std::uint32_t band;
  std::uint32_t dlEarfcn;
  std::uint32_t bandwidthCode;
  std::uint32_t pci;
  std::uint32_t cellIdentity;  // 28-bit E-UTRAN cell identity
  std::uint32_t tac;
  std::uint32_t lac;          // the location area the MSC maps this tracking area to
  bool anchor;                // may serve as primary cell; the others only as secondary
  double referenceSignalDbm;  // RS EPRE plus antenna gain
  double load;                // share of resource elements in use
};

struct UmtsCell {
  std::size_t site;
  std::uint32_t band;
  std::uint32_t dlUarfcn;
  std::uint32_t psc;
  std::uint32_t cellIdentity;  // RNC ID and cell ID
  std::uint32_t lac;
  std::uint32_t rac;
  double cpichDbm;  // CPICH power plus antenna gain
  double load;
};

struct GsmCell {
  std::size_t site;
  messages::SysBand band;
  std::uint32_t arfcn;
  std::uint32_t bsic;
  std::uint32_t ci;
  std::uint32_t lac;
  std::uint32_t rac;
  double bcchDbm;  // BCCH carrier power plus antenna gain
};

struct Network {
  Plmn plmn;
  std::vector<Site> sites;
  std::vector<LteCell> lte;
  std::vector<UmtsCell> umts;
  std::vector<GsmCell> gsm;
};

// The same layout for every seed; the seed varies site positions, identities and loads.
Network buildNetwork(Random& random);

}  // namespace tarn::sim
