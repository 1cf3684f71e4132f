#pragma once

#include <cstdint>
#include <filesystem>
#include <memory>
#include <optional>
#include <string>

#include "ChildProcess.h"
#include "tarn/mqtt/BrokerAddress.h"

namespace mqtttest {

// The files of a TLS test: a certificate authority made for the test and a certificate for
// 127.0.0.1 that it signed, written with the openssl program into `folder`.
struct TestCertificates {
  std::filesystem::path authority;
  std::filesystem::path certificate;
  std::filesystem::path key;
};
// Throws std::runtime_error when openssl fails.
TestCertificates makeTestCertificates(const std::filesystem::path& folder);

// A Mosquitto broker of a test's own, on a free loopback port, with its own configuration file
// in `folder`; never the system's. Killed with this object.
class Broker {
 public:
  struct Options {
    // user:password pairs; anonymous clients are refused when there are any.
    std::optional<std::pair<std::string, std::string>> account;
    std::optional<TestCertificates> tls;
    // Keeps sessions and queued messages across a restart, in a file in the folder.
    bool persistent = false;
  };

  // Throws std::runtime_error when the broker does not start.
  Broker(std::filesystem::path folder, Options options);
  ~Broker();
  Broker(const Broker&) = delete;
  Broker& operator=(const Broker&) = delete;

  std::uint16_t port() const { return port_; }
  // mqtt://127.0.0.1:PORT/PATH (mqtts:// with TLS), with `credentials@` when given.
  std::string address(const std::string& path, const std::string& credentials = {}) const;
  // The same address as a link takes it.
  tarn::mqtt::BrokerAddress linkAddress(const std::string& path,
                                        const std::string& credentials = {}) const {
    return *tarn::mqtt::parseBrokerAddress(address(path, credentials)).address;
  }

  // What the broker has logged since it last started.
  std::string log() const { return process_->standardError(); }
  // Stops the broker with `signal` (SIGTERM lets it save its sessions) and waits for it.
  void stop(int signal);
  // Starts it again on the same port; throws as the constructor does.
  void start();

 private:
  const std::filesystem::path folder_;
  const Options options_;
  std::uint16_t port_ = 0;
  int generation_ = 0;
  std::unique_ptr<bustest::ChildProcess> process_;
};

}  // namespace mqtttest
