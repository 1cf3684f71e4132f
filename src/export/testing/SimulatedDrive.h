#pragma once

#include <cstdint>
#include <string>

namespace exporting::testing {

inline constexpr std::uint64_t kDriveStartEpochMs = 1'700'000'000'000;

// The metric log of a simulated drive of `durationMs` (seed `seed`), as `norvo record` writes
// it: the SIM files first, as the app asks for them, then every metric delivered, with "t_ms"
// from the start and a "device" name.
std::string simulatedDriveLog(std::uint64_t seed, std::uint64_t durationMs,
                              const std::string& device = "sim-1");

}  // namespace exporting::testing
