#pragma once

#include <cstdint>

// Identifiers of the SIM's elementary files that the baseband reports (TS 31.102 4.2, TS 102.221
// 13.2).
namespace radio::ef {
inline constexpr std::uint32_t kIccid = 0x2FE2;
inline constexpr std::uint32_t kPreferredLanguages = 0x2F05;
inline constexpr std::uint32_t kImsi = 0x6F07;
inline constexpr std::uint32_t kHplmnSearchPeriod = 0x6F31;
inline constexpr std::uint32_t kServiceProviderName = 0x6F46;
inline constexpr std::uint32_t kPsLocation = 0x6F73;
inline constexpr std::uint32_t kAccessControlClass = 0x6F78;
inline constexpr std::uint32_t kForbiddenPlmns = 0x6F7B;
inline constexpr std::uint32_t kLocation = 0x6F7E;
inline constexpr std::uint32_t kAdministrativeData = 0x6FAD;
inline constexpr std::uint32_t kEpsLocation = 0x6FE3;
}  // namespace radio::ef
