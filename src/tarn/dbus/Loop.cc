#include "tarn/dbus/Loop.h"

#include <poll.h>
#include <sdbus-c++/Error.h>
#include <sys/eventfd.h>
#include <unistd.h>

#include <cerrno>
#include <system_error>

namespace tarn::dbus {

namespace {
// Bus messages dispatched between two looks at the tasks, so that a flood of incoming messages
// does not hold up a command.
constexpr int kDispatchBatch = 64;
}  // namespace

Loop::Loop(std::unique_ptr<sdbus::IConnection> connection,
           std::function<void(const std::string&)> onBusLost)
    : connection_(std::move(connection)),
      onBusLost_(std::move(onBusLost)),
      wakeFd_(::eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK)) {
  if (wakeFd_ < 0) throw std::system_error(errno, std::generic_category(), "eventfd");
  thread_ = std::thread([this] { run(); });
}

Loop::~Loop() {
  stop();
  ::close(wakeFd_);
}

bool Loop::post(std::function<void()> task) {
  {
    const std::lock_guard lock(mutex_);
    if (stopping_) return false;
    tasks_.push_back(std::move(task));
  }
  wake();
  return true;
}

void Loop::stop() {
  {
    const std::lock_guard lock(mutex_);
    stopping_ = true;
  }
  wake();
  if (thread_.joinable() && !onLoopThread()) thread_.join();
}

void Loop::wake() const {
  const eventfd_t one = 1;
  // A full counter means the loop is awake already.
  [[maybe_unused]] const int ignored = ::eventfd_write(wakeFd_, one);
}

bool Loop::runTasks() {
  std::vector<std::function<void()>> batch;
  {
    const std::lock_guard lock(mutex_);
    if (stopping_) return false;
    batch.swap(tasks_);
  }
  for (auto& task : batch)
    task();
  return true;
}

void Loop::dispatchBus() {
  try {
    for (int dispatched = 0; dispatched < kDispatchBatch; ++dispatched) {
      if (!connection_->processPendingRequest()) return;
    }
    wake();  // more may be waiting: come back after the tasks
  } catch (const sdbus::Error& error) {
    busLost_ = true;
    if (onBusLost_) onBusLost_(error.getMessage());
  }
}

void Loop::run() {
  while (runTasks()) {
    pollfd fds[2] = {{.fd = wakeFd_, .events = POLLIN, .revents = 0},
                     {.fd = -1, .events = 0, .revents = 0}};
    int timeout = -1;
    if (!busLost_) {
      dispatchBus();
      if (!busLost_) {
        const sdbus::IConnection::PollData poll = connection_->getEventLoopPollData();
        fds[1] = {.fd = poll.fd, .events = poll.events, .revents = 0};
        timeout = poll.getPollTimeout();
      }
    }
    if (::poll(fds, 2, timeout) > 0 && (fds[0].revents & POLLIN) != 0) {
      eventfd_t count = 0;
      ::eventfd_read(wakeFd_, &count);
    }
  }
}

}  // namespace tarn::dbus
