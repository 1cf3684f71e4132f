#pragma once

#include <functional>
#include <memory>
#include <string>

namespace platform {

// A serial work queue: tasks run one at a time, in the order they were queued, on a thread that
// belongs to the queue. SerialQueue is a handle; copies refer to the same queue. When the last
// handle goes, the queue runs the tasks already queued and its thread ends.
class SerialQueue {
 public:
  // `label` names the queue in diagnostics and, shortened, its thread.
  explicit SerialQueue(std::string label);
  // A moved-from handle would refer to no queue, so moving copies.
  SerialQueue(const SerialQueue&) = default;
  SerialQueue& operator=(const SerialQueue&) = default;
  ~SerialQueue() = default;

  const std::string& label() const;
  // Queues `task`; any thread may call this, also a task of this queue.
  void async(std::function<void()> task) const;
  // True while the calling code runs as a task of this queue.
  bool isCurrent() const;

  friend bool operator==(const SerialQueue&, const SerialQueue&) = default;

 private:
  class Thread;
  std::shared_ptr<Thread> thread_;
};

}  // namespace platform
