#pragma once

#include <cstdint>

// Measurements encoded the way a baseband reports them. Each index is rounded to the
// nearest step and clamped to its reporting range.
namespace tarn::sim::units {

// dBm = index - 140, index 0..97.
std::uint32_t rsrpIndex(double dbm);
// dB = index * 0.5 - 19.5, index 0..34.
std::uint32_t rsrqIndex(double db);
// dBm = index - 116, index 0..91.
std::uint32_t rscpIndex(double dbm);
// dB = index * 0.5 - 24.5, index 0..49.
std::uint32_t ecnoIndex(double db);
// dBm = index - 110, index 0..63.
std::uint32_t rxlevIndex(double dbm);

// Hundredths of a dB (-98.5 dB -> -9850).
std::int32_t centiDb(double db);
// Halves of a dB (12.5 dB -> 25).
std::int32_t halfDb(double db);
// Whole dB or dBm, rounded.
std::int32_t wholeDb(double db);

}  // namespace tarn::sim::units
