#pragma once

#include <sdbus-c++/IConnection.h>

#include <functional>
#include <future>
#include <memory>
#include <mutex>
#include <string>
#include <thread>
#include <type_traits>
#include <vector>

namespace tarn::dbus {

// A thread that owns one bus connection and does all of its work: it dispatches what arrives on
// the bus and runs the tasks handed to it. An sd-bus connection is not made for several threads,
// so objects, proxies and matches on the connection are used on this thread only.
class Loop {
 public:
  // `onBusLost` runs on the loop thread, once, if the connection to the bus breaks; the loop then
  // runs tasks only.
  Loop(std::unique_ptr<sdbus::IConnection> connection,
       std::function<void(const std::string& reason)> onBusLost = {});
  // Stops the thread, then closes the connection.
  ~Loop();
  Loop(const Loop&) = delete;
  Loop& operator=(const Loop&) = delete;

  // Loop thread only.
  sdbus::IConnection& connection() { return *connection_; }
  bool onLoopThread() const { return std::this_thread::get_id() == thread_.get_id(); }

  // Runs `task` on the loop thread, later. False once the loop has stopped.
  bool post(std::function<void()> task);

  // Runs `task` on the loop thread and answers its result, or throws what it threw; runs it at
  // once when called on the loop thread. Throws LoopStopped once the loop has stopped.
  template <class Task>
  std::invoke_result_t<Task> call(Task&& task);

  // Ends the thread after the task that runs now. Whatever the tasks and handlers kept on the
  // connection may then be released from any thread.
  void stop();

 private:
  void run();
  bool runTasks();
  void dispatchBus();
  void wake() const;

  std::unique_ptr<sdbus::IConnection> connection_;
  const std::function<void(const std::string&)> onBusLost_;
  const int wakeFd_;
  bool busLost_ = false;

  std::mutex mutex_;
  std::vector<std::function<void()>> tasks_;
  bool stopping_ = false;
  std::thread thread_;
};

class LoopStopped : public std::runtime_error {
 public:
  LoopStopped() : std::runtime_error("the D-Bus loop has stopped") {}
};

template <class Task>
std::invoke_result_t<Task> Loop::call(Task&& task) {
  if (onLoopThread()) return task();
  std::packaged_task<std::invoke_result_t<Task>()> packaged(std::forward<Task>(task));
  auto result = packaged.get_future();
  auto shared = std::make_shared<decltype(packaged)>(std::move(packaged));
  if (!post([shared] { (*shared)(); })) throw LoopStopped();
  return result.get();
}

}  // namespace tarn::dbus
