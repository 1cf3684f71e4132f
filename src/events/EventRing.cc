#include "events/EventRing.h"

#include <algorithm>
#include <stdexcept>

#include "platform/Utf8.h"

namespace events {

namespace {

// The length of the longest prefix of `text` of at most `limit` bytes that ends between two
// characters.
std::size_t prefixLength(std::string_view text, std::size_t limit) {
  std::size_t length = 0;
  while (length < text.size()) {
    const std::size_t next = length + platform::nextUtf8Sequence(text.substr(length)).length;
    if (next > limit) break;
    length = next;
  }
  return length;
}

template <class T>
bool anyOrContains(const std::vector<T>& wanted, const T& value) {
  return wanted.empty() || std::find(wanted.begin(), wanted.end(), value) != wanted.end();
}

}  // namespace

bool EventFilter::matches(const Event& event) const {
  return (!sinceMs || event.timeMs >= *sinceMs) && (!afterId || event.id > *afterId) &&
         anyOrContains(kinds, event.kind) && anyOrContains(severities, event.severity);
}

EventRing::EventRing(std::size_t capacity) : slots_(capacity) {
  if (capacity == 0) throw std::invalid_argument("an event ring holds at least one event");
}

std::uint64_t EventRing::add(Event event) {
  if (event.text.size() > kMaxTextBytes) {
    event.text.resize(prefixLength(event.text, kMaxTextBytes));
  }
  event.id = nextId_++;
  newest_ = size_ == 0 ? 0 : (newest_ + 1) % slots_.size();
  slots_[newest_] = std::move(event);
  size_ = std::min(size_ + 1, slots_.size());
  return slots_[newest_].id;
}

void EventRing::clear() {
  for (Event& slot : slots_)
    slot = Event{};
  size_ = 0;
  ++epoch_;
}

const Event& EventRing::at(std::size_t age) const {
  return slots_[(newest_ + slots_.size() - age) % slots_.size()];
}

std::vector<const Event*> EventRing::newestFirst(const EventFilter& filter,
                                                 std::size_t limit) const {
  std::vector<const Event*> found;
  for (std::size_t age = 0; age < size_ && found.size() < limit; ++age) {
    const Event& event = at(age);
    if (filter.afterId && event.id <= *filter.afterId) break;
    if (filter.matches(event)) found.push_back(&event);
  }
  return found;
}

std::vector<const Event*> EventRing::addedAfter(std::uint64_t id) const {
  std::vector<const Event*> found;
  for (std::size_t age = size_; age-- > 0;) {
    if (at(age).id > id) found.push_back(&at(age));
  }
  return found;
}

void EventRing::forEach(const std::function<void(const Event&)>& visit) const {
  for (std::size_t age = size_; age-- > 0;)
    visit(at(age));
}

const Event* EventRing::find(std::uint64_t id) const {
  if (size_ == 0 || id > at(0).id || id < at(size_ - 1).id) return nullptr;
  // Ids of the events held are consecutive.
  return &at(static_cast<std::size_t>(at(0).id - id));
}

}  // namespace events
