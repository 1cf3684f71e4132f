#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <deque>
#include <optional>
#include <unordered_map>
#include <utility>
#include <vector>

namespace tarn::flow {

// A bounded queue of items of several kinds, such as metrics by metric ID. When full, it drops
// the oldest item of the kind with the most items waiting: a receiver that keeps only the latest
// of each kind loses nothing it would show, and a rare kind is never crowded out by a frequent
// one. Not thread-safe.
template <class Item>
class KindQueue {
 public:
  using Kind = std::uint64_t;

  // `capacity` is at least 1.
  explicit KindQueue(std::size_t capacity) : capacity_(std::max<std::size_t>(capacity, 1)) {}

  // Queues `item`; answers the kind of the item dropped to make room for it, if one was.
  std::optional<Kind> push(Kind kind, Item item) {
    std::optional<Kind> dropped;
    if (size_ == capacity_) {
      auto fullest = byKind_.begin();
      for (auto candidate = byKind_.begin(); candidate != byKind_.end(); ++candidate) {
        if (candidate->second.size() > fullest->second.size()) fullest = candidate;
      }
      dropped = fullest->first;
      fullest->second.pop_front();
      if (fullest->second.empty()) byKind_.erase(fullest);
      --size_;
    }
    byKind_[kind].push_back({next_++, std::move(item)});
    ++size_;
    return dropped;
  }

  // Everything waiting, oldest first; the queue is then empty.
  std::vector<Item> takeAll() {
    std::vector<Waiting> waiting;
    waiting.reserve(size_);
    for (auto& [kind, items] : byKind_) {
      std::move(items.begin(), items.end(), std::back_inserter(waiting));
    }
    byKind_.clear();
    size_ = 0;
    std::sort(waiting.begin(), waiting.end(),
              [](const Waiting& a, const Waiting& b) { return a.order < b.order; });
    std::vector<Item> items;
    items.reserve(waiting.size());
    for (Waiting& each : waiting)
      items.push_back(std::move(each.item));
    return items;
  }

  std::size_t size() const { return size_; }
  std::size_t capacity() const { return capacity_; }

 private:
  struct Waiting {
    std::uint64_t order;
    Item item;
  };

  const std::size_t capacity_;
  std::unordered_map<Kind, std::deque<Waiting>> byKind_;
  std::size_t size_ = 0;
  std::uint64_t next_ = 0;
};

}  // namespace tarn::flow
