#pragma once

#include <sys/types.h>

#include <boost/asio/ip/address.hpp>
#include <cstdint>
#include <map>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>

#include "tarn/mqtt/BrokerAddress.h"

namespace app {

// Where the certificate and key of HTTPS are, as --tls-cert and --tls-key give them.
struct TlsFiles {
  std::string certificate;
  std::string key;
};

// The screens of the devices of a fleet, each shown by a viewer of its own: this program run as
// `norvo --service mqtt://HOST/PREFIX/DEVICE --listen ADDRESS:PORT`, started when a device is
// first opened and kept while it runs. The viewers end with this object, or with the process.
class DeviceViewers {
 public:
  // `broker`'s path is the prefix; viewers listen on `listen`, on ports the system picks, serve
  // HTTPS with `tls` when set, and ask for `token` when set (the fleet's own, so that the
  // browser's cookie opens them too).
  DeviceViewers(tarn::mqtt::BrokerAddress broker, std::optional<std::string> caFile,
                boost::asio::ip::address listen, std::optional<TlsFiles> tls = std::nullopt,
                std::optional<std::string> token = std::nullopt);
  ~DeviceViewers();
  DeviceViewers(const DeviceViewers&) = delete;
  DeviceViewers& operator=(const DeviceViewers&) = delete;

  // The address of the device's screens for a browser that reached the fleet as `host`,
  // starting its viewer if need be and waiting up to 5 s for it; empty, with the reason in
  // `why`, when it does not start.
  std::optional<std::string> open(const std::string& device, std::string_view host,
                                  std::string& why);

 private:
  struct Viewer {
    pid_t pid;
    std::uint16_t port;
  };

  std::optional<Viewer> start(const std::string& device, std::string& why);

  const tarn::mqtt::BrokerAddress broker_;
  const std::optional<std::string> caFile_;
  const boost::asio::ip::address listen_;
  const std::optional<TlsFiles> tls_;
  const std::optional<std::string> token_;
  std::mutex mutex_;
  std::map<std::string, Viewer> viewers_;
};

}  // namespace app
