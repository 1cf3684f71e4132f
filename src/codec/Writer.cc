#include "codec/Writer.h"

namespace codec {
namespace {
std::size_t varintSize(std::uint64_t value) {
  std::size_t size = 1;
  while (value >= 0x80) {
    value >>= 7;
    ++size;
  }
  return size;
}
}  // namespace

void Writer::writeBytes(const platform::Bytes& value, std::uint32_t field) {
  writeKey(field, 2);
  writeVarint(value.size());
  buffer_.insert(buffer_.end(), value.begin(), value.end());
}

void Writer::writeString(std::string_view value, std::uint32_t field) {
  writeKey(field, 2);
  writeVarint(value.size());
  buffer_.insert(buffer_.end(), value.begin(), value.end());
}

// One byte is kept for the length, which fits most nested records; a longer
// length moves the field's contents up to make room.
Writer::LengthMark Writer::openLengthDelimited(std::uint32_t field) {
  writeKey(field, 2);
  const LengthMark mark{buffer_.size()};
  buffer_.push_back(0);
  return mark;
}

void Writer::closeLengthDelimited(LengthMark mark) {
  const std::size_t contentStart = mark.position + 1;
  const std::size_t length = buffer_.size() - contentStart;
  const std::size_t lengthSize = varintSize(length);
  if (lengthSize > 1) {
    buffer_.insert(buffer_.begin() + static_cast<std::ptrdiff_t>(contentStart), lengthSize - 1, 0);
  }
  std::uint64_t value = length;
  for (std::size_t i = 0; i < lengthSize; ++i) {
    const bool more = i + 1 < lengthSize;
    buffer_[mark.position + i] = static_cast<std::uint8_t>((value & 0x7F) | (more ? 0x80 : 0));
    value >>= 7;
  }
}

}  // namespace codec
