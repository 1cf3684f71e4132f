// Feeds arbitrary bytes to the HTTP server's request parser, with its limits, and what parses to
// the screen addresses and the access check: request targets, their query strings and cookies.
// Nothing a client sends may crash or hang them.
#include <boost/beast/http/parser.hpp>
#include <boost/beast/http/string_body.hpp>
#include <cstdint>
#include <cstdio>
#include <cstdlib>

#include "platform/Log.h"
#include "ui/web/Access.h"
#include "ui/web/Address.h"

namespace http = boost::beast::http;

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  static const platform::log::Silence silence;
  static const ui::web::Access access("s3cret");

  http::request_parser<http::string_body> parser;
  parser.header_limit(8 * 1024);
  parser.body_limit(1024);
  parser.eager(true);
  boost::beast::error_code error;
  parser.put(boost::asio::buffer(data, size), error);
  if (!error && !parser.is_header_done()) parser.put_eof(error);
  if (!parser.is_header_done()) {
    // Not a request: the bytes as a target alone.
    const std::string_view target(reinterpret_cast<const char*>(data), size);
    (void)ui::web::decodePath(target.substr(0, target.find('?')));
    return 0;
  }
  const ui::web::Request& request = parser.get();
  const std::string_view target = request.target();
  const auto path = ui::web::decodePath(target.substr(0, target.find('?')));
  if (path) {
    for (const std::string& row : *path) {
      if (row.empty()) {
        std::fprintf(stderr, "an address with an empty row\n");
        std::abort();
      }
    }
  }
  if (const auto answer = access.check(request)) {
    if (answer->result() != http::status::unauthorized &&
        answer->result() != http::status::see_other) {
      std::fprintf(stderr, "the access check answered neither 401 nor 303\n");
      std::abort();
    }
  }
  return 0;
}
