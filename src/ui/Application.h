#pragma once

#include <boost/asio/ip/tcp.hpp>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "platform/Value.h"
#include "ui/Storyboard.h"
#include "ui/Window.h"
#include "ui/web/Site.h"
#include "ui/web/Tls.h"

namespace ui {

// What the running application tells the app.
class ApplicationDelegate {
 public:
  virtual ~ApplicationDelegate() = default;

  // The window made from the interface description; the delegate holds it.
  virtual std::shared_ptr<Window> window() const = 0;
  virtual void setWindow(std::shared_ptr<Window> window) = 0;

  // Once the window exists, before it is shown. No launch options are ever passed here.
  virtual bool didFinishLaunchingWithOptions(
      const std::optional<platform::Dictionary>& launchOptions) = 0;
  // When the application is asked to stop (Ctrl-C or SIGTERM).
  virtual void applicationWillTerminate() {}
};

struct DisplayOptions {
  boost::asio::ip::tcp::endpoint listen{boost::asio::ip::make_address("127.0.0.1"), 8080};
  // Extra JSON readings under /api/<name>, with and without parameters.
  std::map<std::string, web::Site::Reading, std::less<>> readings;
  std::map<std::string, web::Site::Query, std::less<>> queries;
  // Pages beside the screens, linked from the root screen.
  std::vector<web::Site::Document> documents;
  // Told, on the main queue, the address to open once the pages are served.
  std::function<void(const std::string& address)> didStartServing;
  // Pages and APIs the app answers itself, by path (see web/Site.h).
  std::map<std::string, web::Site::Route, std::less<>> routes;
  // When set, every page and reading needs this access token; the address printed at start
  // carries it.
  std::optional<std::string> token;
  // When set, the pages are served over HTTPS only, with this certificate and key.
  std::shared_ptr<web::TlsContext> tls;
};

// Runs the application on the main queue until it is asked to stop: makes the window and its
// root from `mainInterface`, hands the window to `delegate`, shows it, and serves its screens to
// browsers at `display.listen` (each address a screen, see web/Site.h). Answers the process's
// exit status: 0 after a stop, 1 when the address cannot be listened on.
int applicationMain(ApplicationDelegate& delegate, const Storyboard& mainInterface,
                    DisplayOptions display);

}  // namespace ui
