#include "PrivateBus.h"

#include <fcntl.h>
#include <poll.h>
#include <sdbus-c++/sdbus-c++.h>
#include <unistd.h>

#include <csignal>
#include <fstream>
#include <stdexcept>
#include <thread>

namespace bustest {

namespace {

using namespace std::chrono_literals;

constexpr auto kStartTimeout = 10s;

void writeConfiguration(const std::filesystem::path& path, const std::filesystem::path& socket) {
  std::ofstream file(path);
  file << R"(<!DOCTYPE busconfig PUBLIC "-//freedesktop//DTD D-Bus Bus Configuration 1.0//EN"
 "http://www.freedesktop.org/standards/dbus/1.0/busconfig.dtd">
<busconfig>
  <type>session</type>
  <listen>unix:path=)"
       << socket.string() << R"(</listen>
  <auth>EXTERNAL</auth>
  <policy context="default">
    <allow send_destination="*" eavesdrop="true"/>
    <allow eavesdrop="true"/>
    <allow own="*"/>
  </policy>
</busconfig>
)";
  if (!file.flush()) throw std::runtime_error("cannot write " + path.string());
}

// The pipe on which the daemon prints its address.
class AddressPipe {
 public:
  AddressPipe() {
    if (::pipe2(fds_, O_CLOEXEC) != 0) throw std::runtime_error("cannot make a pipe");
  }
  ~AddressPipe() {
    ::close(fds_[0]);
    closeWriteEnd();
  }
  AddressPipe(const AddressPipe&) = delete;
  AddressPipe& operator=(const AddressPipe&) = delete;

  int writeEnd() const { return fds_[1]; }
  void closeWriteEnd() {
    if (fds_[1] >= 0) ::close(fds_[1]);
    fds_[1] = -1;
  }

  // The first line, without its newline; empty when none comes in time.
  std::string readLine(std::chrono::milliseconds timeout) const {
    const auto deadline = std::chrono::steady_clock::now() + timeout;
    std::string line;
    while (line.find('\n') == std::string::npos) {
      const auto left = std::chrono::duration_cast<std::chrono::milliseconds>(
          deadline - std::chrono::steady_clock::now());
      pollfd readable{.fd = fds_[0], .events = POLLIN, .revents = 0};
      if (left.count() <= 0 || ::poll(&readable, 1, static_cast<int>(left.count())) <= 0) {
        return {};
      }
      char buffer[256];
      const ssize_t got = ::read(fds_[0], buffer, sizeof buffer);
      if (got <= 0) return {};
      line.append(buffer, static_cast<std::size_t>(got));
    }
    return line.substr(0, line.find('\n'));
  }

 private:
  int fds_[2] = {-1, -1};
};

}  // namespace

PrivateBus::PrivateBus(const std::optional<std::filesystem::path>& socket) {
  const std::filesystem::path configuration = folder_ / "bus.conf";
  writeConfiguration(configuration, socket.value_or(folder_ / "bus"));
  AddressPipe pipe;
  daemon_ = std::make_unique<ChildProcess>(ChildProcess::Options{
      .arguments = {"dbus-daemon", "--config-file=" + configuration.string(), "--nofork",
                    "--print-address=3"},
      .standardOutput = folder_ / "dbus-daemon.out",
      .standardError = folder_ / "dbus-daemon.err",
      .descriptor3 = pipe.writeEnd(),
  });
  // Our copy of the write end would keep the pipe open should the daemon die.
  pipe.closeWriteEnd();
  address_ = pipe.readLine(kStartTimeout);
  if (address_.empty()) {
    throw std::runtime_error("dbus-daemon did not start: " + daemon_->standardError());
  }
}

PrivateBus::~PrivateBus() {
  daemon_->stop(SIGTERM, kStartTimeout);
}

bool PrivateBus::waitForName(std::string_view name, bool owned,
                             std::chrono::milliseconds timeout) const {
  const auto connection = sdbus::createSessionBusConnectionWithAddress(address_);
  const auto bus = sdbus::createProxy(*connection, "org.freedesktop.DBus", "/org/freedesktop/DBus");
  const auto deadline = std::chrono::steady_clock::now() + timeout;
  while (true) {
    bool hasOwner = false;
    bus->callMethod("NameHasOwner")
        .onInterface("org.freedesktop.DBus")
        .withArguments(std::string(name))
        .storeResultsTo(hasOwner);
    if (hasOwner == owned) return true;
    if (std::chrono::steady_clock::now() >= deadline) return false;
    std::this_thread::sleep_for(20ms);
  }
}

}  // namespace bustest
