#include "ui/web/Server.h"

#include <gtest/gtest.h>
#include <stdlib.h>

#include <boost/asio/connect.hpp>
#include <boost/asio/read.hpp>
#include <boost/asio/ssl/context.hpp>
#include <boost/asio/ssl/host_name_verification.hpp>
#include <boost/asio/write.hpp>
#include <boost/beast/core/flat_buffer.hpp>
#include <boost/beast/core/tcp_stream.hpp>
#include <boost/beast/http/read.hpp>
#include <boost/beast/http/write.hpp>
#include <boost/beast/ssl/ssl_stream.hpp>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <future>
#include <stdexcept>
#include <thread>

#include "ui/web/Access.h"
#include "ui/web/Responses.h"
#include "ui/web/Tls.h"

namespace ui::web {
namespace {

namespace asio = boost::asio;
namespace beast = boost::beast;
namespace ssl = asio::ssl;
using tcp = asio::ip::tcp;
using namespace std::chrono_literals;

// A server on its own io_context, run by a thread of its own, and blocking clients.
class AServer : public ::testing::Test {
 protected:
  void start(Server::Limits limits = {}, std::shared_ptr<TlsContext> tls = nullptr) {
    server.emplace(context, handler, limits, std::move(tls));
    ASSERT_FALSE(server->listen({asio::ip::make_address("127.0.0.1"), 0}));
    endpoint = server->localEndpoint();
    runner = std::thread([this] { context.run(); });
  }

  // Asked on the server's own thread, which owns the count.
  std::size_t openConnections() {
    std::promise<std::size_t> count;
    asio::post(context, [&] { count.set_value(server->openConnections()); });
    return count.get_future().get();
  }

  void waitForConnections(std::size_t wanted) {
    while (openConnections() < wanted)
      std::this_thread::sleep_for(1ms);
  }

  // Ends the server and its thread, as the destructor does.
  void finish() {
    asio::post(context, [this] { server.reset(); });
    work.reset();
    if (runner.joinable()) runner.join();
  }
  ~AServer() override { finish(); }

  tcp::socket connect() {
    tcp::socket socket(client);
    socket.connect(endpoint);
    return socket;
  }

  // Writes `raw` and reads until the server closes the connection.
  static std::string exchange(tcp::socket& socket, std::string_view raw) {
    asio::write(socket, asio::buffer(raw));
    std::string answer;
    boost::system::error_code error;
    asio::read(socket, asio::dynamic_buffer(answer), error);
    return answer;
  }

