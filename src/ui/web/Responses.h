#pragma once

#include <string>
#include <string_view>

#include "ui/web/Http.h"

// Every response starts here, so that each carries the same safety headers; errors are built in
// this one place too.
namespace ui::web {

// A response that must not be cached, with the shared headers and the body's length set.
Response makeResponse(http::status status, std::string_view contentType, std::string body,
                      unsigned version, bool keepAlive);

enum class ErrorFormat {
  Html,  // a small page with a way home, for people
  Json,  // {"error": reason}, for scripts
  Text,  // for requests too broken to tell which
};

Response errorResponse(http::status status, ErrorFormat format, unsigned version, bool keepAlive);

}  // namespace ui::web
