#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include "tarn/Ipc.h"
#include "tarn/Names.h"

// Short ways to write the records that the bus tests send and expect.
namespace bustest {

inline tarn::ipc::Object::Entry entry(std::string_view key, tarn::ipc::Object value) {
  return {std::string(key), std::move(value)};
}

// A dictionary of the app "vexmora" (app ID 2) with `entries` after its app ID.
inline tarn::ipc::Object withAppId(tarn::ipc::Object::Entries entries) {
  entries.insert(entries.begin(), entry(tarn::kKeyAppID, tarn::ipc::Object::integer(2)));
  return tarn::ipc::Object::dictionary(std::move(entries));
}

inline tarn::ipc::Object bytesOf(std::string_view text) {
  return tarn::ipc::Object::bytes(platform::Bytes(text.begin(), text.end()));
}

// Metrics that the bus tests send and expect.
inline constexpr std::uint32_t kRrcState = 0x3C4E04;
inline constexpr std::uint32_t kCaStatus = 0x3CD313;
inline constexpr std::uint32_t kSimFiles = 0x3C0013;

// The query of the app "vexmora" for the SIM files, under `triggerRef` when given.
inline tarn::ipc::Object simFilesQuery(std::optional<std::int64_t> triggerRef = std::nullopt) {
  tarn::ipc::Object::Entries entries;
  if (triggerRef)
    entries.push_back(entry(tarn::kKeyTriggerRef, tarn::ipc::Object::integer(*triggerRef)));
  entries.push_back(entry(tarn::kKeyTriggerID, tarn::ipc::Object::integer(0x7F0013)));
  return withAppId(std::move(entries));
}

// The integer under `key`, or -1 when there is none.
inline std::int64_t integerAt(const tarn::ipc::Object& record, std::string_view key) {
  const tarn::ipc::Object* value = record.find(key);
  return value != nullptr && value->asInteger() != nullptr ? *value->asInteger() : -1;
}

}  // namespace bustest
