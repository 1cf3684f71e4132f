#include "ui/web/Site.h"

#include <gtest/gtest.h>

#include <boost/json/parse.hpp>

#include "platform/Log.h"
#include "ui/testing/TestScreens.h"
#include "ui/web/Assets.h"
#include "ui/web/OpenPages.h"
#include "ui/web/Responses.h"

namespace ui::web {
namespace {

using testing::testData;
namespace json = boost::json;

class ASite : public ::testing::Test {
 protected:
  ASite() {
    testData().detail = {{"Carrier 0", {{"rsrp", "-95"}, {"band", "3"}}},
                         {std::nullopt, {{std::nullopt, std::nullopt}}}};
  }
  ~ASite() override { testData() = {}; }

  Response get(const std::string& target, const std::string& host = "127.0.0.1:8080",
               http::verb method = http::verb::get, Site* answering = nullptr) {
    Request request(method, target, 11);
    if (!host.empty()) request.set(http::field::host, host);
    return (answering != nullptr ? *answering : site).handle(request);
  }

  json::value getJson(const std::string& target) {
    const Response response = get(target);
    EXPECT_EQ(response[http::field::content_type], "application/json");
    return json::parse(response.body());
  }

  Storyboard board = testing::testStoryboard();
  OpenPages pages{board, {}};
  Site site{pages,
            {false,
             {{"store", [] { return std::string(R"({"a":1})"); }}},
             {},
             {},
             {{"/mine", [](const Request& request) {
                 return makeResponse(http::status::accepted, "text/plain",
                                     std::string(request.method_string()), request.version(),
                                     request.keep_alive());
               }}}}};
};

TEST_F(ASite, ShowsTheRootScreenAsAPageWhoseRowsLinkToTheScreensTheyLeadTo) {
  const Response response = get("/");
  EXPECT_EQ(response.result(), http::status::ok);
  EXPECT_EQ(response[http::field::content_type], "text/html; charset=utf-8");
  const std::string& html = response.body();
  EXPECT_NE(html.find("<h1>Home</h1>"), std::string::npos);
  EXPECT_NE(html.find(R"(<a href="/Alpha"><span class="text">Alpha</span></a>)"),
            std::string::npos);
  EXPECT_EQ(html.find("class=\"back\""), std::string::npos);
  EXPECT_NE(html.find(R"(data-source="/api/screens")"), std::string::npos);
}

TEST_F(ASite, ShowsAScreenReachedByTappingTheRowsItsAddressNames) {
  const Response response = get("/Beta");
  ASSERT_EQ(response.result(), http::status::ok);
  const std::string& html = response.body();
  EXPECT_NE(html.find(R"(<a class="back" href="/" rel="up">Home</a><h1>Beta</h1>)"),
            std::string::npos);
  EXPECT_NE(html.find("<h2>Carrier 0</h2>"), std::string::npos);
  EXPECT_NE(html.find(R"(<span class="text">rsrp</span><span class="detail">-95</span>)"),
            std::string::npos);
  EXPECT_NE(html.find(R"(data-source="/api/screens/Beta")"), std::string::npos);
}

TEST_F(ASite, AnswersAScreensTableAsJson) {
  const json::value screen = getJson("/api/screens/Alpha");
  EXPECT_EQ(screen.at("title"), "Alpha");
  const json::array& sections = screen.at("sections").as_array();
  ASSERT_EQ(sections.size(), 2u);
  EXPECT_EQ(sections[0].at("header"), "Carrier 0");
  EXPECT_EQ(sections[0].at("rows").at(0), (json::value{{"text", "rsrp"}, {"detail", "-95"}}));
  EXPECT_TRUE(sections[1].at("header").is_null());
  EXPECT_EQ(sections[1].at("rows").at(0), (json::value{{"text", nullptr}, {"detail", nullptr}}));

  const json::value root = getJson("/api/screens");
  EXPECT_EQ(root.at("sections").at(0).at("rows").at(1),
            (json::value{{"text", "Beta"}, {"detail", nullptr}, {"href", "/Beta"}}));
  EXPECT_EQ(getJson("/api/store"), (json::value{{"a", 1}}));
}

TEST_F(ASite, EscapesEveryTextItShows) {
  testData().menu = {"<script>alert(1)</script>"};
  testData().detail = {{"\"&'", {{"<b>", "</span><img src=x onerror=alert(1)>"}}}};
  const std::string root = get("/").body();
  EXPECT_EQ(root.find("<script>alert"), std::string::npos);
  EXPECT_NE(root.find("&lt;script&gt;alert(1)&lt;/script&gt;"), std::string::npos);
  EXPECT_NE(root.find(R"(href="/%3Cscript%3Ealert%281%29%3C%2Fscript%3E")"), std::string::npos);

  const Response detail = get("/%3Cscript%3Ealert%281%29%3C%2Fscript%3E");
  ASSERT_EQ(detail.result(), http::status::ok);
  EXPECT_NE(detail.body().find("<h2>&quot;&amp;&#39;</h2>"), std::string::npos);
  EXPECT_NE(detail.body().find("&lt;/span&gt;&lt;img src=x onerror=alert(1)&gt;"),
            std::string::npos);
  EXPECT_EQ(detail.body().find("<img"), std::string::npos);
}

TEST_F(ASite, AnswersNotFoundForAddressesThatNameNoScreen) {
  for (const char* target : {"/Gamma", "/Alpha/rsrp", "/alpha", "/assets/nope.css", "/x?y"}) {
    const Response response = get(target);
    EXPECT_EQ(response.result(), http::status::not_found) << target;
    EXPECT_EQ(response[http::field::content_type], "text/html; charset=utf-8");
    EXPECT_NE(response.body().find("Not Found"), std::string::npos);
  }
  for (const char* target : {"/api/screens/Gamma", "/api/nothing", "/api/screensX"}) {
    const Response response = get(target);
    EXPECT_EQ(response.result(), http::status::not_found) << target;
    EXPECT_EQ(json::parse(response.body()), (json::value{{"error", "Not Found"}}));
  }
}

TEST_F(ASite, RefusesWhatItCannotOrWillNotAnswer) {
  EXPECT_EQ(get("/%zz").result(), http::status::bad_request);
  EXPECT_EQ(get("//").result(), http::status::bad_request);
  EXPECT_EQ(get("http://example.com/").result(), http::status::bad_request);
  EXPECT_EQ(get("/" + std::string(3000, 'a')).result(), http::status::uri_too_long);

  const Response post = get("/api/store", "localhost", http::verb::post);
  EXPECT_EQ(post.result(), http::status::method_not_allowed);
  EXPECT_EQ(post[http::field::allow], "GET, HEAD");
  EXPECT_EQ(get("/", "localhost", http::verb::delete_).result(), http::status::method_not_allowed);
}

TEST_F(ASite, AnswersOnlyForLoopbackHostNamesUnlessToldOtherwise) {
  for (const char* host :
       {"localhost", "LOCALHOST:80", "127.0.0.1", "127.1.2.3:9", "[::1]:8080", ""})
    EXPECT_EQ(get("/", host).result(), http::status::ok) << host;
  for (const char* host :
       {"evil.example", "evil.example:8080", "10.0.0.1:8080", "[::1", "localhost.evil"})
    EXPECT_EQ(get("/", host).result(), http::status::misdirected_request) << host;

  Site open(pages, {true, {}, {}, {}, {}});
  Request request(http::verb::get, "/", 11);
  request.set(http::field::host, "viewer.example:8080");
  EXPECT_EQ(open.handle(request).result(), http::status::ok);
}

TEST_F(ASite, HandsEveryMethodForTheAppsOwnRoutesToThem) {
  for (const http::verb method : {http::verb::get, http::verb::post, http::verb::put}) {
    const Response response = get("/mine", "localhost", method);
    EXPECT_EQ(response.result(), http::status::accepted);
    EXPECT_EQ(response.body(), http::to_string(method));
  }
  EXPECT_EQ(get("/mine", "evil.example", http::verb::post).result(),
            http::status::misdirected_request);
  EXPECT_EQ(get("/mine/more").result(), http::status::not_found);
}

TEST_F(ASite, AnswersHeadWithTheLengthButNoBody) {
  const std::size_t length = get("/").body().size();
  const Response head = get("/", "localhost", http::verb::head);
  EXPECT_EQ(head.result(), http::status::ok);
  EXPECT_TRUE(head.body().empty());
  EXPECT_EQ(head[http::field::content_length], std::to_string(length));
}

TEST_F(ASite, ServesItsAssetsAndSaysWhenTheBrowsersCopyIsCurrent) {
  const Response css = get("/assets/norvo.css");
  ASSERT_EQ(css.result(), http::status::ok);
  EXPECT_EQ(css[http::field::content_type], "text/css; charset=utf-8");
  EXPECT_NE(css.body().find("prefers-color-scheme: dark"), std::string::npos);
  EXPECT_EQ(get("/assets/norvo.js")[http::field::content_type], "text/javascript; charset=utf-8");

  Request again(http::verb::get, "/assets/norvo.css", 11);
  again.set(http::field::if_none_match, css[http::field::etag]);
  const Response unchanged = site.handle(again);
  EXPECT_EQ(unchanged.result(), http::status::not_modified);
  EXPECT_TRUE(unchanged.body().empty());
}

TEST_F(ASite, SendsTheSafetyHeadersWithEveryAnswer) {
  for (const char* target : {"/", "/api/screens", "/nothing", "/assets/icon.svg"}) {
    const Response response = get(target);
    EXPECT_EQ(response["X-Content-Type-Options"], "nosniff") << target;
    EXPECT_NE(response["Content-Security-Policy"].find("script-src 'self'"), std::string::npos);
  }
  EXPECT_EQ(get("/api/screens")[http::field::cache_control], "no-store");
}

TEST_F(ASite, TurnsAFailureWhileAnsweringIntoAnInternalServerError) {
  get("/Alpha");
  testData().failNextReload = true;
  // A fresh page of the detail screen fails its first reload.
  platform::log::Capture log;
  const Response response = get("/Beta");
  EXPECT_EQ(response.result(), http::status::internal_server_error);
  EXPECT_EQ(log.plainLines(), std::vector<std::string>{"Could not answer /Beta: store is gone"});
  EXPECT_EQ(get("/Beta").result(), http::status::ok);
}

TEST_F(ASite, KeepsAPageOpenWhileItIsAskedForAndClosesItWhenIdle) {
  using namespace std::chrono_literals;
  const auto start = OpenPages::Clock::now();
  Page* page = pages.open({"Alpha"}, start);
  ASSERT_NE(page, nullptr);
  EXPECT_EQ(pages.open({"Alpha"}, start + 10s), page);
  pages.closeIdle(start + 20s);
  EXPECT_EQ(pages.size(), 1u);
  pages.closeIdle(start + 26s);
  EXPECT_EQ(pages.size(), 0u);
}

class ASiteWithPagesOfItsOwn : public ASite {
 protected:
  static Site::QueryAnswer echo(const QueryParameters& parameters) {
    const auto name = parameters.find("name");
    if (name == parameters.end()) return {http::status::bad_request, {}, "which name?"};
    return {http::status::ok, "{\"name\":\"" + name->second + "\"}", {}};
  }

