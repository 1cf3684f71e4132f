#pragma once

#include <cstdint>
#include <functional>
#include <span>

// The top-level fields of one record in the Protocol Buffers wire format, read without its
// schema: enough to pick a few numbers out of a payload.
namespace fleet {

struct WireField {
  std::uint32_t number;
  std::uint64_t varint;                  // the value of a varint field, else 0
  std::span<const std::uint8_t> nested;  // the bytes of a length-delimited field, else empty
};

// Calls `visit` for each field in order; false when the record is cut short or malformed.
bool forEachField(std::span<const std::uint8_t> record,
                  const std::function<void(const WireField&)>& visit);

// A sint32 field's value from its zigzag varint.
inline std::int64_t zigzag(std::uint64_t value) {
  return static_cast<std::int64_t>(value >> 1) ^ -static_cast<std::int64_t>(value & 1);
}

}  // namespace fleet
