#pragma once

#include <functional>
#include <map>
#include <optional>
#include <string>
#include <string_view>

#include "ui/web/Access.h"
#include "ui/web/Http.h"
#include "ui/web/OpenPages.h"

namespace ui::web {

// What the browser and scripts can ask for. Every answer is a pure reading: no request changes
// what the screens show.
//
//   GET /                     the root screen, as a page
//   GET /LTE/CA%20Status      the screen reached by tapping those rows, as a page
//   GET /api/screens/<path>   the same screen's table as JSON
//   GET /api/<name>           one of the data readings the app adds, as JSON
//   GET /assets/<name>        the style sheet, script and icon of the pages
class Site {
 public:
  // Produces the JSON text of one data reading.
  using Reading = std::function<std::string()>;

  struct Options {
    // Answers requests for any host name; otherwise only for loopback names and addresses, so
    // that a web page elsewhere cannot read the data through a name that points at this machine.
    bool anyHost = false;
    // By name: "store" answers GET /api/store.
    std::map<std::string, Reading, std::less<>> readings;
    // When set, every answer needs this access token (see Access.h).
    std::optional<std::string> token = std::nullopt;
  };

  Site(OpenPages& pages, Options options);

  // Never throws: a failure inside becomes a 500 response.
  Response handle(const Request& request);

 private:
  Response route(const Request& request, std::string_view path);
  Response screenPage(const Request& request, std::string_view path, bool json);
  Response asset(const Request& request, std::string_view name);
  Response reading(const Request& request, std::string_view name);
  bool hostAllowed(const Request& request) const;

  OpenPages& pages_;
  Options options_;
  std::optional<Access> access_;
};

}  // namespace ui::web
