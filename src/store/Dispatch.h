#pragma once

#include <cstdint>

#include "platform/Value.h"
#include "store/DisplayStore.h"
#include "store/EntryRules.h"
#include "store/Handler.h"

namespace store {

// The handler of a metric ID; none for the IDs the store does not convert.
const Handler* handlerFor(std::int64_t metricID);

// Decodes the payload (none decodes as an empty one) into the handler's display dictionary,
// replacing the stored one, and runs the handler's steps. False, with the store unchanged, when
// the payload does not decode.
bool runHandler(const Handler& handler, const platform::Bytes* payload, DisplayStore& store,
                const TimestampFormatter& formatTimestamp);

}  // namespace store
