// Feeds arbitrary bytes to the HTTP server's request parser, with its limits, and what parses to
// the screen addresses, the query reader of /api and the access check: request targets, their
// query strings and cookies. Nothing a client sends may crash or hang them.
#include <boost/beast/http/parser.hpp>
#include <boost/beast/http/string_body.hpp>
#include <cstdint>
#include <cstdio>
#include <cstdlib>

#include "platform/Log.h"
#include "ui/web/Access.h"
#include "ui/web/Address.h"

namespace http = boost::beast::http;

namespace {

[[noreturn]] void fail(const char* what) {
  std::fprintf(stderr, "%s\n", what);
  std::abort();
}

// The path as a screen address and the query as the parameters of an /api reading.
void readTarget(std::string_view target) {
  const std::size_t mark = target.find('?');
  const auto path = ui::web::decodePath(target.substr(0, mark));
  if (path) {
    for (const std::string& row : *path) {
      if (row.empty()) fail("an address with an empty row");
    }
  }
  if (mark == std::string_view::npos) return;
  const std::string_view query = target.substr(mark + 1);
  if (const auto parameters = ui::web::decodeQuery(query)) {
    // Each parameter takes at least one byte of the query, and decoding only shortens.
    if (parameters->size() > query.size()) fail("more parameters than the query holds");
    for (const auto& [name, value] : *parameters) {
      if (name.size() + value.size() > query.size()) fail("a parameter longer than its query");
    }
  }
}

}  // namespace

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
    readTarget(std::string_view(reinterpret_cast<const char*>(data), size));
    return 0;
  }
  const ui::web::Request& request = parser.get();
  readTarget(request.target());
  if (const auto answer = access.check(request)) {
    if (answer->result() != http::status::unauthorized &&
        answer->result() != http::status::see_other)
      fail("the access check answered neither 401 nor 303");
  }
  return 0;
}
