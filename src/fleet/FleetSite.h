#pragma once

#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <string_view>

#include "fleet/Fleet.h"
#include "ui/web/Http.h"

namespace fleet {

// What the browser can ask the fleet viewer for:
//
//   GET /                    a redirect to /fleet
//   GET /fleet               the fleet page (FleetPage.h)
//   GET /api/fleet           the fleet as JSON (Fleet::json)
//   GET /fleet/open/DEVICE   a redirect to the screens of that device
class FleetSite {
 public:
  // The address of the device's screens, for a browser that reached us as `host`; empty,
  // with the reason in `why`, when they cannot be shown.
  using OpenDevice = std::function<std::optional<std::string>(
      const std::string& device, std::string_view host, std::string& why)>;

  // `anyHost`: answers requests for any host name, not only for loopback ones.
  FleetSite(const Fleet& fleet, std::function<std::int64_t()> nowMs, bool anyHost,
            OpenDevice openDevice);

  // Never throws: a failure inside becomes a 500 response.
  ui::web::Response handle(const ui::web::Request& request);

 private:
  ui::web::Response route(const ui::web::Request& request, std::string_view path);
  ui::web::Response open(const ui::web::Request& request, std::string_view device);

  const Fleet& fleet_;
  const std::function<std::int64_t()> nowMs_;
  const bool anyHost_;
  const OpenDevice openDevice_;
};

}  // namespace fleet
