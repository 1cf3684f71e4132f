#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <optional>
#include <string_view>
#include <vector>

#include "events/Event.h"

namespace events {

// Which events a reader wants. Empty members match everything.
struct EventFilter {
  std::optional<std::int64_t> sinceMs;   // events at or after this time
  std::vector<std::string_view> kinds;   // any of these kinds
  std::vector<Severity> severities;      // any of these severities
  std::optional<std::uint64_t> afterId;  // events added after this one

  bool matches(const Event& event) const;
};

// The latest events, oldest dropped first once `capacity` are held. Its slots are made once, so
// its memory is bounded by the capacity and the length of each event's text and metric.
class EventRing {
 public:
  static constexpr std::size_t kDefaultCapacity = 100'000;
  // Longer texts are cut to this many bytes, at a character boundary.
  static constexpr std::size_t kMaxTextBytes = 200;

  explicit EventRing(std::size_t capacity = kDefaultCapacity);

  // Gives the event the next id and keeps it; answers the id.
  std::uint64_t add(Event event);

  // Forgets every event; ids carry on counting, so a reader never mistakes a new event for one
  // it has seen.
  void clear();

  std::size_t size() const { return size_; }
  std::size_t capacity() const { return slots_.size(); }
  // The id the next event will get.
  std::uint64_t nextId() const { return nextId_; }
  // How many times the ring was cleared: a reader that saw another epoch starts over.
  std::uint64_t epoch() const { return epoch_; }

  // Newest first, at most `limit` of those that match.
  std::vector<const Event*> newestFirst(const EventFilter& filter, std::size_t limit) const;
  // The events held that were added after the one with id `id`, oldest first.
  std::vector<const Event*> addedAfter(std::uint64_t id) const;
  // Every event held, oldest first.
  void forEach(const std::function<void(const Event&)>& visit) const;
  const Event* find(std::uint64_t id) const;

 private:
  const Event& at(std::size_t age) const;  // 0 is the newest

  std::vector<Event> slots_;
  std::size_t newest_ = 0;
  std::size_t size_ = 0;
  std::uint64_t nextId_ = 1;
  std::uint64_t epoch_ = 0;
};

}  // namespace events
