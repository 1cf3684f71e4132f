#include "messages/MetricIdTag.h"

#include "platform/Log.h"

namespace messages {

void consumeMetricIdTag(codec::Reader& reader, std::uint16_t tag) {
  const auto value = static_cast<std::uint32_t>(reader.readVarint());
  platform::log::plainf("Unknown tag: %x:%u", tag, value);
}

}  // namespace messages
