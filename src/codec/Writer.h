#pragma once

#include <cstdint>
#include <string_view>

#include "platform/Value.h"

namespace codec {

// Writes the Protocol Buffers wire format into a growing byte buffer.
class Writer {
 public:
  // A field number of all ones writes the value bare, without a key: the
  // elements of a packed run are written that way.
  static constexpr std::uint32_t kBare = 0xFFFFFFFF;

  // Where an open length-delimited field's length goes.
  struct LengthMark {
    std::size_t position;
  };

  void writeUint64(std::uint64_t value, std::uint32_t field) {
    writeKey(field, 0);
    writeVarint(value);
  }
  void writeUint32(std::uint32_t value, std::uint32_t field) { writeUint64(value, field); }
  // Negative values are sign-extended to ten bytes, as int32 is on the wire.
  void writeInt32(std::int32_t value, std::uint32_t field) {
    writeUint64(static_cast<std::uint64_t>(static_cast<std::int64_t>(value)), field);
  }
  void writeSint32(std::int32_t value, std::uint32_t field) {
    const auto bits = static_cast<std::uint32_t>(value);
    writeUint64((bits << 1) ^ (value < 0 ? 0xFFFFFFFFu : 0u), field);
  }
  void writeBool(bool value, std::uint32_t field) { writeUint64(value ? 1u : 0u, field); }
  void writeBytes(const platform::Bytes& value, std::uint32_t field);
  void writeString(std::string_view value, std::uint32_t field);

  // Frames whatever `record.writeTo(*this)` writes as one length-delimited field.
  template <class Record>
  void writeMessage(const Record& record, std::uint32_t field) {
    const LengthMark mark = openLengthDelimited(field);
    record.writeTo(*this);
    closeLengthDelimited(mark);
  }

  LengthMark openLengthDelimited(std::uint32_t field);
  // Fixes the length of the field opened at `mark` to what was written since.
  void closeLengthDelimited(LengthMark mark);

  const platform::Bytes& data() const { return buffer_; }
  platform::Bytes take() { return std::move(buffer_); }

 private:
  void writeKey(std::uint32_t field, std::uint32_t wireType) {
    if (field != kBare) writeVarint((static_cast<std::uint64_t>(field) << 3) | wireType);
  }
  void writeVarint(std::uint64_t value) {
    while (value >= 0x80) {
      buffer_.push_back(static_cast<std::uint8_t>(value | 0x80));
      value >>= 7;
    }
    buffer_.push_back(static_cast<std::uint8_t>(value));
  }

  platform::Bytes buffer_;
};

}  // namespace codec
