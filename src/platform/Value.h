#pragma once

#include <cassert>
#include <concepts>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <initializer_list>
#include <optional>
#include <string>
#include <string_view>
#include <type_traits>
#include <utility>
#include <variant>
#include <vector>

namespace platform {

using Bytes = std::vector<std::uint8_t>;
class Value;
using List = std::vector<Value>;

// Text keys to values. Iterates and prints in insertion order, but compares as a plain map:
// two dictionaries with the same entries in another order are equal.
// Dictionaries are small, so entries live in one vector and lookup is linear.
class Dictionary {
 public:
  using Entry = std::pair<std::string, Value>;
  using const_iterator = std::vector<Entry>::const_iterator;

  Dictionary() = default;
  // Later entries replace earlier ones with the same key.
  Dictionary(std::initializer_list<Entry> entries);

  const Value* find(std::string_view key) const;
  Value* find(std::string_view key);
  bool contains(std::string_view key) const { return find(key) != nullptr; }

  // Replaces the value of an existing key in place, or appends a new entry.
  void set(std::string key, Value value);
  // Appends without looking for the key; the caller guarantees that it is new.
  void append(std::string key, Value value);
  // Removes the entry and keeps the order of the others; false when the key is absent.
  bool erase(std::string_view key);

  // For rewriting a dictionary in place: writes the entry over the one at `index` (at most
  // size(), where it appends), reusing the storage of its key and value, and truncate() then
  // drops the entries not written over. The caller keeps the keys unique once done.
  void writeOver(std::size_t index, std::string_view key, const Value& value);
  void truncate(std::size_t size);

  std::size_t size() const;
  bool empty() const;
  const_iterator begin() const;
  const_iterator end() const;
  void reserve(std::size_t capacity);

  // The text form, e.g. ["a": 1, "b": "x"]; see Value::description.
  std::string description() const;

  bool operator==(const Dictionary& other) const;

 private:
  std::vector<Entry> entries_;
};

// One plain value: absent (Null), a boolean, a number of a fixed C++ type, text, a byte buffer,
// a list or a dictionary.
class Value {
 public:
#pragma GCC diagnostic push
  // GCC takes the scoped enumerators Bytes and List for shadows of the types of those names.
#pragma GCC diagnostic ignored "-Wshadow"
  enum class Kind {
    Null,
    Bool,
    Int32,
    UInt32,
    Int64,
    UInt64,
    Float,
    Double,
    String,
    Bytes,
    List,
    Dictionary
  };
#pragma GCC diagnostic pop

  Value() noexcept = default;
  Value(std::nullptr_t) noexcept {}
  Value(bool value) noexcept : storage_(value) {}
  Value(std::int32_t value) noexcept : storage_(value) {}
  Value(std::uint32_t value) noexcept : storage_(value) {}
  Value(std::int64_t value) noexcept : storage_(value) {}
  Value(std::uint64_t value) noexcept : storage_(value) {}
  // The remaining integer types (short, char, long long, ...) take the kind of their
  // signedness and size.
  template <std::integral T>
  requires(!std::same_as<T, bool>) Value(T value)
  noexcept : storage_(widen(value)) {}
  Value(float value) noexcept : storage_(value) {}
  Value(double value) noexcept : storage_(value) {}
  // A null pointer gives Null.
  Value(const char* text);
  Value(std::string text) noexcept : storage_(std::move(text)) {}
  Value(std::string_view text) : storage_(std::string(text)) {}
  Value(Bytes bytes) noexcept : storage_(std::move(bytes)) {}
  Value(List list) noexcept : storage_(std::move(list)) {}
  Value(Dictionary dictionary) noexcept : storage_(std::move(dictionary)) {}
  // Any other pointer would silently become a Bool.
  template <class T>
  requires(!std::same_as<std::remove_cv_t<T>, char>) Value(T*)
  = delete;

  Kind kind() const {
    return static_cast<Kind>(storage_.index());
  }
  bool isNull() const {
    return kind() == Kind::Null;
  }
  bool isBool() const {
    return kind() == Kind::Bool;
  }
  // Booleans count as numbers (0 and 1).
  bool isNumber() const {
    return kind() >= Kind::Bool && kind() <= Kind::Double;
  }
  bool isString() const {
    return kind() == Kind::String;
  }
  bool isBytes() const {
    return kind() == Kind::Bytes;
  }
  bool isList() const {
    return kind() == Kind::List;
  }
  bool isDictionary() const {
    return kind() == Kind::Dictionary;
  }

