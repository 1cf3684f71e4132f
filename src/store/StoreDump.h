#pragma once

#include "platform/Value.h"
#include "store/MetricValidator.h"

namespace store {

// The whole store as one dictionary: "metricID", the 31 display dictionaries under their member
// names (Null when absent), then "myLTE", "myUMTS", "myGSM" and "myCommon", each keyed by field
// name.
platform::Dictionary dumpStore(const MetricValidator& validator);

}  // namespace store
