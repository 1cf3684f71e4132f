#pragma once

#include <sdbus-c++/Types.h>

#include <map>
#include <string>

#include "tarn/mm/Value.h"

namespace tarn::mm {

using RawDict = std::map<std::string, sdbus::Variant>;

// A variant as the reader takes it: its signature, and its content for the types it reads.
Value valueOf(const sdbus::Variant& variant);
Dict dictOf(const RawDict& raw);

}  // namespace tarn::mm
