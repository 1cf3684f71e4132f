#pragma once

#include <cstddef>
#include <cstdint>
#include <iterator>
#include <memory>
#include <optional>

// The samples of one series: the latest `capacity` of them, oldest first. The memory is taken
// once, when the ring is made; appending never allocates and overwrites the oldest sample when
// the ring is full. Times never go back: a sample older than the latest takes the latest's
// time, so that the samples stay sorted and a range is found by bisection.
namespace series {

struct Sample {
  std::int64_t timeMs;  // milliseconds since 1970
  double value;         // in the series' unit

  bool operator==(const Sample&) const = default;
};

class SampleRing;

// Samples of a ring, oldest first; valid until the next append.
class SampleRange {
 public:
  class iterator {
   public:
    using iterator_category = std::forward_iterator_tag;
    using value_type = Sample;
    using difference_type = std::ptrdiff_t;

    iterator() = default;
    iterator(const SampleRing* ring, std::uint64_t at) : ring_(ring), at_(at) {}
    Sample operator*() const;
    iterator& operator++() {
      ++at_;
      return *this;
    }
    iterator operator++(int) {
      iterator old = *this;
      ++at_;
      return old;
    }
    bool operator==(const iterator&) const = default;

   private:
    const SampleRing* ring_ = nullptr;
    std::uint64_t at_ = 0;
  };

  SampleRange() = default;
  SampleRange(const SampleRing* ring, std::uint64_t first, std::uint64_t last)
      : ring_(ring), first_(first), last_(last) {}

  std::size_t size() const { return static_cast<std::size_t>(last_ - first_); }
  bool empty() const { return first_ == last_; }
  iterator begin() const { return {ring_, first_}; }
  iterator end() const { return {ring_, last_}; }
  Sample operator[](std::size_t i) const { return *iterator(ring_, first_ + i); }

 private:
  const SampleRing* ring_ = nullptr;
  // Positions in the count of samples ever appended.
  std::uint64_t first_ = 0;
  std::uint64_t last_ = 0;
};

class SampleRing {
 public:
  // Holds at least `capacity` samples (at least 1): the next power of two.
  explicit SampleRing(std::size_t capacity);

  void append(std::int64_t timeMs, float value) noexcept {
    if (appended_ != 0) {
      const std::int64_t latest = times_[(appended_ - 1) & mask_];
      if (timeMs < latest) timeMs = latest;
    }
    const std::uint64_t at = appended_ & mask_;
    times_[at] = timeMs;
    values_[at] = value;
    ++appended_;
  }

  std::size_t capacity() const { return static_cast<std::size_t>(mask_ + 1); }
  std::size_t size() const { return static_cast<std::size_t>(appended_ - oldest()); }
  bool empty() const { return appended_ == 0; }

  std::optional<Sample> latest() const;
  // Every sample held.
  SampleRange all() const { return {this, oldest(), appended_}; }
  // The samples at or after `sinceMs`.
  SampleRange since(std::int64_t sinceMs) const;

 private:
  friend class SampleRange::iterator;

  std::uint64_t oldest() const { return appended_ > mask_ ? appended_ - mask_ - 1 : 0; }
  Sample at(std::uint64_t position) const {
    const std::uint64_t slot = position & mask_;
    return {times_[slot], values_[slot]};
  }

  std::uint64_t mask_;
  // Times and values apart, so that a range is read as two runs of numbers.
  std::unique_ptr<std::int64_t[]> times_;
  std::unique_ptr<float[]> values_;
  std::uint64_t appended_ = 0;
};

inline Sample SampleRange::iterator::operator*() const {
  return ring_->at(at_);
}

}  // namespace series
