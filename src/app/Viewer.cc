#include "app/Viewer.h"

#include <iostream>
#include <memory>

#include "app/AppDelegate.h"
#include "app/MainInterface.h"
#include "platform/Json.h"
#include "store/MetricValidator.h"
#include "store/StoreDump.h"
#include "tarn/client/Transport.h"
#include "tarn/service/Core.h"
#include "tarn/sim/SimulatorSource.h"
#include "tarn/transport/InProcess.h"
#include "ui/Application.h"
#include "ui/web/ListenAddress.h"

namespace app {

const std::string_view kViewerUsage =
    "usage: norvo [--listen ADDR:PORT]\n"
    "\n"
    "Shows live baseband state in a web browser: LTE, UMTS and GSM radio state, serving and\n"
    "neighbour cells, carrier aggregation, NAS state, bearers and SIM files. The metrics come\n"
    "from the simulated phone of the baseband service built into Norvo.\n"
    "\n"
    "options:\n"
    "  --listen ADDR:PORT  where to serve the pages (default 127.0.0.1:8080). Only loopback\n"
    "                      addresses are private; 0.0.0.0:8080 shows the pages to the whole\n"
    "                      network. Port 0 takes any free port.\n"
    "  --help              show this text\n"
    "\n"
    "Every screen has an address made of the rows tapped to reach it, such as\n"
    "/LTE/CA%20Status; /api/screens/LTE/CA%20Status answers its table as JSON and\n"
    "/api/store answers the whole store.\n";

int runViewer(std::span<const std::string_view> arguments) {
  ui::DisplayOptions display;
  for (std::size_t i = 0; i < arguments.size(); ++i) {
    if (arguments[i] != "--listen") {
      std::cerr << "norvo: unknown option " << arguments[i] << "\n\n" << kViewerUsage;
      return 2;
    }
    const auto endpoint =
        i + 1 < arguments.size() ? ui::web::parseListenAddress(arguments[++i]) : std::nullopt;
    if (!endpoint) {
      std::cerr << "norvo: --listen wants an address and a port, such as 127.0.0.1:8080\n";
      return 2;
    }
    display.listen = *endpoint;
  }

  // The same drive every run, so that what one user sees another can reproduce.
  constexpr std::uint64_t kDriveSeed = 1;
  auto service = std::make_shared<tarn::service::Core>(
      std::make_shared<tarn::sim::SimulatorSource>(kDriveSeed));
  tarn::client::useTransport(std::make_shared<tarn::transport::InProcess>(service));

  display.readings.emplace("store", [] {
    return platform::toJson(store::dumpStore(store::MetricValidator::sharedInstance()));
  });
  AppDelegate delegate;
  return ui::applicationMain(delegate, mainInterface(), std::move(display));
}

}  // namespace app
