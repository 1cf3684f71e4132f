#include "app/DeviceViewers.h"

#include <fcntl.h>
#include <sys/prctl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <boost/asio/io_context.hpp>
#include <boost/asio/ip/tcp.hpp>
#include <chrono>
#include <csignal>
#include <filesystem>
#include <thread>
#include <vector>

#include "ui/web/Access.h"

namespace app {

namespace {

using boost::asio::ip::tcp;

constexpr auto kStartTimeout = std::chrono::seconds(5);
constexpr auto kStartPoll = std::chrono::milliseconds(50);

std::optional<std::uint16_t> freePort(const boost::asio::ip::address& address) {
  boost::asio::io_context context;
  boost::system::error_code error;
  tcp::acceptor acceptor(context);
  acceptor.open(address.is_v6() ? tcp::v6() : tcp::v4(), error);
  if (!error) acceptor.bind({address, 0}, error);
  if (error) return std::nullopt;
  return acceptor.local_endpoint().port();
}

bool accepts(const boost::asio::ip::address& address, std::uint16_t port) {
  boost::asio::io_context context;
  tcp::socket socket(context);
  boost::system::error_code error;
  socket.connect(
      {address.is_unspecified() ? boost::asio::ip::make_address("127.0.0.1") : address, port},
      error);
  return !error;
}

bool running(pid_t pid) {
  return ::waitpid(pid, nullptr, WNOHANG) == 0;
}

// The host part of a Host header: "example.lan:8080" gives "example.lan", "[::1]:80" "[::1]".
std::string_view hostName(std::string_view host) {
  if (host.starts_with('[')) return host.substr(0, host.find(']') + 1);
  return host.substr(0, host.rfind(':'));
}

}  // namespace

DeviceViewers::DeviceViewers(tarn::mqtt::BrokerAddress broker, std::optional<std::string> caFile,
                             boost::asio::ip::address listen, std::optional<TlsFiles> tls,
                             std::optional<std::string> token)
    : broker_(std::move(broker)),
      caFile_(std::move(caFile)),
      listen_(listen),
      tls_(std::move(tls)),
      token_(std::move(token)) {}

DeviceViewers::~DeviceViewers() {
  for (const auto& [device, viewer] : viewers_)
    ::kill(viewer.pid, SIGTERM);
  for (const auto& [device, viewer] : viewers_)
    ::waitpid(viewer.pid, nullptr, 0);
}

std::optional<std::string> DeviceViewers::open(const std::string& device, std::string_view host,
                                               std::string& why) {
  const std::lock_guard lock(mutex_);
  auto found = viewers_.find(device);
  if (found != viewers_.end() && !running(found->second.pid)) {
    viewers_.erase(found);
    found = viewers_.end();
  }
  if (found == viewers_.end()) {
    const std::optional<Viewer> viewer = start(device, why);
    if (!viewer) return std::nullopt;
    found = viewers_.emplace(device, *viewer).first;
  }
  std::string address = (tls_ ? "https://" : "http://") + std::string(hostName(host)) + ":" +
                        std::to_string(found->second.port) + "/";
  if (token_) address += "?" + std::string(ui::web::Access::kQueryKey) + "=" + *token_;
  return address;
}

std::optional<DeviceViewers::Viewer> DeviceViewers::start(const std::string& device,
                                                          std::string& why) {
  const std::optional<std::uint16_t> port = freePort(listen_);
  if (!port) {
    why = "no free port to show " + device + " on";
    return std::nullopt;
  }
  tarn::mqtt::BrokerAddress service = broker_;
  service.path += "/" + device;
  const std::string listen =
      (listen_.is_v6() ? "[" + listen_.to_string() + "]" : listen_.to_string()) + ":" +
      std::to_string(*port);
  std::vector<std::string> arguments = {std::filesystem::read_symlink("/proc/self/exe").string(),
                                        "--service", service.text(), "--listen", listen};
  if (caFile_) arguments.insert(arguments.end(), {"--mqtt-ca", *caFile_});
  if (tls_)
    arguments.insert(arguments.end(), {"--tls-cert", tls_->certificate, "--tls-key", tls_->key});
  // The token reaches the viewer through a pipe on its standard input, where no other process
  // can read it, rather than in its arguments or a file.
  int tokenPipe[2] = {-1, -1};
  if (token_) {
    if (::pipe2(tokenPipe, O_CLOEXEC) != 0) {
      why = "cannot start a viewer for " + device;
      return std::nullopt;
    }
    const std::string line = *token_ + "\n";
    // The token is far shorter than a pipe holds, so the write neither blocks nor comes short.
    const bool written =
        ::write(tokenPipe[1], line.data(), line.size()) == static_cast<ssize_t>(line.size());
    ::close(tokenPipe[1]);
    if (!written) {
      ::close(tokenPipe[0]);
      why = "cannot start a viewer for " + device;
      return std::nullopt;
    }
    arguments.insert(arguments.end(), {"--token-file", "/dev/stdin"});
  }
  std::vector<char*> argv;
  for (std::string& argument : arguments)
    argv.push_back(argument.data());
  argv.push_back(nullptr);

  const pid_t pid = ::fork();
  if (pid == 0) {
    // Only calls that are safe between fork and exec in a program with threads.
    ::prctl(PR_SET_PDEATHSIG, SIGTERM);
    const int null = ::open("/dev/null", O_RDWR);
    ::dup2(tokenPipe[0] >= 0 ? tokenPipe[0] : null, STDIN_FILENO);
    ::dup2(null, STDOUT_FILENO);
    ::dup2(null, STDERR_FILENO);
    // Nothing of ours, such as the fleet's listening socket, stays open in the viewer.
    ::close_range(STDERR_FILENO + 1, ~0U, 0);
    ::execv(argv[0], argv.data());
    ::_exit(127);
  }
  if (tokenPipe[0] >= 0) ::close(tokenPipe[0]);
  if (pid < 0) {
    why = "cannot start a viewer for " + device;
    return std::nullopt;
  }
  const auto deadline = std::chrono::steady_clock::now() + kStartTimeout;
  while (!accepts(listen_, *port)) {
    if (!running(pid) || std::chrono::steady_clock::now() >= deadline) {
      ::kill(pid, SIGKILL);
      ::waitpid(pid, nullptr, 0);
      why = "the viewer of " + device + " did not start";
      return std::nullopt;
    }
    std::this_thread::sleep_for(kStartPoll);
  }
  return Viewer{pid, *port};
}

}  // namespace app
