#include "platform/MainQueue.h"

#include <boost/asio/executor_work_guard.hpp>
#include <boost/asio/post.hpp>

namespace platform {

namespace {

struct Main {
  boost::asio::io_context context;
  // Keeps run() waiting when the queue is empty, as a UI run loop does.
  boost::asio::executor_work_guard<boost::asio::io_context::executor_type> alive =
      boost::asio::make_work_guard(context);
};

Main& main() {
  // Never destroyed: other threads may still post while static objects are torn down at exit.
  static Main* const instance = new Main;
  return *instance;
}

void restartIfStopped(boost::asio::io_context& context) {
  if (context.stopped()) context.restart();
}

}  // namespace

boost::asio::io_context& mainQueue() {
  return main().context;
}

void postToMainQueue(std::function<void()> task) {
  boost::asio::post(main().context, std::move(task));
}

void runMainQueue() {
  boost::asio::io_context& context = main().context;
  restartIfStopped(context);
  context.run();
}

void stopMainQueue() {
  main().context.stop();
}

bool runMainQueueUntil(const std::function<bool()>& done, std::chrono::nanoseconds timeout) {
  boost::asio::io_context& context = main().context;
  restartIfStopped(context);
  const auto deadline = std::chrono::steady_clock::now() + timeout;
  while (!done()) {
    if (context.stopped() || std::chrono::steady_clock::now() >= deadline) return false;
    context.run_one_until(deadline);
  }
  return true;
}

bool isMainQueue() {
  return main().context.get_executor().running_in_this_thread();
}

}  // namespace platform
