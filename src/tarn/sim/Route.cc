#include "tarn/sim/Route.h"

#include <algorithm>
#include <array>
#include <cmath>

namespace tarn::sim::route {
namespace {

constexpr std::array<Zone, 4> kZones = {{
    {Area::City, 0.0, 2200.0, 30.0, 50.0, 350.0},
    {Area::Suburb, 2200.0, 3750.0, 50.0, 70.0, 0.0},
    {Area::Country, 3750.0, 5300.0, 70.0, 100.0, 0.0},
    {Area::Valley, 5300.0, kLengthM, 50.0, 80.0, 0.0},
}};

// Knife-edge diffraction over a ridge: the loss grows over the width of its crest.
struct Ridge {
  double atM;
  double widthM;
  double lossDb;
};
constexpr std::array<Ridge, 2> kRidges = {{{3750.0, 160.0, 36.0}, {5300.0, 160.0, 42.0}}};

struct Underpass {
  double fromM;
  double toM;
  double rampM;
  double lossDb;
};
constexpr Underpass kUnderpass = {2000.0, 2120.0, 12.0, 55.0};

// 0 before the ridge, 1 behind it, smooth over its crest.
double side(const Ridge& ridge, double positionM) {
  const double t = std::clamp((positionM - ridge.atM) / ridge.widthM + 0.5, 0.0, 1.0);
  return t * t * (3.0 - 2.0 * t);
}

double underpassDb(double positionM) {
  const double inside = std::min(positionM - kUnderpass.fromM, kUnderpass.toM - positionM);
  return kUnderpass.lossDb * std::clamp(inside / kUnderpass.rampM, 0.0, 1.0);
}

}  // namespace

const Zone& zoneAt(double positionM) {
  for (const Zone& zone : kZones) {
    if (positionM < zone.toM) return zone;
  }
  return kZones.back();
}

double obstructionDb(double phoneM, double siteM) {
  double loss = underpassDb(phoneM);
  for (const Ridge& ridge : kRidges) {
    loss += ridge.lossDb * std::abs(side(ridge, phoneM) - side(ridge, siteM));
  }
  return loss;
}

}  // namespace tarn::sim::route
