#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>
#include <utility>
#include <variant>
#include <vector>

#include "platform/Value.h"

// The objects that travel between clients and the baseband manager service.
namespace tarn::ipc {

// One IPC object: null, a 64-bit integer, a byte buffer, text, an array or a dictionary with
// text keys. Dictionaries keep their entries in insertion order.
class Object {
 public:
  using Entry = std::pair<std::string, Object>;
  using Entries = std::vector<Entry>;
  using Array = std::vector<Object>;

  // The largest byte buffer one message carries.
  static constexpr std::size_t kMaxBufferSize = std::size_t{64} << 20;

  // Null.
  Object() = default;
  static Object integer(std::int64_t value);
  // Null when the buffer is larger than a message carries.
  static Object bytes(platform::Bytes value);
  static Object text(std::string value);
  static Object array(Array elements);
  static Object dictionary(Entries entries = {});

  bool isNull() const { return std::holds_alternative<std::monostate>(value_); }
  bool isDictionary() const { return std::holds_alternative<Entries>(value_); }
  const std::int64_t* asInteger() const { return std::get_if<std::int64_t>(&value_); }
  const platform::Bytes* asBytes() const { return std::get_if<platform::Bytes>(&value_); }
  const std::string* asText() const { return std::get_if<std::string>(&value_); }
  const Array* asArray() const { return std::get_if<Array>(&value_); }
  const Entries* asDictionary() const { return std::get_if<Entries>(&value_); }

  // Dictionary entries: the value under `key`, or null when absent or this is no dictionary.
  const Object* find(std::string_view key) const;
  // Replaces the value of an existing key or appends a new entry; an object that is no
  // dictionary first becomes an empty one.
  void set(std::string_view key, Object value);

  // Calls `visitor` with the stored value: std::monostate, std::int64_t, platform::Bytes,
  // std::string, Array or Entries.
  template <class Visitor>
  decltype(auto) visit(Visitor&& visitor) const {
    return std::visit(std::forward<Visitor>(visitor), value_);
  }

  bool operator==(const Object&) const = default;

 private:
  using Storage =
      std::variant<std::monostate, std::int64_t, platform::Bytes, std::string, Array, Entries>;

  template <class T>
  Object(std::in_place_type_t<T> type, T value) : value_(type, std::move(value)) {}

  Storage value_;
};

// The plain form of a received object, as the app works with it: a dictionary becomes a
// platform::Dictionary with the same keys in the same order, integers Int64, buffers Bytes, text
// String, arrays List and null Null. Objects that are no dictionary convert likewise.
platform::Value toPlainDictionary(const Object& object);

}  // namespace tarn::ipc
