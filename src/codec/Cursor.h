#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>

#include "codec/Reader.h"

namespace codec {

// A reader's position, end and error flag held in locals of a record's decoder.
//
// The decoder stores every field into the record as it reads it; were the position a member of
// the reader, each such store might alias it and the compiler would reload it after every field.
// A cursor whose address is never taken lives in registers instead. The decoder takes it from
// the reader on entry and stores it back before anything that reads through the reader (nested
// records, skips, logged tags) and before it returns.
//
// Reads follow the reader's rules, with one promise of the decoder in place of the reader's
// sticky error flag: it reads nothing more once a read failed. A varint cut short leaves the
// cursor at its end, so the decoder's loop ends by itself.
//
// Every member is forced inline: a call that took the cursor's address would put it back in
// memory, and the decoders of the larger records are past what the compiler inlines unasked.
class Cursor {
 public:
  [[gnu::always_inline]] explicit Cursor(const Reader& reader) { loadFrom(reader); }

  [[gnu::always_inline]] void loadFrom(const Reader& reader) {
    position_ = reader.position_;
    end_ = reader.end_;
    error_ = reader.error_;
  }
  [[gnu::always_inline]] void storeTo(Reader& reader) const {
    reader.position_ = position_;
    reader.end_ = end_;
    reader.error_ = error_;
  }
  // Stores the cursor back for the decoder's return; true when nothing failed.
  [[gnu::always_inline]] bool finish(Reader& reader) const {
    storeTo(reader);
    return !error_;
  }

  [[gnu::always_inline]] bool hasMore() const { return position_ < end_; }
  [[gnu::always_inline]] bool hasError() const { return error_; }

  [[gnu::always_inline]] std::uint64_t readVarint() { return readVarintOr(0); }

  // A key cut short reads as an end-group key, with the error flag set: the decoder's one test
  // for the end of its fields then also stops it there.
  [[gnu::always_inline]] std::uint64_t readKey() { return readVarintOr(kWireEndGroup); }

  // Length-delimited values; absent, with the error flag set, when the input is cut short.
  [[gnu::always_inline]] std::optional<std::string> readString() {
    return readText<std::string, char>();
  }
  [[gnu::always_inline]] std::optional<platform::Bytes> readBytes() {
    return readText<platform::Bytes, std::uint8_t>();
  }

  // Decodes the length-delimited value at the position into `record`, which reads through
  // `reader`: the cursor is stored into the reader for the call and loaded from it after. False,
  // with the reader up to date, when the value is cut short or does not decode.
  template <class Record>
  [[gnu::always_inline, nodiscard]] bool readNested(Reader& reader, Record& record) {
    std::uint64_t length = 0;
    if (!readLength(length)) {
      storeTo(reader);
      return false;
    }
    const std::uint8_t* const outerEnd = end_;
    end_ = position_ + length;
    storeTo(reader);
    if (!record.readFrom(reader)) return false;
    loadFrom(reader);
    end_ = outerEnd;
    return true;
  }

  // How many length-delimited values under `key`, just read, follow one another from the
  // position, the one there included: the elements of a list come together, so a decoder can
  // size the list once. Reads nothing.
  [[gnu::always_inline]] std::size_t countAdjacent(std::uint64_t key) const {
    return countAdjacent(position_, end_, key);
  }

  // Appends a packed run's values, or the single value of an unpacked field; false when the
  // input is cut short, with the values read so far appended (a value cut short as 0).
  template <class Run, class Decode>
  [[gnu::always_inline, nodiscard]] bool readPacked(std::uint32_t wireType, Run& run,
                                                    Decode decode) {
    if (wireType != kWireLengthDelimited) {
      run.add(decode(readVarint()));
      return !error_;
    }
    std::uint64_t length = 0;
    if (!readLength(length)) return false;
    const std::uint8_t* const outerEnd = end_;
    end_ = position_ + length;
    while (position_ < end_)
      run.add(decode(readVarint()));
    end_ = outerEnd;
    return !error_;
  }

 private:
  // A varint cut short yields `cutShort`.
  [[gnu::always_inline]] std::uint64_t readVarintOr(std::uint64_t cutShort) {
    // Keys and most values take one byte; two-byte keys (fields from 16 on) and values
    // (signal levels, channel numbers) are next most common.
    if (position_ < end_) {
      const std::uint64_t first = position_[0];
      if ((first & 0x80) == 0) {
        ++position_;
        return first;
      }
      if (end_ - position_ >= 2 && (position_[1] & 0x80) == 0) {
        const std::uint64_t second = position_[1];
        position_ += 2;
        return (first & 0x7F) | second << 7;
      }
    }
    const VarintRead read = readVarintAt(position_, end_);
    if (read.next == nullptr) {
      error_ = true;
      position_ = end_;
      return cutShort;
    }
    position_ = read.next;
    return read.value;
  }

  Cursor(const std::uint8_t* position, const std::uint8_t* end)
      : position_(position), end_(end), error_(false) {}
  // Out of line, and so given the position rather than the cursor.
  static std::size_t countAdjacent(const std::uint8_t* position, const std::uint8_t* end,
                                   std::uint64_t key);

  [[gnu::always_inline, nodiscard]] bool readLength(std::uint64_t& length) {
    length = readVarint();
    if (error_) return false;
    if (length > static_cast<std::uint64_t>(end_ - position_)) {
      error_ = true;
      return false;
    }
    return true;
  }

  template <class Text, class Char>
  [[gnu::always_inline]] std::optional<Text> readText() {
    std::uint64_t length = 0;
    if (!readLength(length)) return std::nullopt;
    const auto* begin = reinterpret_cast<const Char*>(position_);
    position_ += length;
    return Text(begin, begin + length);
  }

  const std::uint8_t* position_;
  const std::uint8_t* end_;
  bool error_;
};

}  // namespace codec
