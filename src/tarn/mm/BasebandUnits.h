#pragma once

#include <cstdint>
#include <optional>

// ModemManager's dBm and dB as the indexes a baseband reports, rounded to the nearest step.
// A value that the index cannot carry answers empty rather than a clamped, wrong index.
namespace tarn::mm::units {

// dBm = index - 140, index 0..97.
std::optional<std::uint32_t> rsrpIndex(double dbm);
// dB = index * 0.5 - 19.5, index 0..34.
std::optional<std::uint32_t> rsrqIndex(double db);
// dBm = index - 116, index 0..91.
std::optional<std::uint32_t> rscpIndex(double dbm);
// dB = index * 0.5 - 24.5, index 0..49.
std::optional<std::uint32_t> ecnoIndex(double db);
// dBm = index - 110, index 0..63.
std::optional<std::uint32_t> rxlevIndex(double dbm);
// Whole dB or dBm, rounded.
std::int32_t wholeDb(double db);
// Halves of a dB (12.5 dB -> 25).
std::int32_t halfDb(double db);

}  // namespace tarn::mm::units
