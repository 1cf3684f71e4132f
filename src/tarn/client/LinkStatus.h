#pragma once

#include <mutex>
#include <string>

namespace tarn::client {

// How a client's way to the service stands, for the application to show: set by a transport from
// its own threads, read from any.
class LinkStatus {
 public:
  struct State {
    bool connected = false;
    // What a person reads: "connected to ..." or why not, and what happens next.
    std::string text;
  };

  void set(bool connected, std::string text) {
    const std::lock_guard lock(mutex_);
    state_ = {connected, std::move(text)};
  }

  State get() const {
    const std::lock_guard lock(mutex_);
    return state_;
  }

 private:
  mutable std::mutex mutex_;
  State state_;
};

}  // namespace tarn::client
