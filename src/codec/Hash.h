#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "platform/Value.h"

namespace codec {

// Hashes of the members a record holds by reference; 0 when absent, so that
// an empty record of a class without packed runs hashes to 0.
std::uint64_t hashBytes(const std::uint8_t* bytes, std::size_t size);

inline std::uint64_t hashOf(const std::optional<std::string>& text) {
  return text ? hashBytes(reinterpret_cast<const std::uint8_t*>(text->data()), text->size()) : 0;
}
inline std::uint64_t hashOf(const std::optional<platform::Bytes>& bytes) {
  return bytes ? hashBytes(bytes->data(), bytes->size()) : 0;
}
template <class Record>
std::uint64_t hashOf(const std::shared_ptr<Record>& record) {
  return record ? record->hash() : 0;
}
template <class Record>
std::uint64_t hashOf(const std::vector<std::shared_ptr<Record>>& list) {
  std::uint64_t hash = 0;
  for (const auto& element : list)
    hash = hash * 31 + element->hash();
  return hash;
}

// Scalars: the value widened to 64 bits times the golden-ratio constant.
inline std::uint64_t hashScalar(std::uint64_t widened) {
  return widened * 2654435761u;
}

}  // namespace codec