  Site withPages{
      pages, {false, {}, {{"echo", &echo}}, {{"/dashboard", "dashboard.html", "Dashboard"}}, {}}};

  Response getFrom(Site& answering, const std::string& target) {
    return get(target, "localhost", http::verb::get, &answering);
  }
};

TEST_F(ASiteWithPagesOfItsOwn, ServesTheDocumentAndLinksToItFromTheRootScreenOnly) {
  const Response dashboard = getFrom(withPages, "/dashboard");
  ASSERT_EQ(dashboard.result(), http::status::ok);
  EXPECT_EQ(dashboard[http::field::content_type], "text/html; charset=utf-8");
  EXPECT_EQ(dashboard.body(), findAsset("dashboard.html")->content);
  EXPECT_EQ(dashboard[http::field::cache_control], "no-store");

  const std::string link = R"(<nav class="links"><a href="/dashboard">Dashboard</a></nav>)";
  EXPECT_NE(getFrom(withPages, "/").body().find(link), std::string::npos);
  EXPECT_EQ(getFrom(withPages, "/Beta").body().find(link), std::string::npos);
  EXPECT_EQ(get("/").body().find("links"), std::string::npos);
  EXPECT_EQ(get("/dashboard").result(), http::status::not_found);
}

TEST_F(ASiteWithPagesOfItsOwn, HandsAQueryItsParametersAndSendsItsRefusalsAsJson) {
  struct Case {
    const char* target;
    http::status status;
    json::value body;
  };
  const Case cases[] = {
      {"/api/echo?name=lte%2Ersrp&x=1", http::status::ok, {{"name", "lte.rsrp"}}},
      {"/api/echo?x=1",
       http::status::bad_request,
       {{"error", "Bad Request"}, {"detail", "which name?"}}},
      {"/api/echo",
       http::status::bad_request,
       {{"error", "Bad Request"}, {"detail", "which name?"}}},
      {"/api/echo?name=%z",
       http::status::bad_request,
       {{"error", "Bad Request"}, {"detail", "the query has a broken % escape"}}},
  };
  for (const Case& c : cases) {
    const Response response = getFrom(withPages, c.target);
    EXPECT_EQ(response.result(), c.status) << c.target;
    EXPECT_EQ(response[http::field::content_type], "application/json") << c.target;
    EXPECT_EQ(json::parse(response.body()), c.body) << c.target;
  }
}

TEST(OpenPages, CloseTheLeastRecentlyAskedForPageWhenFull) {
  const Storyboard board = testing::testStoryboard();
  OpenPages pages(board, {2, std::chrono::hours(1)});
  const auto now = OpenPages::Clock::now();
  pages.open({}, now);
  pages.open({"Alpha"}, now + std::chrono::seconds(1));
  pages.open({}, now + std::chrono::seconds(2));
  pages.open({"Beta"}, now + std::chrono::seconds(3));
  EXPECT_EQ(pages.size(), 2u);
  // The root was asked for after Alpha, so Alpha went.
  EXPECT_TRUE(pages.isOpen({}));
  EXPECT_FALSE(pages.isOpen({"Alpha"}));
  EXPECT_TRUE(pages.isOpen({"Beta"}));
}

// Pages shown beyond loopback, to holders of the token "s3cret" only.
class AGuardedSite : public ASite {
 protected:
  Response ask(const std::string& target, std::optional<std::string> cookie = std::nullopt) {
    Request request(http::verb::get, target, 11);
    if (cookie) request.set(http::field::cookie, *cookie);
    return guarded.handle(request);
  }

