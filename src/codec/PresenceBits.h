#pragma once

#include <cstdint>

namespace codec {

// Collects a record's presence bits in a local while its decoder runs, rather than
// reading and writing the record's flag word for every field, and stores them into the record
// when the decoder returns, whichever way it returns: a decode that fails keeps what it read.
class PresenceBits {
 public:
  explicit PresenceBits(std::uint64_t& flags) : flags_(flags), bits_(flags) {}
  ~PresenceBits() { flags_ = bits_; }
  PresenceBits(const PresenceBits&) = delete;
  PresenceBits& operator=(const PresenceBits&) = delete;

  void add(std::uint64_t bit) { bits_ |= bit; }

 private:
  std::uint64_t& flags_;
  std::uint64_t bits_;
};

}  // namespace codec
