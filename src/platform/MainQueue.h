#pragma once

#include <boost/asio/io_context.hpp>
#include <chrono>
#include <functional>

// The main queue: one process-wide io_context that the main thread runs. The UI, the timers and
// every delegate callback live on it, so what they share needs no lock.
namespace platform {

boost::asio::io_context& mainQueue();

// Queues `task` to run on the main queue after the tasks already queued. Any thread may post.
void postToMainQueue(std::function<void()> task);

// Runs the main queue on the calling thread until stopMainQueue() is called. An idle main queue
// waits for work rather than returning.
void runMainQueue();
void stopMainQueue();

// Runs the main queue on the calling thread until `done` answers true (checked before each task)
// or `timeout` has passed; answers whether `done` held. For tests and tools.
bool runMainQueueUntil(const std::function<bool()>& done, std::chrono::nanoseconds timeout);

// True while the calling code runs as a task of the main queue.
bool isMainQueue();

}  // namespace platform
