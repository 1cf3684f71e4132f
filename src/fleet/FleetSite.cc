#include "fleet/FleetSite.h"

#include <exception>

#include "fleet/FleetPage.h"
#include "platform/Log.h"
#include "tarn/mqtt/BrokerAddress.h"
#include "ui/web/Address.h"
#include "ui/web/Assets.h"
#include "ui/web/ListenAddress.h"
#include "ui/web/Responses.h"

namespace fleet {

namespace {

namespace http = ui::web::http;
using ui::web::ErrorFormat;
using ui::web::Request;
using ui::web::Response;

constexpr std::string_view kOpen = "/fleet/open/";
constexpr std::string_view kAssets = "/assets/";

Response error(const Request& request, http::status status, ErrorFormat format) {
  return ui::web::errorResponse(status, format, request.version(), request.keep_alive());
}

Response content(const Request& request, std::string_view type, std::string_view body) {
  return ui::web::makeResponse(http::status::ok, type, std::string(body), request.version(),
                               request.keep_alive());
}

Response redirect(const Request& request, const std::string& location) {
  Response response =
      ui::web::makeResponse(http::status::see_other, "text/plain; charset=utf-8", location + "\n",
                            request.version(), request.keep_alive());
  response.set(http::field::location, location);
  return response;
}

}  // namespace

FleetSite::FleetSite(const Fleet& fleet, std::function<std::int64_t()> nowMs, bool anyHost,
                     OpenDevice openDevice)
    : fleet_(fleet),
      nowMs_(std::move(nowMs)),
      anyHost_(anyHost),
      openDevice_(std::move(openDevice)) {}

Response FleetSite::handle(const Request& request) {
  try {
    if (request.method() != http::verb::get && request.method() != http::verb::head)
      return error(request, http::status::method_not_allowed, ErrorFormat::Text);
    const auto host = request.find(http::field::host);
    if (!anyHost_ && host != request.end() && !ui::web::isLoopbackHost(host->value()))
      return error(request, http::status::misdirected_request, ErrorFormat::Text);
    std::string_view target = request.target();
    return route(request, target.substr(0, target.find('?')));
  } catch (const std::exception& failure) {
    platform::log::plain(std::string("norvo: the fleet page failed: ") + failure.what());
    return error(request, http::status::internal_server_error, ErrorFormat::Text);
  }
}

Response FleetSite::route(const Request& request, std::string_view path) {
  if (path == "/") return redirect(request, "/fleet");
  if (path == "/fleet") return content(request, "text/html; charset=utf-8", kFleetHtml);
  if (path == "/fleet/fleet.js")
    return content(request, "text/javascript; charset=utf-8", kFleetScript);
  if (path == "/fleet/fleet.css") return content(request, "text/css; charset=utf-8", kFleetStyle);
  if (path == "/api/fleet") return content(request, "application/json", fleet_.json(nowMs_()));
  if (path.starts_with(kOpen)) return open(request, path.substr(kOpen.size()));
  if (path.starts_with(kAssets)) {
    if (const ui::web::Asset* asset = ui::web::findAsset(path.substr(kAssets.size())))
      return content(request, asset->contentType, asset->content);
  }
  return error(request, http::status::not_found, ErrorFormat::Html);
}

Response FleetSite::open(const Request& request, std::string_view encoded) {
  const auto decoded = ui::web::decodePath("/" + std::string(encoded));
  if (!decoded || decoded->size() != 1 || !tarn::mqtt::isTopicLevel(decoded->front()))
    return error(request, http::status::not_found, ErrorFormat::Html);
  const auto host = request.find(http::field::host);
  std::string why;
  const std::optional<std::string> address = openDevice_(
      decoded->front(),
      host == request.end() ? std::string_view("127.0.0.1") : std::string_view(host->value()), why);
  if (!address) {
    return ui::web::makeResponse(http::status::service_unavailable, "text/plain; charset=utf-8",
                                 why + "\n", request.version(), request.keep_alive());
  }
  return redirect(request, *address);
}

}  // namespace fleet
