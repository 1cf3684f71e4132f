#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "codec/Reader.h"
#include "codec/Writer.h"
#include "platform/Value.h"

namespace codec {

// The base of every record that reads and writes itself in the wire format.
class Codable {
 public:
  virtual ~Codable() = default;

  // Decodes fields into this record; false when the input was malformed, with
  // what was read so far kept.
  [[nodiscard]] virtual bool readFrom(Reader& reader) = 0;
  virtual void writeTo(Writer& writer) const = 0;
  virtual bool isEqual(const Codable& other) const = 0;
  virtual std::uint64_t hash() const = 0;
  virtual platform::Dictionary dictionaryRepresentation() const = 0;
  virtual std::string_view className() const = 0;

  // The class and identity of the record, then its dictionary's text form.
  std::string description() const;

  // The record's encoding.
  platform::Bytes data() const;

 protected:
  Codable() = default;
  Codable(const Codable&) = default;
  Codable& operator=(const Codable&) = default;
};

// Nested records compare by value; both absent counts as equal.
template <class Record>
bool sameRecord(const std::shared_ptr<Record>& a, const std::shared_ptr<Record>& b) {
  if (!a || !b) return !a && !b;
  return a->isEqual(*b);
}
template <class Record>
bool sameRecords(const std::vector<std::shared_ptr<Record>>& a,
                 const std::vector<std::shared_ptr<Record>>& b) {
  if (a.size() != b.size()) return false;
  for (std::size_t i = 0; i < a.size(); ++i) {
    if (!a[i]->isEqual(*b[i])) return false;
  }
  return true;
}

// A new record decoded from `data` (no data decodes as an empty buffer).
// A payload that does not decode cleanly yields no record at all, so a caller
// never mistakes a partly read record for the real thing.
template <class Record>
std::shared_ptr<Record> initWithData(const platform::Bytes* data) {
  auto record = std::make_shared<Record>();
  Reader reader = data == nullptr ? Reader(nullptr, 0) : Reader(*data);
  if (!record->readFrom(reader)) return nullptr;
  return record;
}

}  // namespace codec
