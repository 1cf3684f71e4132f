#include "tarn/sim/Units.h"

#include <algorithm>
#include <cmath>

namespace tarn::sim::units {
namespace {

std::uint32_t index(double steps, double highest) {
  return static_cast<std::uint32_t>(std::clamp(std::round(steps), 0.0, highest));
}

}  // namespace

std::uint32_t rsrpIndex(double dbm) {
  return index(dbm + 140.0, 97);
}
std::uint32_t rsrqIndex(double db) {
  return index((db + 19.5) * 2.0, 34);
}
std::uint32_t rscpIndex(double dbm) {
  return index(dbm + 116.0, 91);
}
std::uint32_t ecnoIndex(double db) {
  return index((db + 24.5) * 2.0, 49);
}
std::uint32_t rxlevIndex(double dbm) {
  return index(dbm + 110.0, 63);
}

std::int32_t centiDb(double db) {
  return static_cast<std::int32_t>(std::lround(db * 100.0));
}
std::int32_t halfDb(double db) {
  return static_cast<std::int32_t>(std::lround(db * 2.0));
}
std::int32_t wholeDb(double db) {
  return static_cast<std::int32_t>(std::lround(db));
}

}  // namespace tarn::sim::units
