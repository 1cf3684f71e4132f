#pragma once

#include <optional>
#include <string>

#include "platform/Value.h"
#include "store/MetricValidator.h"

// The subscriber and the network name, from the SIM files of the latest SIM file metric.
namespace dashboard {

// The service provider name of EF_SPN (TS 31.102 4.2.12): after the display condition byte,
// the name in the SMS default alphabet, padded with 0xFF. Empty without the file, for an empty
// name, or for a name in UCS2 (first byte 0x80 to 0x82), which is not decoded.
std::optional<std::string> serviceProviderName(const store::MetricValidator& intake);

// {"imsi", "mcc", "mnc", "msin", "iccid"}: each entry only when its file decodes; the IMSI is
// split after the MNC length of EF_AD, or the usual one of its MCC. Empty when neither
// EF_IMSI nor EF_ICCID decodes.
std::optional<platform::Dictionary> subscriberOf(const store::MetricValidator& intake);

}  // namespace dashboard
