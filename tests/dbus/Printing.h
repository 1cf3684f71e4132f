#pragma once

#include <ostream>

#include "platform/Json.h"
#include "tarn/CommandResult.h"
#include "tarn/Ipc.h"

// Readable failure messages for the objects the bus tests compare.
namespace tarn {
inline void PrintTo(const CommandResult& result, std::ostream* out) {
  *out << "{" << result.status << ", \"" << result.message << "\"}";
}
}  // namespace tarn

namespace tarn::ipc {
inline void PrintTo(const Object& object, std::ostream* out) {
  *out << platform::toJson(toPlainDictionary(object));
}
}  // namespace tarn::ipc
