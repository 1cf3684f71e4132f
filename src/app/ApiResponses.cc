#include "app/ApiResponses.h"

#include <boost/beast/http/field.hpp>
#include <string>

#include "platform/Json.h"
#include "ui/web/Responses.h"

namespace app {

namespace http = ui::web::http;

ui::web::Response jsonResponse(const ui::web::Request& request, const platform::Dictionary& body) {
  return ui::web::makeResponse(http::status::ok, "application/json", platform::toJson(body),
                               request.version(), request.keep_alive());
}

ui::web::Response jsonError(const ui::web::Request& request, http::status status,
                            std::string_view message) {
  return ui::web::makeResponse(status, "application/json",
                               platform::toJson(platform::Dictionary{{"error", message}}),
                               request.version(), request.keep_alive());
}

ui::web::Response methodNotAllowed(const ui::web::Request& request, std::string_view allow) {
  ui::web::Response response = jsonError(request, http::status::method_not_allowed,
                                         "This address takes " + std::string(allow) + ".");
  response.set(http::field::allow, allow);
  return response;
}

bool isRead(const ui::web::Request& request) {
  return request.method() == http::verb::get || request.method() == http::verb::head;
}

}  // namespace app
