#include "Broker.h"

#include <arpa/inet.h>
#include <netinet/in.h>
#include <pwd.h>
#include <sys/socket.h>
#include <unistd.h>

#include <chrono>
#include <csignal>
#include <cstdlib>
#include <fstream>
#include <stdexcept>
#include <thread>

#include "Eventually.h"
#include "LoopbackHttp.h"

namespace mqtttest {

namespace {

using namespace std::chrono_literals;

sockaddr_in loopback(std::uint16_t port) {
  sockaddr_in address{};
  address.sin_family = AF_INET;
  address.sin_port = htons(port);
  address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
  return address;
}

bool accepts(std::uint16_t port) {
  const int socket = ::socket(AF_INET, SOCK_STREAM, 0);
  const sockaddr_in address = loopback(port);
  const bool connected =
      ::connect(socket, reinterpret_cast<const sockaddr*>(&address), sizeof address) == 0;
  ::close(socket);
  return connected;
}

void run(const std::string& command) {
  if (std::system(command.c_str()) != 0) throw std::runtime_error("failed: " + command);
}

}  // namespace

TestCertificates makeTestCertificates(const std::filesystem::path& folder) {
  TestCertificates files{folder / "ca.pem", folder / "broker.pem", folder / "broker.key"};
  const std::string caKey = (folder / "ca.key").string();
  const std::string request = (folder / "broker.csr").string();
  const std::string extensions = (folder / "broker.ext").string();
  std::ofstream(extensions) << "subjectAltName=IP:127.0.0.1\n";
  const std::string quiet = " 2>/dev/null";
  run("openssl req -x509 -newkey ec -pkeyopt ec_paramgen_curve:prime256v1 -nodes -days 2 -subj "
      "/CN=norvo-test-ca -keyout " +
      caKey + " -out " + files.authority.string() + quiet);
  run("openssl req -newkey ec -pkeyopt ec_paramgen_curve:prime256v1 -nodes -subj /CN=127.0.0.1 "
      "-keyout " +
      files.key.string() + " -out " + request + quiet);
  run("openssl x509 -req -in " + request + " -CA " + files.authority.string() + " -CAkey " + caKey +
      " -CAcreateserial -days 2 -extfile " + extensions + " -out " + files.certificate.string() +
      quiet);
  return files;
}

Broker::Broker(std::filesystem::path folder, Options options)
    : folder_(std::move(folder)),
      options_(std::move(options)),
      port_(static_cast<std::uint16_t>(bustest::freePort())) {
  std::ofstream configuration(folder_ / "mosquitto.conf");
  configuration << "listener " << port_ << " 127.0.0.1\n"
                << "persistence " << (options_.persistent ? "true" : "false") << "\n"
                << "persistence_location " << folder_.string() << "/\n"
                << "max_queued_messages 0\n"
                << "log_dest stderr\n"
                // Run as root, it would read its files as another user.
                << "user " << ::getpwuid(::getuid())->pw_name << "\n";
  if (options_.account) {
    const std::string passwords = (folder_ / "passwords").string();
    std::ofstream(passwords).close();
    run("mosquitto_passwd -b " + passwords + " " + options_.account->first + " " +
        options_.account->second);
    configuration << "allow_anonymous false\npassword_file " << passwords << "\n";
  } else {
    configuration << "allow_anonymous true\n";
  }
  if (options_.tls) {
    configuration << "cafile " << options_.tls->authority.string() << "\n"
                  << "certfile " << options_.tls->certificate.string() << "\n"
                  << "keyfile " << options_.tls->key.string() << "\n";
  }
  configuration.close();
  start();
}

Broker::~Broker() = default;

std::string Broker::address(const std::string& path, const std::string& credentials) const {
  return std::string(options_.tls ? "mqtts://" : "mqtt://") +
         (credentials.empty() ? "" : credentials + "@") + "127.0.0.1:" + std::to_string(port_) +
         "/" + path;
}

void Broker::stop(int signal) {
  if (process_) process_->stop(signal, 5s);
  process_.reset();
}

void Broker::start() {
  const std::string stem = (folder_ / ("broker" + std::to_string(++generation_))).string();
  process_ = std::make_unique<bustest::ChildProcess>(bustest::ChildProcess::Options{
      .arguments = {"mosquitto", "-c", (folder_ / "mosquitto.conf").string()},
      .standardOutput = stem + ".out",
      .standardError = stem + ".err"});
  if (!bustest::eventually([this] { return accepts(port_); }, 5s)) {
    throw std::runtime_error("mosquitto did not start: " + process_->standardError());
  }
}

}  // namespace mqtttest
