#include "tarn/sim/Drive.h"

#include <algorithm>
#include <cmath>

#include "tarn/sim/Route.h"

namespace tarn::sim {
namespace {

constexpr double kAccelerationMps2 = 1.5;
constexpr double kBrakingMps2 = 2.5;
constexpr double kLookAheadM = 80.0;
constexpr double kRedLightChance = 0.45;
constexpr double kCruiseRedrawS = 20.0;

double metresPerSecond(double kmh) {
  return kmh / 3.6;
}

}  // namespace

Drive::Drive() : positionM_(route::kStartM) {}

void Drive::step(double seconds, Random& random) {
  if (waitS_ > 0.0) {
    waitS_ -= seconds;
    return;
  }
  const route::Zone& zone = route::zoneAt(positionM_);
  cruiseHeldS_ += seconds;
  const double low = metresPerSecond(zone.minKmh);
  const double high = metresPerSecond(zone.maxKmh);
  if (cruiseMps_ < low || cruiseMps_ > high || cruiseHeldS_ > kCruiseRedrawS) {
    cruiseMps_ = random.uniform(low, high);
    cruiseHeldS_ = 0.0;
  }

  double target = cruiseMps_;
  if (const std::optional<double> stopM = stopAheadM(random)) {
    const double distance = std::abs(*stopM - positionM_);
    if (distance < 1.0) {
      arrive(random);
      return;
    }
    // Brake so as to halt at the stop line, never faster than the cruise speed.
    target = std::min(target, std::sqrt(2.0 * kBrakingMps2 * distance));
  }
  speedMps_ = std::clamp(target, speedMps_ - kBrakingMps2 * seconds,
                         speedMps_ + kAccelerationMps2 * seconds);
  speedMps_ = std::max(speedMps_, 1.0);
  positionM_ = std::clamp(positionM_ + heading_ * speedMps_ * seconds, 0.0, route::kLengthM);
}

std::optional<double> Drive::stopAheadM(Random& random) {
  const double endM = heading_ > 0 ? route::kLengthM : 0.0;
  if (std::abs(endM - positionM_) < kLookAheadM) return endM;

  const route::Zone& zone = route::zoneAt(positionM_);
  if (zone.trafficLightSpacingM <= 0.0) return std::nullopt;
  // Lights stand half a spacing into each block of the zone.
  const double block = (positionM_ - zone.fromM) / zone.trafficLightSpacingM;
  const double next = heading_ > 0 ? std::floor(block + 0.5) + 0.5 : std::ceil(block - 0.5) - 0.5;
  const double lightM = zone.fromM + next * zone.trafficLightSpacingM;
  if (lightM < zone.fromM || lightM > zone.toM || std::abs(lightM - positionM_) > kLookAheadM) {
    return std::nullopt;
  }
  if (decidedLightM_ != lightM) {
    decidedLightM_ = lightM;
    lightIsRed_ = random.chance(kRedLightChance);
  }
  if (!lightIsRed_) return std::nullopt;
  return lightM;
}

void Drive::arrive(Random& random) {
  speedMps_ = 0.0;
  const bool atEnd = positionM_ < 1.0 || positionM_ > route::kLengthM - 1.0;
  if (atEnd) {
    heading_ = -heading_;
    waitS_ = random.uniform(10.0, 25.0);
  } else {
    lightIsRed_ = false;  // it turns green while we wait
    waitS_ = random.uniform(8.0, 30.0);
  }
}

}  // namespace tarn::sim
