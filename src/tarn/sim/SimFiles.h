#pragma once

#include <cstdint>

#include "tarn/service/MetricSource.h"
#include "tarn/sim/Identity.h"
#include "tarn/sim/Network.h"
#include "tarn/sim/PhoneState.h"

namespace tarn::sim {

// Elementary file identifiers of the files the baseband reports.
namespace ef {
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
}  // namespace ef

// The SIM's files as the subscription and the latest registrations have written them.
service::Metric simFiles(const Network& network, const Subscriber& subscriber, const NasState& nas,
                         std::uint64_t atMs);

}  // namespace tarn::sim