  // Echoes the target, or throws for /throw.
  Server::Handler handler = [this](const Request& request) {
    ++handled;
    if (request.target() == "/throw") throw std::runtime_error("boom");
    return makeResponse(http::status::ok, "text/plain", std::string(request.target()),
                        request.version(), request.keep_alive());
  };
  asio::io_context context;
  asio::executor_work_guard<asio::io_context::executor_type> work{context.get_executor()};
  asio::io_context client;
  std::optional<Server> server;
  tcp::endpoint endpoint;
  std::thread runner;
  std::atomic<int> handled = 0;
};

TEST_F(AServer, AnswersSeveralRequestsOnOneConnectionAndClosesWhenAsked) {
  start();
  tcp::socket socket = connect();
  const std::string answer = exchange(socket,
                                      "GET /one HTTP/1.1\r\nHost: x\r\n\r\n"
                                      "GET /two HTTP/1.1\r\nHost: x\r\nConnection: close\r\n\r\n");
  EXPECT_NE(answer.find("HTTP/1.1 200 OK"), std::string::npos);
  EXPECT_NE(answer.find("\r\n\r\n/one"), std::string::npos);
  EXPECT_TRUE(answer.ends_with("\r\n\r\n/two"));
  EXPECT_EQ(handled, 2);
}

TEST_F(AServer, RefusesOversizedOrMalformedRequestsWithoutHandlingThem) {
  start({.headerBytes = 512, .bodyBytes = 16});
  const std::pair<std::string, std::string_view> cases[] = {
      {"GET / HTTP/1.1\r\nHost: x\r\nX-Big: " + std::string(1000, 'a') + "\r\n\r\n",
       "HTTP/1.1 431"},
      {"POST / HTTP/1.1\r\nHost: x\r\nContent-Length: 100\r\n\r\n" + std::string(100, 'b'),
       "HTTP/1.1 413"},
      {"GET / HTTP/9.9\r\n\r\n", "HTTP/1.1 400"},
      {"\x01\x02garbage\r\n\r\n", "HTTP/1.1 400"},
  };
  for (const auto& [request, status] : cases) {
    tcp::socket socket = connect();
    EXPECT_TRUE(exchange(socket, request).starts_with(status)) << request.substr(0, 40);
  }
  EXPECT_EQ(handled, 0);
}

TEST_F(AServer, AnswersAFailingHandlerWithAnInternalServerError) {
  start();
  tcp::socket socket = connect();
  EXPECT_TRUE(exchange(socket, "GET /throw HTTP/1.1\r\nHost: x\r\n\r\n")
                  .starts_with("HTTP/1.1 500 Internal Server Error"));
}

// Part of a request, then silence: the request never completes.
TEST_F(AServer, ClosesAConnectionWhoseRequestDoesNotArriveWithinTheReadTimeout) {
  start({.readTimeout = 50ms});
  for (const std::string_view part : {"GET / HTTP/1.1\r\n", "G"}) {
    tcp::socket socket = connect();
    asio::write(socket, asio::buffer(part));
    std::string answer;
    boost::system::error_code error;
    asio::read(socket, asio::dynamic_buffer(answer), error);
    EXPECT_EQ(error, asio::error::eof) << part;
    EXPECT_TRUE(answer.empty());
  }
  EXPECT_EQ(handled, 0);
}

TEST_F(AServer, ClosesConnectionsPastItsLimitAtOnce) {
  start({.maxConnections = 1});
  tcp::socket first = connect();
  // Let the server take the first connection before the second arrives.
  waitForConnections(1);
  tcp::socket second = connect();
  EXPECT_EQ(exchange(second, "GET / HTTP/1.1\r\nHost: x\r\n\r\n"), "");
  EXPECT_NE(exchange(first, "GET / HTTP/1.1\r\nHost: x\r\nConnection: close\r\n\r\n"), "");
}

TEST_F(AServer, LetsNoClientHoldMoreThanItsShareOfTheConnections) {
  // 127.0.0.2 stands for another client.
  start({.maxConnections = 4, .maxPerClient = 2, .keptForLoopback = 1});
  const auto from = [this](const char* address) {
    tcp::socket socket(client);
    socket.open(tcp::v4());
    socket.bind({asio::ip::make_address(address), 0});
    socket.connect(endpoint);
    return socket;
  };
  tcp::socket first = from("127.0.0.1");
  tcp::socket second = from("127.0.0.1");
  waitForConnections(2);
  tcp::socket third = from("127.0.0.1");
  EXPECT_EQ(exchange(third, "GET / HTTP/1.1\r\nHost: x\r\n\r\n"), "") << "past its share";
  tcp::socket other = from("127.0.0.2");
  EXPECT_NE(exchange(other, "GET / HTTP/1.1\r\nHost: x\r\nConnection: close\r\n\r\n"), "");
  EXPECT_NE(exchange(first, "GET / HTTP/1.1\r\nHost: x\r\nConnection: close\r\n\r\n"), "");
}

TEST_F(AServer, ClosesItsOpenConnectionsWhenStopped) {
  start();
  tcp::socket socket = connect();
  waitForConnections(1);
  asio::post(context, [this] { server->stop(); });
  std::string answer;
  boost::system::error_code error;
  asio::read(socket, asio::dynamic_buffer(answer), error);
  EXPECT_TRUE(answer.empty());
  EXPECT_TRUE(error);
}

// A self-signed certificate for 127.0.0.1, its key and a key of another, made by the openssl
// command in a folder of their own.
class TestCertificate {
 public:
  TestCertificate() {
    run("openssl req -x509 -newkey ec -pkeyopt ec_paramgen_curve:prime256v1 -nodes -days 2 "
        "-subj /CN=127.0.0.1 -addext subjectAltName=IP:127.0.0.1 -keyout " +
        key.string() + " -out " + certificate.string());
    run("openssl genpkey -algorithm EC -pkeyopt ec_paramgen_curve:prime256v1 -out " +
        otherKey.string());
    std::ofstream(garbage) << "not a certificate\n";
  }
  ~TestCertificate() { std::filesystem::remove_all(folder); }

  std::filesystem::path folder = makeFolder();
  std::filesystem::path certificate = folder / "cert.pem";
  std::filesystem::path key = folder / "key.pem";
  std::filesystem::path otherKey = folder / "other-key.pem";
  std::filesystem::path garbage = folder / "garbage.pem";

 private:
  static std::filesystem::path makeFolder() {
    std::string pattern = (std::filesystem::temp_directory_path() / "norvo-tls-XXXXXX").string();
    if (::mkdtemp(pattern.data()) == nullptr) throw std::runtime_error("mkdtemp");
    return pattern;
  }

