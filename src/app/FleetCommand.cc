#include "app/FleetCommand.h"

#include <boost/asio/io_context.hpp>
#include <boost/asio/signal_set.hpp>
#include <chrono>
#include <csignal>
#include <iostream>
#include <optional>
#include <stdexcept>
#include <string>

#include "app/DeviceViewers.h"
#include "fleet/Fleet.h"
#include "fleet/FleetSite.h"
#include "platform/CommandLine.h"
#include "platform/Format.h"
#include "tarn/mqtt/Link.h"
#include "ui/web/Access.h"
#include "ui/web/ListenAddress.h"
#include "ui/web/Server.h"

namespace app {

const std::string_view kFleetUsage =
    "usage: norvo --fleet mqtt[s]://[USER[:PASS]@]HOST[:PORT]/PREFIX [--listen ADDR:PORT]\n"
    "             [--token-file FILE] [--mqtt-ca FILE] [--tls-cert FILE --tls-key FILE]\n"
    "\n"
    "Serves /fleet: every device that publishes under PREFIX (tarnd --publish), with its\n"
    "status, technology, network, serving cell, band, levels and the age of its last metric,\n"
    "live. Each device's name opens its screens, shown by a viewer of their own.\n"
    "\n"
    "options:\n"
    "  --listen ADDR:PORT  where to serve the page (default 127.0.0.1:8080); beyond this\n"
    "                      machine, to those who hold the access token Norvo makes, which\n"
    "                      the devices' screens ask for too\n"
    "  --token-file FILE   the access token to ask for, from FILE, instead of a new one\n"
    "  --mqtt-ca FILE      the certificate authority of an mqtts:// broker\n"
    "  --tls-cert FILE     serve the page, and the devices' screens, over HTTPS with this\n"
    "                      PEM certificate ...\n"
    "  --tls-key FILE      ... and this PEM private key (docs/security.md)\n"
    "  --help              show this text\n";

namespace {

std::int64_t steadyMs() {
  return std::chrono::duration_cast<std::chrono::milliseconds>(
             std::chrono::steady_clock::now().time_since_epoch())
      .count();
}

struct FleetOptions {
  tarn::mqtt::BrokerAddress broker;
  std::optional<std::string> caFile;
  boost::asio::ip::tcp::endpoint listen{boost::asio::ip::make_address("127.0.0.1"), 8080};
  std::optional<TlsFiles> tlsFiles;
  std::shared_ptr<ui::web::TlsContext> tls;
  std::optional<std::string> token;  // the pages are shown beyond this machine
};

std::optional<FleetOptions> parseFleetOptions(std::span<const std::string_view> arguments) {
  std::optional<std::string_view> broker, listen, caFile, tlsCert, tlsKey, tokenFile;
  const platform::CommandLineOption table[] = {
      {"--fleet", &broker, "a broker address"},     {"--listen", &listen, "an address and a port"},
      {"--mqtt-ca", &caFile, "a certificate file"}, {"--tls-cert", &tlsCert, "a certificate file"},
      {"--tls-key", &tlsKey, "a private key file"}, {"--token-file", &tokenFile, "a file"},
  };
  const auto refuse = [](std::string_view why) -> std::optional<FleetOptions> {
    std::cerr << "norvo: " << why << "\n\n" << kFleetUsage;
    return std::nullopt;
  };
  if (const std::string error = platform::readCommandLine(arguments, table); !error.empty())
    return refuse(error);
  FleetOptions options;
  const auto parsed = tarn::mqtt::parseBrokerAddress(broker.value_or(""));
  if (!parsed.address) return refuse("--fleet: " + parsed.error);
  options.broker = *parsed.address;
  if (caFile) {
    if (!options.broker.tls) return refuse("--mqtt-ca goes with an mqtts:// broker");
    options.caFile = std::string(*caFile);
  }
  if (listen) {
    const auto endpoint = ui::web::parseListenAddress(*listen);
    if (!endpoint) return refuse("--listen wants an address and a port, such as 127.0.0.1:8080");
    options.listen = *endpoint;
  }
  try {
    options.tls = ui::web::tlsContextOfOptions(tlsCert, tlsKey);
  } catch (const std::runtime_error& error) {
    return refuse(error.what());
  }
  if (options.tls) options.tlsFiles = TlsFiles{std::string(*tlsCert), std::string(*tlsKey)};
  if (tokenFile) {
    options.token = ui::web::Access::readToken(*tokenFile);
    if (!options.token)
      return refuse(
          platform::format("--token-file %s: %s", *tokenFile, ui::web::Access::kTokenFileRule));
  } else if (!options.listen.address().is_loopback()) {
    try {
      options.token = ui::web::Access::makeToken();
    } catch (const std::runtime_error& error) {
      return refuse(error.what());
    }
  }
  return options;
}

}  // namespace

int runFleet(std::span<const std::string_view> arguments) {
  if (platform::asksForHelp(arguments)) {
    std::cout << kFleetUsage;
    return 0;
  }
  const std::optional<FleetOptions> options = parseFleetOptions(arguments);
  if (!options) return 2;
  const std::string& prefix = options->broker.path;

  fleet::Fleet fleet(prefix);
  DeviceViewers viewers(options->broker, options->caFile, options->listen.address(),
                        options->tlsFiles, options->token);
  fleet::FleetSite site(fleet, &steadyMs, !options->listen.address().is_loopback(),
                        [&viewers](const std::string& device, std::string_view host,
                                   std::string& why) { return viewers.open(device, host, why); });

  std::optional<ui::web::Access> access;
  if (options->token) access.emplace(*options->token, options->tls != nullptr);

  boost::asio::io_context context(1);
  ui::web::Server server(
      context,
      [&site, &access](const ui::web::Request& request) {
        if (access) {
          if (std::optional<ui::web::Response> refused = access->check(request)) return *refused;
        }
        return site.handle(request);
      },
      {}, options->tls);
  if (const auto error = server.listen(options->listen)) {
    std::cerr << "norvo: cannot listen on "
              << ui::web::browserAddress(options->listen, options->tls != nullptr) << ": "
              << error.message() << '\n';
    return 1;
  }

  tarn::mqtt::LinkOptions linkOptions;
  linkOptions.broker = options->broker;
  linkOptions.caFile = options->caFile;
  linkOptions.subscriptions = {prefix + "/+/metrics", prefix + "/+/status"};
  linkOptions.name = "norvo";
  std::optional<tarn::mqtt::Link> link;
  try {
    link.emplace(std::move(linkOptions),
                 tarn::mqtt::Link::Handlers{
                     .connected = {},
                     .disconnected = {},
                     .published = {},
                     .message =
                         [&fleet](std::string_view topic, std::string_view payload) {
                           fleet.receive(topic, payload, steadyMs());
                         },
                     .subscribed = {},
                 });
    link->start();
  } catch (const std::runtime_error& error) {
    std::cerr << "norvo: " << error.what() << '\n';
    return 1;
  }

  // Flushed, as scripts wait for it on a pipe.
  std::string address =
      ui::web::browserAddress(server.localEndpoint(), options->tls != nullptr) + "fleet";
  if (options->token)
    address += "?" + std::string(ui::web::Access::kQueryKey) + "=" + *options->token;
  std::cout << "Open " << address << " in a browser; Ctrl-C stops." << std::endl;
  boost::asio::signal_set signals(context, SIGINT, SIGTERM);
  signals.async_wait([&](const boost::system::error_code& error, int) {
    if (error) return;
    server.stop();
    context.stop();
  });
  context.run();
  link.reset();
  return 0;
}

}  // namespace app
