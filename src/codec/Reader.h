#pragma once

#include <cstdint>
#include <optional>
#include <string>

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

// What enterRegion saves so that leaveRegion can restore the readable length.
struct RegionMark {
  std::uint64_t length = 0;
};

// Reads the Protocol Buffers wire format from a borrowed byte buffer.
//
// Every byte of the buffer is untrusted. A read never goes past the readable
// length: a read that would sets the error flag and yields 0 (or nothing), and
// once the flag is set every later varint read yields 0 too.
class Reader {
 public:
  Reader(const std::uint8_t* bytes, std::uint64_t length) : bytes_(bytes), length_(length) {}
  explicit Reader(const platform::Bytes& bytes) : Reader(bytes.data(), bytes.size()) {}

  const std::uint8_t* bytes() const { return bytes_; }
  std::uint64_t length() const { return length_; }
  std::uint64_t position() const { return position_; }
  bool hasError() const { return error_; }
  void setError() { error_ = true; }

  // Up to 10 bytes, 7 bits each, least significant group first. A varint
  // whose tenth byte still continues yields 0 without an error.
  std::uint64_t readVarint() {
    if (!error_ && position_ < length_) {
      // Keys and most values fit in one byte; nested records are short, so a varint is often
      // within ten bytes of its region's end, where the unchecked read would not be allowed.
      const std::uint8_t first = bytes_[position_];
      if ((first & 0x80) == 0) {
        ++position_;
        return first;
      }
      if (length_ - position_ >= kMaxVarintBytes) return readVarintUnchecked();
    }
    return readVarintChecked();
  }

  // Skips one value of the given wire type; false when the input is cut short
  // or the wire type is not one a value can have.
  [[nodiscard]] bool skip(std::uint32_t field, std::uint32_t wireType);

  // Length-delimited values; absent when the input is cut short.
  std::optional<platform::Bytes> readBytes();
  std::optional<std::string> readString();

  // Narrows the readable length to the length-delimited value that starts at
  // the position; false when its length runs past the readable length.
  [[nodiscard]] bool enterRegion(RegionMark& mark);
  void leaveRegion(const RegionMark& mark) { length_ = mark.length; }

 private:
  static constexpr std::uint64_t kMaxVarintBytes = 10;

  std::uint64_t readVarintUnchecked() {
    std::uint64_t value = 0;
    for (unsigned shift = 0; shift < 7 * kMaxVarintBytes; shift += 7) {
      const std::uint8_t byte = bytes_[position_++];
      value |= static_cast<std::uint64_t>(byte & 0x7F) << shift;
      if ((byte & 0x80) == 0) return value;
    }
    return 0;
  }
  std::uint64_t readVarintChecked();
  [[nodiscard]] bool readLength(std::uint64_t& length);
  [[nodiscard]] bool advance(std::uint64_t count);
  [[nodiscard]] bool skipValue(std::uint32_t field, std::uint32_t wireType, unsigned depth);

  const std::uint8_t* bytes_;
  std::uint64_t length_;
  std::uint64_t position_ = 0;
  bool error_ = false;
};

// The zigzag decoding of the low 32 bits of a varint.
inline std::int32_t decodeZigzag32(std::uint64_t value) {
  const auto bits = static_cast<std::uint32_t>(value);
  return static_cast<std::int32_t>((bits >> 1) ^ (0u - (bits & 1)));
}

}  // namespace codec
