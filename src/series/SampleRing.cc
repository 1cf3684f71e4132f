#include "series/SampleRing.h"

#include <algorithm>
#include <bit>

namespace series {

SampleRing::SampleRing(std::size_t capacity)
    : mask_(std::bit_ceil(std::max<std::uint64_t>(capacity, 1)) - 1),
      times_(std::make_unique_for_overwrite<std::int64_t[]>(mask_ + 1)),
      values_(std::make_unique_for_overwrite<float[]>(mask_ + 1)) {}

std::optional<Sample> SampleRing::latest() const {
  if (appended_ == 0) return std::nullopt;
  return at(appended_ - 1);
}

SampleRange SampleRing::since(std::int64_t sinceMs) const {
  // The first position whose time is at or after sinceMs; times are sorted.
  std::uint64_t low = oldest();
  std::uint64_t high = appended_;
  while (low < high) {
    const std::uint64_t middle = low + (high - low) / 2;
    if (times_[middle & mask_] < sinceMs) {
      low = middle + 1;
    } else {
      high = middle;
    }
  }
  return {this, low, appended_};
}

}  // namespace series
