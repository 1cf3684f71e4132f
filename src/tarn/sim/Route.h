#pragma once

#include <string_view>

// The road the phone drives, out and back: a city with an underpass, a suburb, open country
// behind a ridge and a valley behind a second ridge. Positions are metres from the city end.
namespace tarn::sim::route {

inline constexpr double kLengthM = 6000.0;
inline constexpr double kStartM = 1500.0;

enum class Area { City, Suburb, Country, Valley };

struct Zone {
  Area area;
  double fromM;
  double toM;
  double minKmh;
  double maxKmh;
  double trafficLightSpacingM;  // 0 when the zone has no lights
};

const Zone& zoneAt(double positionM);

// Extra loss between a phone on the road and a site beside it: the ridges that lie between
// them and the underpass, when the phone is inside it.
double obstructionDb(double phoneM, double siteM);

}  // namespace tarn::sim::route
