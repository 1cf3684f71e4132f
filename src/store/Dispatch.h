#pragma once

#include <cstdint>
#include <functional>

#include "platform/Value.h"
#include "store/DisplayStore.h"
#include "store/EntryRules.h"
#include "store/Handler.h"

namespace store {

// The handler of a metric ID; none for the IDs the store does not convert.
const Handler* handlerFor(std::int64_t metricID);

// Sees a display dictionary as it decoded, before the handler's steps rewrite it.
using DecodedObserver = std::function<void(const platform::Dictionary& decoded)>;

// Decodes the payload (none decodes as an empty one) into the handler's display dictionary,
// replacing the stored one, shows it to `observeDecoded` (when set) and runs the handler's
// steps. False, with the store unchanged, when the payload does not decode.
bool runHandler(const Handler& handler, const platform::Bytes* payload, DisplayStore& store,
                const TimestampFormatter& formatTimestamp,
                const DecodedObserver& observeDecoded = {});

}  // namespace store