  // Numeric reads succeed only when the stored value is a number (a boolean reads as 0 or 1)
  // that the target type represents exactly: Double 5.0 reads as the integer 5, Double 5.5
  // and Double 0.1 as a float do not.
  std::optional<std::int64_t> asInteger() const;
  std::optional<std::int32_t> asInt32() const;
  std::optional<float> asFloat() const;
  std::optional<double> asDouble() const;

  const std::string* asString() const {
    return std::get_if<std::string>(&storage_);
  }
  const Bytes* asBytes() const {
    return std::get_if<Bytes>(&storage_);
  }
  const List* asList() const {
    return std::get_if<List>(&storage_);
  }
  List* asList() {
    return std::get_if<List>(&storage_);
  }
  const Dictionary* asDictionary() const {
    return std::get_if<Dictionary>(&storage_);
  }
  Dictionary* asDictionary() {
    return std::get_if<Dictionary>(&storage_);
  }

  // The text form for log lines and screens: text plainly, numbers in decimal, booleans as 1
  // or 0, floating values in their shortest exact form with a fractional part ("5.0"), byte
  // buffers as <0a1b2c3d 4e>, lists as [1, 3, 7], dictionaries as ["a": 1] (empty: [:]),
  // text inside lists and dictionaries in double quotes, Null as (null).
  std::string description() const;

  // Calls visitor with the stored C++ value: std::monostate for Null, then bool, std::int32_t,
  // std::uint32_t, std::int64_t, std::uint64_t, float, double, std::string, Bytes, List or
  // Dictionary.
  template <class Visitor>
  decltype(auto) visit(Visitor&& visitor) const {
    return std::visit(std::forward<Visitor>(visitor), storage_);
  }

  // Same kind and same value: Int32 1 differs from Int64 1.
  bool operator==(const Value& other) const;

 private:
  using Storage = std::variant<std::monostate, bool, std::int32_t, std::uint32_t, std::int64_t,
                               std::uint64_t, float, double, std::string, Bytes, List, Dictionary>;

  template <std::integral T>
  static auto widen(T value) {
    if constexpr (std::is_signed_v<T>) {
      if constexpr (sizeof(T) <= sizeof(std::int32_t))
        return std::int32_t{value};
      else
        return static_cast<std::int64_t>(value);
    } else {
      if constexpr (sizeof(T) <= sizeof(std::uint32_t))
        return std::uint32_t{value};
      else
        return static_cast<std::uint64_t>(value);
    }
  }

  template <class Target>
  std::optional<Target> exactly() const;

  Storage storage_;
};

// The text form of a list, as inside Value::description.
std::string description(const List& list);

// Appends the text form, as description() gives it, to `out`, growing it once.
void appendDescription(std::string& out, const Value& value);
void appendDescription(std::string& out, const Dictionary& dictionary);

namespace detail {
template <class Word>
inline Word wordAt(const char* at) {
  Word word;
  std::memcpy(&word, at, sizeof word);
  return word;
}

// Keys are short and those of a record often share their length ("rsrp0", "sinr1"): they are
// compared a word at a time, in words that may overlap, rather than through memcmp.
inline bool sameKey(std::string_view key, std::string_view other) {
  const std::size_t size = key.size();
  if (size != other.size()) return false;
  const char* const a = key.data();
  const char* const b = other.data();
  if (size >= 8) {
    for (std::size_t at = 0; at + 8 < size; at += 8) {
      if (wordAt<std::uint64_t>(a + at) != wordAt<std::uint64_t>(b + at)) return false;
    }
    return wordAt<std::uint64_t>(a + size - 8) == wordAt<std::uint64_t>(b + size - 8);
  }
  if (size >= 4) {
    return wordAt<std::uint32_t>(a) == wordAt<std::uint32_t>(b) &&
           wordAt<std::uint32_t>(a + size - 4) == wordAt<std::uint32_t>(b + size - 4);
  }
  return size == 0 || (a[0] == b[0] && a[size / 2] == b[size / 2] && a[size - 1] == b[size - 1]);
}

}  // namespace detail

inline void Dictionary::writeOver(std::size_t index, std::string_view key, const Value& value) {
  assert(index <= entries_.size() && "Dictionary::writeOver past the end");
  if (index == entries_.size()) {
    entries_.emplace_back(std::string(key), value);
    return;
  }
  Entry& entry = entries_[index];
  // Rows written over rows of the same shape mostly find their key in place already.
  if (!detail::sameKey(entry.first, key)) entry.first.assign(key);
  entry.second = value;
}

inline std::size_t Dictionary::size() const {
  return entries_.size();
}
inline bool Dictionary::empty() const {
  return entries_.empty();
}
inline Dictionary::const_iterator Dictionary::begin() const {
  return entries_.begin();
}
inline Dictionary::const_iterator Dictionary::end() const {
  return entries_.end();
}

}  // namespace platform
