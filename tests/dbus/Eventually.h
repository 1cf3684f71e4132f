#pragma once

#include <chrono>
#include <thread>

namespace bustest {

// Asks `condition` every few milliseconds until it holds or `timeout` has passed; answers
// whether it held.
template <class Condition>
bool eventually(Condition condition, std::chrono::milliseconds timeout = std::chrono::seconds(10)) {
  const auto deadline = std::chrono::steady_clock::now() + timeout;
  while (!condition()) {
    if (std::chrono::steady_clock::now() >= deadline) return false;
    std::this_thread::sleep_for(std::chrono::milliseconds(10));
  }
  return true;
}

}  // namespace bustest
