#pragma once

#include <cstdint>
#include <optional>
#include <string_view>

#include "platform/Value.h"
#include "tarn/mm/Snapshot.h"
#include "tarn/service/MetricSource.h"

namespace tarn::mm {

// The SIM's elementary files that ModemManager's Sim object tells of, with their contents as a
// phone reads them off the card: EF_ICCID and EF_IMSI in swapped-nibble BCD padded with F, and
// EF_SPN. Empty when it tells of none, or of none that encodes.
std::optional<service::Metric> simFilesMetric(const Sim& sim, std::uint64_t atMs);

// EF_SPN (TS 31.102 4.2.12): the display condition byte, which ModemManager does not report and
// is left 0, then the name in the GSM default alphabet padded with 0xFF to 16 bytes. Empty for
// a name longer than 16 characters or with a character outside the part of that alphabet that
// ASCII shares.
std::optional<platform::Bytes> encodeEfSpn(std::string_view name);

// The IMSI as the NAS common information carries it, in EF_IMSI's encoding; empty without one.
std::optional<service::Metric> mmCommonInfoMetric(const Sim& sim, std::uint64_t atMs);

}  // namespace tarn::mm
