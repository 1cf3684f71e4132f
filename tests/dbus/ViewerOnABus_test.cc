// Norvo as a user runs it against tarnd on a bus that is not there yet, and that goes away and
// comes back: the viewer reaches it each time, says so in /api/status, and shows its metrics.
#include <gtest/gtest.h>

#include <boost/json/parse.hpp>
#include <csignal>

#include "ChildProcess.h"
#include "Eventually.h"
#include "LoopbackHttp.h"
#include "PrivateBus.h"
#include "Tarnd.h"
#include "TemporaryFolder.h"

namespace {

using namespace std::chrono_literals;
using bustest::eventually;

struct ServiceStatus {
  bool connected = false;
  std::string text;
};

// The service's part of /api/status; empty while the page does not answer.
std::optional<ServiceStatus> serviceStatus(int port) {
  const std::optional<std::string> body = bustest::get(port, "/api/status");
  if (!body) return std::nullopt;
  const boost::json::value status = boost::json::parse(*body);
  const boost::json::object& service = status.at("service").as_object();
  return ServiceStatus{service.at("connected").as_bool(),
                       std::string(service.at("status").as_string())};
}

// Metrics the viewer took in so far, as its log lines count them.
std::size_t metricsLogged(const bustest::ChildProcess& norvo) {
  const std::string log = norvo.standardOutput();
  std::size_t count = 0;
  for (std::size_t at = 0; (at = log.find("Received Valid Metric", at)) != std::string::npos; ++at)
    ++count;
  return count;
}

TEST(AViewerOnABus, ReachesTarndOnceTheBusAppearsAndAgainAfterTheBusIsRestarted) {
  bustest::TemporaryFolder folder;
  const std::filesystem::path socket = folder / "bus";
  const int port = bustest::freePort();
  bustest::ChildProcess norvo(
      {.arguments = {NORVO_VIEWER, "--service", "dbus:unix:path=" + socket.string(), "--listen",
                     "127.0.0.1:" + std::to_string(port), "--log", "-"},
       .standardOutput = folder / "norvo.out",
       .standardError = folder / "norvo.err"});
  std::optional<ServiceStatus> status;
  ASSERT_TRUE(eventually([&] { return (status = serviceStatus(port)).has_value(); }))
      << norvo.standardError();
  EXPECT_FALSE(status->connected);
  EXPECT_NE(status->text.find("cannot reach the bus"), std::string::npos) << status->text;

  for (const std::string round : {"first", "second"}) {
    auto bus = std::make_unique<bustest::PrivateBus>(socket);
    const std::size_t before = metricsLogged(norvo);
    auto tarnd =
        bustest::startTarnd(bus->address(), {"--source", "sim", "--speed", "20"}, folder / round);
    EXPECT_TRUE(eventually([&] { return serviceStatus(port).value_or(ServiceStatus{}).connected; }))
        << round << ": " << norvo.standardError();
    EXPECT_TRUE(eventually([&] { return metricsLogged(norvo) >= before + 5; }))
        << round << ": " << tarnd->standardError();

    bus.reset();
    EXPECT_EQ(tarnd->wait(10s), 1) << "tarnd leaves with its bus";
    EXPECT_TRUE(eventually([&] {
      return !serviceStatus(port).value_or(ServiceStatus{true, {}}).connected;
    })) << round;
  }
  EXPECT_EQ(norvo.stop(SIGINT, 10s), 0) << norvo.standardError();
  const std::string errors = norvo.standardError();
  EXPECT_EQ(errors.find("cannot reach the bus"), errors.rfind("cannot reach the bus"))
      << "said once: " << errors;
}

}  // namespace
