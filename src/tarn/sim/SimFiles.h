#pragma once

#include <cstdint>

#include "radio/ElementaryFiles.h"
#include "tarn/service/MetricSource.h"
#include "tarn/sim/Identity.h"
#include "tarn/sim/Network.h"
#include "tarn/sim/PhoneState.h"

namespace tarn::sim {

namespace ef = radio::ef;

// The SIM's files as the subscription and the latest registrations have written them.
service::Metric simFiles(const Network& network, const Subscriber& subscriber, const NasState& nas,
                         std::uint64_t atMs);

}  // namespace tarn::sim
