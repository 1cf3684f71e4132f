#pragma once

#include <cstddef>
#include <cstdint>
#include <stdexcept>
#include <type_traits>
#include <vector>

#include "platform/Format.h"
#include "platform/Value.h"

namespace codec {

// A growable run of 32-bit values: the storage of a packed repeated field.
template <class T>
class PackedRun {
  static_assert(std::is_same_v<T, std::uint32_t> || std::is_same_v<T, std::int32_t>);

 public:
  const T* values() const { return values_.data(); }
  std::size_t count() const { return values_.size(); }
  std::size_t capacity() const { return values_.capacity(); }

  void add(T value) { values_.push_back(value); }
  void clear() { values_.clear(); }
  void set(const T* values, std::size_t count) {
    values_.assign(values, values + (values == nullptr ? 0 : count));
  }

  // Throws std::out_of_range when `index` is not below the count.
  T at(std::size_t index) const {
    if (index >= values_.size()) {
      throw std::out_of_range(
          platform::format("idx (%tu) is out of range (%tu)", index, values_.size()));
    }
    return values_[index];
  }

  bool operator==(const PackedRun& other) const = default;

  std::uint64_t hash() const {
    std::uint64_t hash = values_.size();
    for (const T value : values_)
      hash = hash * 1099511628211u ^ static_cast<std::uint32_t>(value);
    return hash;
  }

  platform::List toList() const {
    platform::List list;
    list.reserve(values_.size());
    for (const T value : values_)
      list.emplace_back(value);
    return list;
  }

  auto begin() const { return values_.begin(); }
  auto end() const { return values_.end(); }

 private:
  std::vector<T> values_;
};

}  // namespace codec
