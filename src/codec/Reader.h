#pragma once

#include <cstdint>

#include "platform/Value.h"

namespace codec {

enum WireType : std::uint32_t {
  kWireVarint = 0,
  kWireFixed64 = 1,
  kWireLengthDelimited = 2,
  kWireStartGroup = 3,
  kWireEndGroup = 4,
  kWireFixed32 = 5,
};

// A varint read from `position`: its value and the byte after it, or no next byte when the input
// ends inside the varint. Up to 10 bytes, 7 bits each, least significant group first; a varint
// whose tenth byte still continues yields 0 after those ten bytes.
struct VarintRead {
  std::uint64_t value;
  const std::uint8_t* next;
};
VarintRead readVarintAt(const std::uint8_t* position, const std::uint8_t* end);

// Reads the Protocol Buffers wire format from a borrowed byte buffer.
//
// Every byte of the buffer is untrusted. A read never goes past the readable
// length: a read that would sets the error flag and yields 0 (a skip, false), and
// once the flag is set every later varint read yields 0 too. Records decode
// through a Cursor taken from the reader.
class Reader {
 public:
  Reader(const std::uint8_t* bytes, std::uint64_t length)
      : begin_(bytes), position_(bytes), end_(bytes + length) {}
  explicit Reader(const platform::Bytes& bytes) : Reader(bytes.data(), bytes.size()) {}

  const std::uint8_t* bytes() const { return begin_; }
  std::uint64_t length() const { return static_cast<std::uint64_t>(end_ - begin_); }
  std::uint64_t position() const { return static_cast<std::uint64_t>(position_ - begin_); }
  bool hasError() const { return error_; }
  void setError() { error_ = true; }

  // A varint as readVarintAt reads it; 0, with the error flag set, when it is cut short.
  std::uint64_t readVarint() {
    // Keys and most values fit in one byte.
    if (!error_ && position_ < end_ && (*position_ & 0x80) == 0) return *position_++;
    return readLongVarint();
  }

  // Skips one value of the given wire type; false when the input is cut short
  // or the wire type is not one a value can have.
  [[nodiscard]] bool skip(std::uint32_t field, std::uint32_t wireType);

 private:
  friend class Cursor;  // takes the position, end and error flag, and gives them back

  std::uint64_t readLongVarint();
  [[nodiscard]] bool advance(std::uint64_t count);
  [[nodiscard]] bool skipValue(std::uint32_t field, std::uint32_t wireType, unsigned depth);

  const std::uint8_t* begin_;
  const std::uint8_t* position_;
  const std::uint8_t* end_;
  bool error_ = false;
};

// The zigzag decoding of the low 32 bits of a varint.
inline std::int32_t decodeZigzag32(std::uint64_t value) {
  const auto bits = static_cast<std::uint32_t>(value);
  return static_cast<std::int32_t>((bits >> 1) ^ (0u - (bits & 1)));
}

}  // namespace codec
