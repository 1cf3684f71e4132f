#include "codec/Reader.h"

namespace codec {
namespace {
// Groups are a retired encoding that no record uses; nesting is capped so a
// hostile payload cannot exhaust the stack.
constexpr unsigned kMaxGroupDepth = 64;
}  // namespace

std::uint64_t Reader::readVarintChecked() {
  std::uint64_t value = 0;
  for (unsigned shift = 0; shift < 7 * kMaxVarintBytes; shift += 7) {
    std::uint8_t byte = 0;
    if (position_ + 1 != 0 && position_ + 1 <= length_) {
      byte = bytes_[position_++];
    } else {
      error_ = true;
    }
    value |= static_cast<std::uint64_t>(byte & 0x7F) << shift;
    if ((byte & 0x80) == 0) return error_ ? 0 : value;
  }
  return 0;
}

bool Reader::advance(std::uint64_t count) {
  if (count > length_ || position_ > length_ - count) {
    error_ = true;
    return false;
  }
  position_ += count;
  return true;
}

bool Reader::readLength(std::uint64_t& length) {
  length = readVarint();
  if (error_) return false;
  if (position_ > length_ || length > length_ - position_) {
    error_ = true;
    return false;
  }
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
      std::uint64_t length = 0;
      if (!readLength(length)) return false;
      position_ += length;
      return true;
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

std::optional<platform::Bytes> Reader::readBytes() {
  std::uint64_t length = 0;
  if (!readLength(length)) return std::nullopt;
  const auto* begin = bytes_ + position_;
  position_ += length;
  return platform::Bytes(begin, begin + length);
}

std::optional<std::string> Reader::readString() {
  std::uint64_t length = 0;
  if (!readLength(length)) return std::nullopt;
  const auto* begin = reinterpret_cast<const char*>(bytes_ + position_);
  position_ += length;
  return std::string(begin, static_cast<std::size_t>(length));
}

bool Reader::enterRegion(RegionMark& mark) {
  std::uint64_t length = 0;
  if (!readLength(length)) return false;
  mark.length = length_;
  length_ = position_ + length;
  return true;
}

}  // namespace codec
