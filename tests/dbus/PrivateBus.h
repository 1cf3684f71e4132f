#pragma once

#include <chrono>
#include <memory>
#include <string>
#include <string_view>

#include "ChildProcess.h"
#include "TemporaryFolder.h"

namespace bustest {

// A message bus of a test's own: a dbus-daemon that listens in a fresh temporary folder, lets
// everyone own every name and send everything, and is killed with this object.
class PrivateBus {
 public:
  // Throws std::runtime_error when the daemon does not start.
  PrivateBus();
  ~PrivateBus();
  PrivateBus(const PrivateBus&) = delete;
  PrivateBus& operator=(const PrivateBus&) = delete;

  // The D-Bus address to connect to.
  const std::string& address() const { return address_; }
  // Waits up to `timeout` until `name` has an owner (`owned`) or none (`!owned`), asking the bus
  // every few milliseconds. True when it came to pass.
  bool waitForName(std::string_view name, bool owned,
                   std::chrono::milliseconds timeout = std::chrono::seconds(10)) const;

 private:
  TemporaryFolder folder_;
  std::unique_ptr<ChildProcess> daemon_;
  std::string address_;
};

}  // namespace bustest
