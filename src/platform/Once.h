#pragma once

#include <mutex>
#include <utility>

namespace platform {

// Runs a piece of work once per guard, however many threads ask at the same time; latecomers
// wait until it has finished. Declared static, it guards process-wide set-up.
class Once {
 public:
  template <class Work>
  void operator()(Work&& work) {
    std::call_once(flag_, std::forward<Work>(work));
  }

 private:
  std::once_flag flag_;
};

}  // namespace platform
