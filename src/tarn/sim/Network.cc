#include "tarn/sim/Network.h"

#include <algorithm>
#include <array>
#include <optional>

namespace tarn::sim {
namespace {

struct LteLayer {
  std::uint32_t band;
  std::uint32_t dlEarfcn;
  std::uint32_t bandwidthCode;
  std::uint32_t cellNumber;  // low 8 bits of the cell identity
  bool anchor;
  double referenceSignalDbm;
};
// 1800 MHz is the primary layer, 800 MHz the coverage layer, 2600 MHz adds capacity only
// through carrier aggregation.
// Reference signal power per resource element: 18.2 dBm from 40 W over 20 MHz, 15.2 dBm from
// 20 W over 10 MHz.
constexpr LteLayer kB3 = {3, 1300, 5, 0x01, true, 18.2 + kNetAntennaGainDb};
constexpr LteLayer kB7 = {7, 3050, 5, 0x15, false, 18.2 + kNetAntennaGainDb};
constexpr LteLayer kB20 = {20, 6300, 3, 0x0B, true, 15.2 + kNetAntennaGainDb};
constexpr double kCpichDbm = 33.0;
constexpr double kBcchDbm = 43.0;

struct UmtsLayer {
  std::uint32_t band;
  std::uint32_t dlUarfcn;
};
constexpr UmtsLayer kU2100 = {1, 10588};
constexpr UmtsLayer kU900 = {8, 3011};

struct SitePlan {
  double alongM;
  std::vector<LteLayer> lte;
  std::optional<UmtsLayer> umts;
  std::optional<messages::SysBand> gsm;
};

const std::vector<SitePlan>& sitePlan() {
  static const std::vector<SitePlan> plan = {
      {150, {kB3, kB7, kB20}, kU2100, messages::SYS_BAND_GSM_EGSM_900},
      {700, {kB3, kB7, kB20}, kU2100, messages::SYS_BAND_GSM_DCS_1800},
      {1250, {kB3, kB7, kB20}, kU2100, messages::SYS_BAND_GSM_EGSM_900},
      {1850, {kB3, kB7, kB20}, kU2100, messages::SYS_BAND_GSM_DCS_1800},
      {2550, {kB3, kB20}, kU2100, messages::SYS_BAND_GSM_EGSM_900},
      {3300, {kB3, kB20}, kU2100, std::nullopt},
      {4250, {}, kU900, messages::SYS_BAND_GSM_EGSM_900},
      {4950, {}, kU900, std::nullopt},
      {5650, {}, std::nullopt, messages::SYS_BAND_GSM_EGSM_900},
      {6000, {}, std::nullopt, messages::SYS_BAND_GSM_EGSM_900},
  };
  return plan;
}

struct AreaCodes {
  route::Area area;
  std::uint32_t tac;
  std::uint32_t lac;
  std::uint32_t rac;
};
// The city and suburb share a location area but not a tracking area.
constexpr std::array<AreaCodes, 4> kAreaCodes = {{
    {route::Area::City, 0x2A11, 0x1B01, 0x21},
    {route::Area::Suburb, 0x2A12, 0x1B01, 0x21},
    {route::Area::Country, 0x2A13, 0x1B02, 0x22},
    {route::Area::Valley, 0x2A14, 0x1B03, 0x23},
}};

const AreaCodes& codesOf(route::Area area) {
  return *std::find_if(kAreaCodes.begin(), kAreaCodes.end(),
                       [area](const AreaCodes& codes) { return codes.area == area; });
}

// Distinct values drawn from [0, count).
class DistinctDraw {
 public:
  DistinctDraw(std::uint32_t count, Random& random) : random_(random) {
    for (std::uint32_t value = 0; value < count; ++value)
      pool_.push_back(value);
  }
  std::uint32_t next() {
    const auto pick =
        static_cast<std::size_t>(random_.between(0, static_cast<std::int64_t>(pool_.size()) - 1));
    const std::uint32_t value = pool_[pick];
    pool_.erase(pool_.begin() + static_cast<std::ptrdiff_t>(pick));
    return value;
  }

 private:
  Random& random_;
  std::vector<std::uint32_t> pool_;
};

std::uint32_t drawU32(Random& random, std::int64_t low, std::int64_t high) {
  return static_cast<std::uint32_t>(random.between(low, high));
}

}  // namespace

Network buildNetwork(Random& random) {
  Network network;
  network.plmn = {1, 1, 2};  // the 001/01 test network

  DistinctDraw pcis(504, random);
  DistinctDraw pscs(512, random);
  DistinctDraw gsm900Arfcns(124, random);
  DistinctDraw dcsArfcns(374, random);
  const std::uint32_t enbBase = drawU32(random, 100000, 900000);
  const std::uint32_t umtsCellBase = drawU32(random, 1000, 50000);
  const std::uint32_t gsmCellBase = drawU32(random, 1000, 50000);
  constexpr std::uint32_t kRnc = 211;
  constexpr std::uint32_t kNetworkColourCode = 3;

  for (const SitePlan& plan : sitePlan()) {
    const std::size_t siteIndex = network.sites.size();
    const auto ordinal = static_cast<std::uint32_t>(siteIndex);
    const double alongM = plan.alongM + random.uniform(-40.0, 40.0);
    const route::Area area = route::zoneAt(alongM).area;
    const AreaCodes& codes = codesOf(area);
    network.sites.push_back({alongM, random.uniform(60.0, 280.0), area});

    const std::uint32_t pci = plan.lte.empty() ? 0 : pcis.next();
    for (const LteLayer& layer : plan.lte) {
      network.lte.push_back({siteIndex, layer.band, layer.dlEarfcn, layer.bandwidthCode, pci,
                             ((enbBase + ordinal) << 8) | layer.cellNumber, codes.tac, codes.lac,
                             layer.anchor, layer.referenceSignalDbm, random.uniform(0.2, 0.7)});
    }
    if (plan.umts) {
      network.umts.push_back({siteIndex, plan.umts->band, plan.umts->dlUarfcn, pscs.next(),
                              (kRnc << 16) | (umtsCellBase + ordinal), codes.lac, codes.rac,
                              kCpichDbm + kNetAntennaGainDb, random.uniform(0.3, 0.7)});
    }
    if (plan.gsm) {
      const bool dcs = *plan.gsm == messages::SYS_BAND_GSM_DCS_1800;
      const std::uint32_t arfcn = dcs ? 512 + dcsArfcns.next() : 1 + gsm900Arfcns.next();
      const std::uint32_t bsic = (kNetworkColourCode << 3) | drawU32(random, 0, 7);
      network.gsm.push_back({siteIndex, *plan.gsm, arfcn, bsic, gsmCellBase + ordinal, codes.lac,
                             codes.rac, kBcchDbm + kNetAntennaGainDb - (dcs ? 3.0 : 0.0)});
    }
  }
  return network;
}

}  // namespace tarn::sim
