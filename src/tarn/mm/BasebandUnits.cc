#include "tarn/mm/BasebandUnits.h"

#include <cmath>

namespace tarn::mm::units {
namespace {

std::optional<std::uint32_t> index(double steps, double highest) {
  const double rounded = std::round(steps);
  if (!(rounded >= 0.0 && rounded <= highest)) return std::nullopt;
  return static_cast<std::uint32_t>(rounded);
}

}  // namespace

std::optional<std::uint32_t> rsrpIndex(double dbm) {
  return index(dbm + 140.0, 97);
}
std::optional<std::uint32_t> rsrqIndex(double db) {
  return index((db + 19.5) * 2.0, 34);
}
std::optional<std::uint32_t> rscpIndex(double dbm) {
  return index(dbm + 116.0, 91);
}
std::optional<std::uint32_t> ecnoIndex(double db) {
  return index((db + 24.5) * 2.0, 49);
}
std::optional<std::uint32_t> rxlevIndex(double dbm) {
  return index(dbm + 110.0, 63);
}
std::int32_t wholeDb(double db) {
  return static_cast<std::int32_t>(std::lround(db));
}
std::int32_t halfDb(double db) {
  return static_cast<std::int32_t>(std::lround(db * 2.0));
}

}  // namespace tarn::mm::units
