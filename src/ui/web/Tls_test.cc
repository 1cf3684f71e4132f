#include "ui/web/Tls.h"

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
#include <stdexcept>
#include <thread>

#include "ui/web/Access.h"
#include "ui/web/Responses.h"
#include "ui/web/Server.h"

namespace ui::web {
namespace {

namespace asio = boost::asio;
namespace beast = boost::beast;
namespace ssl = asio::ssl;
using tcp = asio::ip::tcp;
using namespace std::chrono_literals;

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

// A server over TLS whose every answer needs the token, on a thread of its own, and HTTPS
// clients that trust only the test certificate.
class ATlsServer : public ::testing::Test {
 protected:
  static constexpr std::string_view kToken = "s3cret";

  ATlsServer() {
    server.emplace(
        context,
        [this](const Request& request) {
          if (auto refused = access.check(request)) return std::move(*refused);
          return makeResponse(http::status::ok, "text/plain", "the page", request.version(),
                              request.keep_alive());
        },
        Server::Limits{.readTimeout = 500ms},
        loadTlsContext(files.certificate.string(), files.key.string()));
    EXPECT_FALSE(server->listen({asio::ip::make_address("127.0.0.1"), 0}));
    endpoint = server->localEndpoint();
    clientTls.load_verify_file(files.certificate.string());
    clientTls.set_verify_mode(ssl::verify_peer);
    runner = std::thread([this] { context.run(); });
  }

  ~ATlsServer() override {
    asio::post(context, [this] { server.reset(); });
    work.reset();
    runner.join();
  }

  Response get(std::string target, std::string cookie = {}) {
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

  const TestCertificate files;
  Access access{std::string(kToken), true};
  asio::io_context context;
  asio::executor_work_guard<asio::io_context::executor_type> work{context.get_executor()};
  std::optional<Server> server;
  tcp::endpoint endpoint;
  std::thread runner;
  asio::io_context client;
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
    tcp::socket socket(client);
    socket.connect(endpoint);
    asio::write(socket, asio::buffer(sent));
    std::string answer;
    boost::system::error_code error;
    asio::read(socket, asio::dynamic_buffer(answer), error);
    EXPECT_TRUE(error) << "the server closes";
    return answer;
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
