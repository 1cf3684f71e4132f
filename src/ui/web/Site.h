#pragma once

#include <functional>
#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "ui/web/Access.h"
#include "ui/web/Address.h"
#include "ui/web/Http.h"
#include "ui/web/OpenPages.h"

namespace ui::web {

// What the browser and scripts can ask for. Every answer but the app's own routes is a pure
// reading: no request changes what the screens show.
//
//   GET /                     the root screen, as a page
//   GET /LTE/CA%20Status      the screen reached by tapping those rows, as a page
//   GET /api/screens/<path>   the same screen's table as JSON
//   GET /api/<name>?<query>   one of the data readings the app adds, as JSON
//   GET /assets/<name>        the style sheet, script and icon of the pages
//   GET /dashboard            a document the app adds (any address it chooses)
//   any /api/replay           an address the app answers itself, whatever the method
class Site {
 public:
  // Produces the JSON text of one data reading.
  using Reading = std::function<std::string()>;
  // Answers every request for its path, whatever the method; it refuses the methods it does not
  // take itself. Runs on the main queue.
  using Route = std::function<Response(const Request& request)>;

  // The JSON of a reading that takes parameters, or why it cannot answer.
  struct QueryAnswer {
    http::status status = http::status::ok;
    std::string json;    // with 200
    std::string detail;  // otherwise: sent as {"error": the status's reason, "detail": detail}
  };
  using Query = std::function<QueryAnswer(const QueryParameters& parameters)>;

  // A page the app adds at an address of its own. The root screen's top bar links to it.
  struct Document {
    std::string path;   // "/dashboard"
    std::string asset;  // the built-in file it is, "dashboard.html"
    std::string title;  // the link's text
  };

  struct Options {
    // Answers requests for any host name; otherwise only for loopback names and addresses, so
    // that a web page elsewhere cannot read the data through a name that points at this machine.
    bool anyHost = false;
    // By name: "store" answers GET /api/store.
    std::map<std::string, Reading, std::less<>> readings;
    // By name: "series" answers GET /api/series?name=x with the query's parameters. A query
    // whose escapes are broken is refused before it gets there.
    std::map<std::string, Query, std::less<>> queries;
    std::vector<Document> documents;
    // By path: "/api/replay" answers every request for /api/replay. Routes come first.
    std::map<std::string, Route, std::less<>> routes;
    // When set, every answer needs this access token (see Access.h).
    std::optional<std::string> token = std::nullopt;
    // The pages are served over HTTPS, so the token's cookie travels only there.
    bool secure = false;
  };

  Site(OpenPages& pages, Options options);

  // Never throws: a failure inside becomes a 500 response.
  Response handle(const Request& request);

 private:
  Response route(const Request& request, std::string_view path);
  Response screenPage(const Request& request, std::string_view path, bool json);
  Response asset(const Request& request, std::string_view name);
  Response reading(const Request& request, std::string_view name);
  Response query(const Request& request, const Query& answer);
  const Document* document(std::string_view path) const;
  bool hostAllowed(const Request& request) const;

  OpenPages& pages_;
  Options options_;
  std::optional<Access> access_;
};

}  // namespace ui::web
