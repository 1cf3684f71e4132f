#pragma once

#include <string_view>

#include "platform/Value.h"
#include "ui/web/Http.h"

// Answers of the APIs and pages the app serves itself.
namespace app {

ui::web::Response jsonResponse(const ui::web::Request& request, const platform::Dictionary& body);
// {"error": message}
ui::web::Response jsonError(const ui::web::Request& request, ui::web::http::status status,
                            std::string_view message);
// 405, naming the methods the address takes ("GET, HEAD").
ui::web::Response methodNotAllowed(const ui::web::Request& request, std::string_view allow);
// Whether the request reads: GET or HEAD.
bool isRead(const ui::web::Request& request);

}  // namespace app
