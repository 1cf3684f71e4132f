#include "platform/SerialQueue.h"

#include <pthread.h>

#include <boost/asio/executor_work_guard.hpp>
#include <boost/asio/io_context.hpp>
#include <boost/asio/post.hpp>
#include <thread>

namespace platform {

namespace {

// Linux allows thread names of at most 15 characters; the end of a reverse-DNS label is the
// telling part.
std::string threadName(const std::string& label) {
  constexpr std::size_t kLongest = 15;
  return label.size() <= kLongest ? label : label.substr(label.size() - kLongest);
}

}  // namespace

class SerialQueue::Thread {
 public:
  explicit Thread(std::string label)
      : label_(std::move(label)),
        context_(std::make_shared<boost::asio::io_context>(1)),
        alive_(boost::asio::make_work_guard(*context_)),
        // The thread shares the context, so that it can finish even if it outlives this object.
        thread_([context = context_] { context->run(); }) {
    pthread_setname_np(thread_.native_handle(), threadName(label_).c_str());
  }

  ~Thread() {
    alive_.reset();
    // The last handle may go inside one of the queue's own tasks; the thread cannot wait for
    // itself, so it is left to finish on its own.
    if (thread_.get_id() == std::this_thread::get_id()) {
      thread_.detach();
    } else {
      thread_.join();
    }
  }

  Thread(const Thread&) = delete;
  Thread& operator=(const Thread&) = delete;

  const std::string& label() const { return label_; }
  void async(std::function<void()> task) { boost::asio::post(*context_, std::move(task)); }
  bool isCurrent() const { return context_->get_executor().running_in_this_thread(); }

 private:
  std::string label_;
  std::shared_ptr<boost::asio::io_context> context_;
  boost::asio::executor_work_guard<boost::asio::io_context::executor_type> alive_;
  std::thread thread_;
};

SerialQueue::SerialQueue(std::string label) : thread_(std::make_shared<Thread>(std::move(label))) {}

const std::string& SerialQueue::label() const {
  return thread_->label();
}

void SerialQueue::async(std::function<void()> task) const {
  thread_->async(std::move(task));
}

bool SerialQueue::isCurrent() const {
  return thread_->isCurrent();
}

}  // namespace platform
