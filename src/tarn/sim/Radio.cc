#include "tarn/sim/Radio.h"

#include <algorithm>
#include <cmath>

#include "tarn/sim/Bands.h"
#include "tarn/sim/Route.h"

namespace tarn::sim {
namespace {

constexpr double kSiteShadowDb = 5.0;
constexpr double kSiteDecorrelationM = 50.0;
constexpr double kCellShadowDb = 1.5;
constexpr double kCellDecorrelationM = 20.0;
constexpr double kVehicleLossDb = 8.0;
constexpr double kAntennaHeightM = 30.0;
// Thermal noise plus a 7 dB receiver noise figure.
constexpr double kNoisePerSubcarrierDbm = -125.2;
constexpr double kNoiseUmtsCarrierDbm = -101.2;

double milliwatts(double dbm) {
  return std::pow(10.0, dbm / 10.0);
}
double dbm(double milliwatts) {
  return 10.0 * std::log10(milliwatts);
}

// Urban macro cell path loss: 37.6 dB per decade of distance, corrected for frequency. Close
// to a mast the phone is below the main lobe of the down-tilted antenna, which the distance
// floor stands for.
double pathLossDb(double distanceM, double frequencyMhz) {
  const double km = std::max(distanceM, 200.0) / 1000.0;
  return 128.1 + 37.6 * std::log10(km) + 21.0 * std::log10(frequencyMhz / 2000.0);
}

// First-order autoregressive shadowing: correlated over the decorrelation distance.
void evolve(double& shadowDb, double movedM, double decorrelationM, double deviationDb,
            Random& random) {
  const double kept = std::exp(-movedM / decorrelationM);
  shadowDb = kept * shadowDb + std::sqrt(1.0 - kept * kept) * random.normal(0.0, deviationDb);
}

// A cell transmits reference signals always and data on the share `load` of the rest.
double lteActivity(double load) {
  return 0.25 + 0.75 * load;
}
// CPICH is a tenth of a cell's full power.
double umtsTotalOverCpich(double load) {
  return 10.0 * (0.4 + 0.6 * load);
}

}  // namespace

Radio::Radio(const Network& network)
    : network_(network),
      siteShadowDb_(network.sites.size()),
      lteShadowDb_(network.lte.size()),
      umtsShadowDb_(network.umts.size()),
      gsmShadowDb_(network.gsm.size()),
      lte_(network.lte.size()),
      umts_(network.umts.size()),
      gsm_(network.gsm.size()) {}

void Radio::update(double positionM, Random& random) {
  const double movedM = placed_ ? std::abs(positionM - positionM_) : 1e9;
  positionM_ = positionM;
  placed_ = true;
  for (double& shadow : siteShadowDb_) {
    evolve(shadow, movedM, kSiteDecorrelationM, kSiteShadowDb, random);
  }
  for (auto* shadows : {&lteShadowDb_, &umtsShadowDb_, &gsmShadowDb_}) {
    for (double& shadow : *shadows)
      evolve(shadow, movedM, kCellDecorrelationM, kCellShadowDb, random);
  }
  updateLte();
  updateUmts();
  for (std::size_t i = 0; i < gsm_.size(); ++i) {
    const GsmCell& cell = network_.gsm[i];
    gsm_[i].rxlevDbm = cell.bcchDbm -
                       meanLossDb(cell.site, bands::gsmDlMhz(cell.band, cell.arfcn)) +
                       siteShadowDb_[cell.site] + gsmShadowDb_[i];
  }
}

double Radio::meanLossDb(std::size_t site, double frequencyMhz) const {
  const Site& where = network_.sites[site];
  const double distanceM = std::hypot(where.alongM - positionM_, where.offsetM, kAntennaHeightM);
  return pathLossDb(distanceM, frequencyMhz) + route::obstructionDb(positionM_, where.alongM) +
         kVehicleLossDb;
}

void Radio::updateLte() {
  for (std::size_t i = 0; i < lte_.size(); ++i) {
    const LteCell& cell = network_.lte[i];
    lte_[i].rsrpDbm = cell.referenceSignalDbm -
                      meanLossDb(cell.site, bands::lteDlMhz(cell.band, cell.dlEarfcn)) +
                      siteShadowDb_[cell.site] + lteShadowDb_[i];
  }
  const double noise = milliwatts(kNoisePerSubcarrierDbm);
  for (std::size_t i = 0; i < lte_.size(); ++i) {
    const LteCell& cell = network_.lte[i];
    double perSubcarrier = noise;  // everything received on one resource element
    for (std::size_t j = 0; j < lte_.size(); ++j) {
      if (network_.lte[j].dlEarfcn != cell.dlEarfcn) continue;
      perSubcarrier += milliwatts(lte_[j].rsrpDbm) * lteActivity(network_.lte[j].load);
    }
    const double own = milliwatts(lte_[i].rsrpDbm);
    const double interference = perSubcarrier - own * lteActivity(cell.load);
    const double subcarriers = 12.0 * bands::lteBandwidth(cell.bandwidthCode).resourceBlocks;
    lte_[i].sinrDb = std::clamp(dbm(own / interference), -20.0, 30.0);
    lte_[i].rsrqDb = std::clamp(dbm(own / (12.0 * perSubcarrier)), -19.5, -3.0);
    lte_[i].rssiDbm = dbm(perSubcarrier * subcarriers);
  }
}

void Radio::updateUmts() {
  for (std::size_t i = 0; i < umts_.size(); ++i) {
    const UmtsCell& cell = network_.umts[i];
    umts_[i].rscpDbm = cell.cpichDbm -
                       meanLossDb(cell.site, bands::umtsDlMhz(cell.band, cell.dlUarfcn)) +
                       siteShadowDb_[cell.site] + umtsShadowDb_[i];
  }
  for (std::size_t i = 0; i < umts_.size(); ++i) {
    double carrier = milliwatts(kNoiseUmtsCarrierDbm);
    for (std::size_t j = 0; j < umts_.size(); ++j) {
      if (network_.umts[j].dlUarfcn != network_.umts[i].dlUarfcn) continue;
      carrier += milliwatts(umts_[j].rscpDbm) * umtsTotalOverCpich(network_.umts[j].load);
    }
    umts_[i].rssiDbm = dbm(carrier);
    umts_[i].ecnoDb = std::clamp(umts_[i].rscpDbm - umts_[i].rssiDbm, -24.5, 0.0);
  }
}

}  // namespace tarn::sim
