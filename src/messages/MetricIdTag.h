#pragma once

#include <cstdint>

#include "codec/Reader.h"

namespace messages {

// Consumes the varint that follows a metric-ID tag and logs it as
// "Unknown tag: %x:%u"; nothing is stored.
void consumeMetricIdTag(codec::Reader& reader, std::uint16_t tag);

}  // namespace messages
