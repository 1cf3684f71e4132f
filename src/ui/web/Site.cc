#include "ui/web/Site.h"

#include <boost/asio/ip/address.hpp>
#include <boost/beast/core/string.hpp>
#include <boost/beast/http/field.hpp>
#include <exception>

#include "platform/Json.h"
#include "platform/Log.h"
#include "ui/web/Assets.h"
#include "ui/web/ListenAddress.h"
#include "ui/web/PageHtml.h"
#include "ui/web/PageJson.h"
#include "ui/web/PageView.h"
#include "ui/web/Responses.h"

namespace ui::web {

namespace {

constexpr std::size_t kMaxTarget = 2048;
constexpr std::string_view kScreensApi = "/api/screens";
constexpr std::string_view kApi = "/api/";
constexpr std::string_view kAssetsPrefix = "/assets/";

ErrorFormat formatFor(std::string_view path) {
  return path.starts_with(kApi) || path == kScreensApi ? ErrorFormat::Json : ErrorFormat::Html;
}

Response error(const Request& request, http::status status, ErrorFormat format) {
  return errorResponse(status, format, request.version(), request.keep_alive());
}

}  // namespace

Site::Site(OpenPages& pages, Options options) : pages_(pages), options_(std::move(options)) {
  if (options_.token) access_.emplace(*options_.token, options_.secure);
}

Response Site::handle(const Request& request) {
  const std::string_view target = request.target();
  const std::string_view path = target.substr(0, target.find('?'));
  try {
    Response response = route(request, path);
    if (request.method() == http::verb::head) {
      const std::size_t length = response.body().size();
      response.body().clear();
      response.content_length(length);
    }
    return response;
  } catch (const std::exception& failure) {
    platform::log::plainf("Could not answer %s: %s", std::string(path), failure.what());
    return error(request, http::status::internal_server_error, formatFor(path));
  }
}

Response Site::route(const Request& request, std::string_view path) {
  if (!hostAllowed(request))
    return error(request, http::status::misdirected_request, formatFor(path));
  if (access_) {
    if (std::optional<Response> refusal = access_->check(request)) return std::move(*refusal);
  }
  if (request.target().size() > kMaxTarget)
    return error(request, http::status::uri_too_long, formatFor(path));
  if (const auto own = options_.routes.find(path); own != options_.routes.end())
    return own->second(request);
  if (request.method() != http::verb::get && request.method() != http::verb::head)
    return error(request, http::status::method_not_allowed, formatFor(path));
  if (!path.starts_with('/')) return error(request, http::status::bad_request, ErrorFormat::Html);

  if (path.starts_with(kAssetsPrefix)) return asset(request, path.substr(kAssetsPrefix.size()));
  if (path == kScreensApi) return screenPage(request, "/", true);
  if (path.starts_with(kScreensApi) && path[kScreensApi.size()] == '/')
    return screenPage(request, path.substr(kScreensApi.size()), true);
  if (path.starts_with(kApi)) return reading(request, path.substr(kApi.size()));
  if (const Document* found = document(path)) {
    Response response = asset(request, found->asset);
    // The document's own address is what the browser keeps.
    response.set(http::field::cache_control, "no-store");
    return response;
  }
  return screenPage(request, path, false);
}

Response Site::screenPage(const Request& request, std::string_view path, bool json) {
  const ErrorFormat format = json ? ErrorFormat::Json : ErrorFormat::Html;
  const std::optional<Path> rows = decodePath(path);
  if (!rows) return error(request, http::status::bad_request, format);
  Page* page = pages_.open(*rows, OpenPages::Clock::now());
  if (page == nullptr) return error(request, http::status::not_found, format);

  PageView view = describe(*page);
  if (!view.back) {
    for (const Document& linked : options_.documents)
      view.barLinks.push_back({linked.title, linked.path});
  }
  if (json)
    return makeResponse(http::status::ok, "application/json", renderJson(view), request.version(),
                        request.keep_alive());
  return makeResponse(http::status::ok, "text/html; charset=utf-8", renderHtml(view),
                      request.version(), request.keep_alive());
}

Response Site::asset(const Request& request, std::string_view name) {
  const Asset* found = findAsset(name);
  if (found == nullptr) return error(request, http::status::not_found, ErrorFormat::Html);
  const bool unchanged = request[http::field::if_none_match] == found->etag;
  Response response =
      makeResponse(unchanged ? http::status::not_modified : http::status::ok, found->contentType,
                   unchanged ? std::string() : std::string(found->content), request.version(),
                   request.keep_alive());
  response.set(http::field::cache_control, "no-cache");
  response.set(http::field::etag, found->etag);
  return response;
}

Response Site::reading(const Request& request, std::string_view name) {
  if (const auto withQuery = options_.queries.find(name); withQuery != options_.queries.end())
    return query(request, withQuery->second);
  const auto found = options_.readings.find(name);
  if (found == options_.readings.end())
    return error(request, http::status::not_found, ErrorFormat::Json);
  return makeResponse(http::status::ok, "application/json", found->second(), request.version(),
                      request.keep_alive());
}

Response Site::query(const Request& request, const Query& answer) {
  const std::string_view target = request.target();
  const std::size_t mark = target.find('?');
  const std::optional<QueryParameters> parameters =
      decodeQuery(mark == std::string_view::npos ? std::string_view() : target.substr(mark + 1));
  QueryAnswer answered =
      parameters ? answer(*parameters)
                 : QueryAnswer{http::status::bad_request, {}, "the query has a broken % escape"};
  if (answered.status == http::status::ok) {
    return makeResponse(http::status::ok, "application/json", std::move(answered.json),
                        request.version(), request.keep_alive());
  }
  const std::string_view reason = http::obsolete_reason(answered.status);
  const platform::Dictionary error{{"error", reason}, {"detail", std::move(answered.detail)}};
  return makeResponse(answered.status, "application/json", platform::toJson(error),
                      request.version(), request.keep_alive());
}

const Site::Document* Site::document(std::string_view path) const {
  for (const Document& candidate : options_.documents)
    if (candidate.path == path) return &candidate;
  return nullptr;
}

bool Site::hostAllowed(const Request& request) const {
  if (options_.anyHost) return true;
  const auto host = request.find(http::field::host);
  // Clients of HTTP/1.0 may leave the host out; browsers always name one.
  return host == request.end() || isLoopbackHost(host->value());
}

}  // namespace ui::web