  Site guarded{pages,
               {.anyHost = true,
                .readings = {{"store", [] { return std::string(R"({"a":1})"); }}},
                .queries = {},
                .documents = {},
                .routes = {},
                .token = "s3cret"}};
};

TEST_F(AGuardedSite, AsksForItsTokenSetsItAsACookieOnceGivenAndTakesTheCookieFromThenOn) {
  for (const char* target : {"/", "/api/store", "/Beta", "/assets/norvo.css", "/?token=wrong",
                             "/?token=", "/?tokens3cret", "/?x=token=s3cret"}) {
    const Response refused = ask(target);
    EXPECT_EQ(refused.result(), http::status::unauthorized) << target;
    EXPECT_NE(refused.body().find("access token"), std::string::npos) << target;
  }
  for (const char* cookie : {"norvo_token=wrong", "other=s3cret", "norvo_token=s3cret2"}) {
    EXPECT_EQ(ask("/api/store", cookie).result(), http::status::unauthorized) << cookie;
  }

  const Response welcome = ask("/Beta?a=1&token=s3cret&b=2");
  EXPECT_EQ(welcome.result(), http::status::see_other);
  EXPECT_EQ(welcome[http::field::location], "/Beta?a=1&b=2");
  EXPECT_EQ(welcome[http::field::set_cookie],
            "norvo_token=s3cret; HttpOnly; SameSite=Strict; Path=/");
  EXPECT_EQ(ask("/?token=s3cret")[http::field::location], "/");

  const Response store = ask("/api/store", "theme=dark; norvo_token=s3cret");
  EXPECT_EQ(store.result(), http::status::ok);
  EXPECT_EQ(store.body(), R"({"a":1})");
  EXPECT_EQ(ask("/Beta", "norvo_token=s3cret").result(), http::status::ok);
}

TEST(AnAccessToken, IsNewEachTimeAndSafeInAnAddressAndACookie) {
  const std::string first = Access::makeToken();
  EXPECT_EQ(first.size(), 64u);
  EXPECT_EQ(first.find_first_not_of("0123456789abcdef"), std::string::npos);
  EXPECT_NE(Access::makeToken(), first);
}

}  // namespace
}  // namespace ui::web
