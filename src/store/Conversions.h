#pragma once

#include <span>

#include "store/Handler.h"

// The handlers of each radio technology.
namespace store {

std::span<const Handler> lteHandlers();
std::span<const Handler> umtsHandlers();
// GSM, the NAS contexts and bearers, and the SIM files.
std::span<const Handler> gsmNasHandlers();

}  // namespace store
