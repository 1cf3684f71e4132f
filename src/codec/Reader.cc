#include "codec/Reader.h"

#include <bit>
#include <cstring>

namespace codec {
namespace {
constexpr unsigned kMaxVarintBytes = 10;
// Groups are a retired encoding that no record uses; nesting is capped so a
// hostile payload cannot exhaust the stack.
constexpr unsigned kMaxGroupDepth = 64;
}  // namespace

VarintRead readVarintAt(const std::uint8_t* position, const std::uint8_t* end) {
  if (end - position >= 8) {
    // The varints of up to eight bytes (every value below 2^56: timestamps, cell identities)
    // decode from one load: the first clear continuation bit ends the varint, and its 7-bit
    // groups are packed together in three steps of doubling width.
    static_assert(std::endian::native == std::endian::little, "the first byte is the lowest");
    std::uint64_t word;
    std::memcpy(&word, position, sizeof word);
    const std::uint64_t stops = ~word & 0x8080808080808080u;
    if (stops != 0) {
      word &= (stops ^ (stops - 1)) & 0x7F7F7F7F7F7F7F7Fu;
      word = (word & 0x007F007F007F007Fu) | (word & 0x7F007F007F007F00u) >> 1;
      word = (word & 0x00003FFF00003FFFu) | (word & 0x3FFF00003FFF0000u) >> 2;
      word = (word & 0x000000000FFFFFFFu) | (word & 0x0FFFFFFF00000000u) >> 4;
      return {word, position + (std::countr_zero(stops) + 1) / 8};
    }
  }
  std::uint64_t value = 0;
  for (unsigned shift = 0; shift < 7 * kMaxVarintBytes; shift += 7) {
    if (position == end) return {0, nullptr};
    const std::uint8_t byte = *position++;
    value |= static_cast<std::uint64_t>(byte & 0x7F) << shift;
    if ((byte & 0x80) == 0) return {value, position};
  }
  return {0, position};
}

std::uint64_t Reader::readLongVarint() {
  const VarintRead read = readVarintAt(position_, end_);
  if (read.next == nullptr) {
    error_ = true;
    position_ = end_;
    return 0;
  }
  position_ = read.next;
  return error_ ? 0 : read.value;
}

bool Reader::advance(std::uint64_t count) {
  if (count > static_cast<std::uint64_t>(end_ - position_)) {
    error_ = true;
    return false;
  }
  position_ += count;
  return true;
}

bool Reader::skip(std::uint32_t field, std::uint32_t wireType) {
  return skipValue(field, wireType, 0);
}

bool Reader::skipValue(std::uint32_t field, std::uint32_t wireType, unsigned depth) {
  switch (wireType) {
    case kWireVarint:
      readVarint();
      return !error_;
    case kWireFixed64:
      return advance(8);
    case kWireFixed32:
      return advance(4);
    case kWireLengthDelimited: {
      const std::uint64_t length = readVarint();
      return !error_ && advance(length);
    }
    case kWireStartGroup:
      if (depth >= kMaxGroupDepth) return false;
      for (;;) {
        const std::uint64_t key = readVarint();
        if (error_) return false;
        const auto innerWireType = static_cast<std::uint32_t>(key & 7);
        const auto innerField = static_cast<std::uint32_t>(key >> 3);
        if (innerWireType == kWireEndGroup) return innerField == field;
        if (!skipValue(innerField, innerWireType, depth + 1)) return false;
      }
    default:
      return false;
  }
}

}  // namespace codec
