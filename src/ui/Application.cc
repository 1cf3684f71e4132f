#include "ui/Application.h"

#include <boost/asio/signal_set.hpp>
#include <csignal>

#include "platform/Log.h"
#include "platform/MainQueue.h"
#include "ui/web/ListenAddress.h"
#include "ui/web/OpenPages.h"
#include "ui/web/Server.h"

namespace ui {

namespace {

// Lives on the main queue from launch to stop.
struct Running {
  Running(const Storyboard& mainInterface, DisplayOptions& display)
      : pages(mainInterface, {}),
        site(pages, {!display.listen.address().is_loopback(), std::move(display.readings),
                     std::move(display.queries), std::move(display.documents),
                     std::move(display.routes), display.token, display.tls != nullptr}),
        server(
            platform::mainQueue(),
            [this](const web::Request& request) { return site.handle(request); }, {}, display.tls),
        signals(platform::mainQueue(), SIGINT, SIGTERM) {}

  web::OpenPages pages;
  web::Site site;
  web::Server server;
  boost::asio::signal_set signals;
};

}  // namespace

int applicationMain(ApplicationDelegate& delegate, const Storyboard& mainInterface,
                    DisplayOptions display) {
  int status = 0;
  std::unique_ptr<Running> running;

  platform::postToMainQueue([&] {
    auto window = std::make_shared<Window>();
    window->setRootViewController(mainInterface.instantiateInitialViewController());
    delegate.setWindow(window);
    delegate.didFinishLaunchingWithOptions(std::nullopt);
    window->makeKeyAndVisible();

    running = std::make_unique<Running>(mainInterface, display);
    if (const auto error = running->server.listen(display.listen)) {
      platform::log::warningf("Cannot listen on %s: %s",
                              web::browserAddress(display.listen, display.tls != nullptr),
                              error.message());
      status = 1;
      platform::stopMainQueue();
      return;
    }
    std::string address =
        web::browserAddress(running->server.localEndpoint(), display.tls != nullptr);
    if (display.token) address += "?" + std::string(web::Access::kQueryKey) + "=" + *display.token;
    platform::log::plainf("Open %s in a browser; Ctrl-C stops.", address);
    if (display.didStartServing) display.didStartServing(address);
    running->signals.async_wait([&](const boost::system::error_code& error, int) {
      if (error) return;
      delegate.applicationWillTerminate();
      running->server.stop();
      platform::stopMainQueue();
    });
  });
  platform::runMainQueue();
  running.reset();
  return status;
}

}  // namespace ui
