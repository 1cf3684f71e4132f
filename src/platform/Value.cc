#include "platform/Value.h"

#include <algorithm>
#include <cassert>
#include <cmath>
#include <cstdint>
#include <cstring>
#include <limits>
#include <type_traits>

namespace platform {

static_assert(std::is_nothrow_move_constructible_v<Value>);
static_assert(std::is_nothrow_move_assignable_v<Value>);
static_assert(std::is_nothrow_move_constructible_v<Dictionary>);

namespace {

// Whether a floating value lies within the range of the integer type I. Both bounds are
// powers of two (or zero), so they are exact in F: the lowest, and 2^digits, one above the highest.
template <std::integral I, std::floating_point F>
bool withinRangeOf(F value) {
  const F lowest = static_cast<F>(std::numeric_limits<I>::min());
  const F aboveHighest = std::ldexp(F{1}, std::numeric_limits<I>::digits);
  return value >= lowest && value < aboveHighest;
}

template <class Target, class Source>
std::optional<Target> convertExactly(Source value) {
  if constexpr (std::is_same_v<Source, bool>) {
    return convertExactly<Target>(value ? 1 : 0);
  } else if constexpr (std::is_integral_v<Target> && std::is_integral_v<Source>) {
    if (!std::in_range<Target>(value)) return std::nullopt;
    return static_cast<Target>(value);
  } else if constexpr (std::is_integral_v<Target>) {
    if (!withinRangeOf<Target>(value) || std::trunc(value) != value) return std::nullopt;
    return static_cast<Target>(value);
  } else if constexpr (std::is_integral_v<Source>) {
    const Target converted = static_cast<Target>(value);
    if (!withinRangeOf<Source>(converted) || static_cast<Source>(converted) != value) {
      return std::nullopt;
    }
    return converted;
  } else if constexpr (sizeof(Target) >= sizeof(Source)) {
    return static_cast<Target>(value);
  } else {
    if (std::isnan(value)) return std::numeric_limits<Target>::quiet_NaN();
    if (std::isfinite(value) && std::fabs(value) > std::numeric_limits<Target>::max()) {
      return std::nullopt;
    }
    const Target converted = static_cast<Target>(value);
    if (static_cast<Source>(converted) != value) return std::nullopt;
    return converted;
  }
}

}  // namespace

Value::Value(const char* text) {
  if (text != nullptr) storage_ = std::string(text);
}

template <class Target>
std::optional<Target> Value::exactly() const {
  return std::visit(
      [](const auto& stored) -> std::optional<Target> {
        using Stored = std::decay_t<decltype(stored)>;
        if constexpr (std::is_arithmetic_v<Stored>) {
          return convertExactly<Target>(stored);
        } else {
          return std::nullopt;
        }
      },
      storage_);
}

std::optional<std::int64_t> Value::asInteger() const {
  return exactly<std::int64_t>();
}
std::optional<std::int32_t> Value::asInt32() const {
  return exactly<std::int32_t>();
}
std::optional<float> Value::asFloat() const {
  return exactly<float>();
}
std::optional<double> Value::asDouble() const {
  return exactly<double>();
}

bool Value::operator==(const Value& other) const {
  return storage_ == other.storage_;
}

Dictionary::Dictionary(std::initializer_list<Entry> entries) {
  entries_.reserve(entries.size());
  for (const Entry& entry : entries)
    set(entry.first, entry.second);
}

const Value* Dictionary::find(std::string_view key) const {
  for (const Entry& entry : entries_) {
    if (detail::sameKey(entry.first, key)) return &entry.second;
  }
  return nullptr;
}

Value* Dictionary::find(std::string_view key) {
  return const_cast<Value*>(std::as_const(*this).find(key));
}

void Dictionary::set(std::string key, Value value) {
  if (Value* existing = find(key)) {
    *existing = std::move(value);
  } else {
    entries_.emplace_back(std::move(key), std::move(value));
  }
}

void Dictionary::append(std::string key, Value value) {
  assert(!contains(key) && "Dictionary::append with a key that is already present");
  entries_.emplace_back(std::move(key), std::move(value));
}

bool Dictionary::erase(std::string_view key) {
  const auto found = std::find_if(entries_.begin(), entries_.end(), [key](const Entry& entry) {
    return detail::sameKey(entry.first, key);
  });
  if (found == entries_.end()) return false;
  entries_.erase(found);
  return true;
}

void Dictionary::truncate(std::size_t size) {
  if (size < entries_.size())
    entries_.erase(entries_.begin() + static_cast<std::ptrdiff_t>(size), entries_.end());
}

void Dictionary::reserve(std::size_t capacity) {
  entries_.reserve(capacity);
}

bool Dictionary::operator==(const Dictionary& other) const {
  if (size() != other.size()) return false;
  return std::all_of(entries_.begin(), entries_.end(), [&other](const Entry& entry) {
    const Value* counterpart = other.find(entry.first);
    return counterpart != nullptr && *counterpart == entry.second;
  });
}

}  // namespace platform
