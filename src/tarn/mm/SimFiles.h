#pragma once

#include <cstdint>
#include <optional>
#include <string_view>

#include "platform/Value.h"
#include "tarn/mm/Snapshot.h"
#include "tarn/service/MetricSource.h"

namespace tarn::mm {

// The SIM's elementary files that ModemManager's Sim object tells of, with their contents as a
// phone reads them off the card; empty when it tells of none.
std::optional<service::Metric> simFilesMetric(const Sim& sim, std::uint64_t atMs);

// EF_SPN (TS 31.102 4.2.12): the display condition byte, which ModemManager does not report and
// is left 0, then the name in the GSM default alphabet padded with 0xFF to 16 bytes. Empty for
// a name longer than 16 characters or with a character outside the part of that alphabet that
// ASCII shares.
std::optional<platform::Bytes> encodeEfSpn(std::string_view name);

}  // namespace tarn::mm
