#include "codec/Hash.h"

namespace codec {

std::uint64_t hashBytes(const std::uint8_t* bytes, std::size_t size) {
  std::uint64_t hash = 14695981039346656037u;
  for (std::size_t i = 0; i < size; ++i)
    hash = (hash ^ bytes[i]) * 1099511628211u;
  return hash;
}

}  // namespace codec
