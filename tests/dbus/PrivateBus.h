#pragma once

#include <chrono>
#include <filesystem>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include "ChildProcess.h"
#include "TemporaryFolder.h"

namespace bustest {

// A message bus of a test's own: a dbus-daemon that listens in a fresh temporary folder, lets
// everyone own every name and send everything, and is killed with this object.
class PrivateBus {
 public:
  // Listens on `socket`, or on a socket in its own folder. Throws std::runtime_error when the
  // daemon does not start.
  explicit PrivateBus(const std::optional<std::filesystem::path>& socket = std::nullopt);
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
