#include "ui/web/Responses.h"

#include <boost/beast/http/field.hpp>
#include <boost/beast/http/status.hpp>

#include "platform/Json.h"
#include "platform/Value.h"
#include "ui/web/PageHtml.h"

namespace ui::web {

namespace {

// Pages load only their own script, style sheet and icon, and fetch only their own JSON.
constexpr std::string_view kContentSecurityPolicy =
    "default-src 'none'; script-src 'self'; style-src 'self'; img-src 'self'; "
    "connect-src 'self'; base-uri 'none'; form-action 'none'; frame-ancestors 'none'";

std::string_view explanation(http::status status) {
  switch (status) {
    case http::status::not_found:
      return "There is no screen at this address.";
    case http::status::method_not_allowed:
      return "This address can only be read.";
    case http::status::misdirected_request:
      return "This server does not answer for that host.";
    case http::status::uri_too_long:
      return "The address is too long.";
    case http::status::payload_too_large:
      return "The request is too large.";
    case http::status::request_header_fields_too_large:
      return "The request headers are too large.";
    case http::status::internal_server_error:
      return "Something went wrong while answering.";
    default:
      return "The request could not be understood.";
  }
}

}  // namespace

Response makeResponse(http::status status, std::string_view contentType, std::string body,
                      unsigned version, bool keepAlive) {
  Response response(status, version);
  response.set(http::field::content_type, contentType);
  response.set(http::field::cache_control, "no-store");
  response.set("X-Content-Type-Options", "nosniff");
  response.set("Referrer-Policy", "no-referrer");
  response.set("Content-Security-Policy", kContentSecurityPolicy);
  response.keep_alive(keepAlive);
  response.body() = std::move(body);
  response.prepare_payload();
  return response;
}

Response errorResponse(http::status status, ErrorFormat format, unsigned version, bool keepAlive) {
  const std::string_view reason = http::obsolete_reason(status);
  Response response = [&] {
    switch (format) {
      case ErrorFormat::Html:
        return makeResponse(status, "text/html; charset=utf-8",
                            renderMessagePage("Home", reason, explanation(status)), version,
                            keepAlive);
      case ErrorFormat::Json:
        return makeResponse(status, "application/json",
                            platform::toJson(platform::Dictionary{{"error", reason}}), version,
                            keepAlive);
      case ErrorFormat::Text:
        break;
    }
    return makeResponse(status, "text/plain; charset=utf-8",
                        std::string(explanation(status)) + "\n", version, keepAlive);
  }();
  if (status == http::status::method_not_allowed) response.set(http::field::allow, "GET, HEAD");
  return response;
}

}  // namespace ui::web