  static void run(const std::string& command) {
    if (std::system((command + " 2>/dev/null").c_str()) != 0)
      throw std::runtime_error("failed: " + command);
  }
};

TEST(TlsContext, RefusesFilesThatAreMissingNotPemOrDoNotBelongTogetherNamingTheFileAtFault) {
  const TestCertificate files;
  const std::string missing = (files.folder / "missing.pem").string();
  struct Case {
    std::string certificate, key, named;
  };
  const Case cases[] = {
      {missing, files.key.string(), "--tls-cert " + missing},
      {files.garbage.string(), files.key.string(), "--tls-cert " + files.garbage.string()},
      {files.key.string(), files.key.string(), "--tls-cert " + files.key.string()},
      {files.certificate.string(), missing, "--tls-key " + missing},
      {files.certificate.string(), files.garbage.string(), "--tls-key " + files.garbage.string()},
      {files.certificate.string(), files.otherKey.string(), "--tls-key " + files.otherKey.string()},
  };
  for (const auto& [certificate, key, named] : cases) {
    try {
      loadTlsContext(certificate, key);
      ADD_FAILURE() << "took " << certificate << " and " << key;
    } catch (const std::runtime_error& error) {
      EXPECT_TRUE(std::string_view(error.what()).starts_with(named)) << error.what();
    }
  }
  EXPECT_NE(loadTlsContext(files.certificate.string(), files.key.string()), nullptr);
}

TEST(TlsContext, OfTheOptionsIsNoneWithoutThemAndWantsBoth) {
  const TestCertificate files;
  const std::string certificate = files.certificate.string(), key = files.key.string();
  EXPECT_EQ(tlsContextOfOptions(std::nullopt, std::nullopt), nullptr);
  EXPECT_NE(tlsContextOfOptions(certificate, key), nullptr);
  for (const auto& [certificateFile, keyFile] :
       {std::pair{std::optional<std::string_view>(certificate), std::optional<std::string_view>()},
        std::pair{std::optional<std::string_view>(), std::optional<std::string_view>(key)}}) {
    try {
      tlsContextOfOptions(certificateFile, keyFile);
      ADD_FAILURE() << "took one without the other";
    } catch (const std::runtime_error& error) {
      EXPECT_STREQ(error.what(), "--tls-cert and --tls-key go together");
    }
  }
}

// A server over TLS whose every answer needs the token, and HTTPS clients that trust only the
// test certificate.
class ATlsServer : public AServer {
 protected:
  ATlsServer() {
    handler = [this](const Request& request) {
      if (auto refused = access.check(request)) return std::move(*refused);
      return makeResponse(http::status::ok, "text/plain", "the page", request.version(),
                          request.keep_alive());
    };
    start({.readTimeout = 500ms}, loadTlsContext(files.certificate.string(), files.key.string()));
    clientTls.load_verify_file(files.certificate.string());
    clientTls.set_verify_mode(ssl::verify_peer);
  }

  Response get(const std::string& target, const std::string& cookie = {}) {
    beast::ssl_stream<beast::tcp_stream> stream(client, clientTls);
    stream.set_verify_callback(ssl::host_name_verification("127.0.0.1"));
    beast::get_lowest_layer(stream).connect(endpoint);
    stream.handshake(ssl::stream_base::client);
    Request request(http::verb::get, target, 11);
    request.set(http::field::host, "127.0.0.1");
    if (!cookie.empty()) request.set(http::field::cookie, cookie);
    http::write(stream, request);
    beast::flat_buffer buffer;
    Response response;
    http::read(stream, buffer, response);
    return response;
  }

  // The server goes before what its handler uses.
  ~ATlsServer() override { finish(); }

  const TestCertificate files;
  Access access{"s3cret", true};
  ssl::context clientTls{ssl::context::tls_client};
};

TEST_F(ATlsServer, ServesOverHttpsToWhoeverBringsTheTokenAndKeepsItInASecureCookie) {
  EXPECT_EQ(get("/").result(), http::status::unauthorized);
  EXPECT_EQ(get("/?token=wrong").result(), http::status::unauthorized);
  EXPECT_EQ(get("/", "norvo_token=wrong").result(), http::status::unauthorized);

  const Response admitted = get("/?token=s3cret");
  EXPECT_EQ(admitted.result(), http::status::see_other);
  EXPECT_EQ(admitted[http::field::location], "/");
  const std::string cookie(admitted[http::field::set_cookie]);
  EXPECT_EQ(cookie, "norvo_token=s3cret; HttpOnly; SameSite=Strict; Path=/; Secure");

  const Response page = get("/", cookie.substr(0, cookie.find(';')));
  EXPECT_EQ(page.result(), http::status::ok);
  EXPECT_EQ(page.body(), "the page");
}

TEST_F(ATlsServer, ClosesPlainHttpAndSilentClientsAndKeepsServing) {
  const auto exchange = [this](std::string_view sent) {
    tcp::socket socket = connect();
    return AServer::exchange(socket, sent);
  };
  EXPECT_EQ(exchange("GET /?token=s3cret HTTP/1.1\r\nHost: 127.0.0.1\r\n\r\n").find("HTTP/1.1"),
            std::string::npos)
      << "no plain answer";
  // Connected, but never shakes hands: let go at the read timeout.
  EXPECT_EQ(exchange(""), "");
  EXPECT_EQ(get("/?token=s3cret").result(), http::status::see_other);
}

}  // namespace
}  // namespace ui::web
