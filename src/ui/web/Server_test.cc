#include "ui/web/Server.h"

#include <gtest/gtest.h>

#include <boost/asio/connect.hpp>
#include <boost/asio/read.hpp>
#include <boost/asio/write.hpp>
#include <future>
#include <thread>

#include "ui/web/Responses.h"

namespace ui::web {
namespace {

namespace asio = boost::asio;
using tcp = asio::ip::tcp;
using namespace std::chrono_literals;

// A server on its own io_context, run by a thread of its own, and blocking clients.
class AServer : public ::testing::Test {
 protected:
  void start(Server::Limits limits = {}) {
    server.emplace(
        context,
        [this](const Request& request) {
          ++handled;
          if (request.target() == "/throw") throw std::runtime_error("boom");
          return makeResponse(http::status::ok, "text/plain", std::string(request.target()),
                              request.version(), request.keep_alive());
        },
        limits);
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

  ~AServer() override {
    asio::post(context, [this] { server.reset(); });
    work.reset();
    if (runner.joinable()) runner.join();
  }

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

TEST_F(AServer, ClosesAConnectionThatSendsNothingWithinTheReadTimeout) {
  start({.readTimeout = 50ms});
  tcp::socket socket = connect();
  asio::write(socket, asio::buffer(std::string_view("GET / HTTP/1.1\r\n")));
  std::string answer;
  boost::system::error_code error;
  asio::read(socket, asio::dynamic_buffer(answer), error);
  EXPECT_EQ(error, asio::error::eof);
  EXPECT_TRUE(answer.empty());
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

TEST_F(AServer, ClosesAConnectionWhoseRequestTricklesInPastTheReadTimeout) {
  start({.readTimeout = 200ms});
  tcp::socket socket = connect();
  std::string answer;
  boost::system::error_code error;
  // One byte, then silence: the request never completes.
  asio::write(socket, asio::buffer(std::string_view("G")));
  asio::read(socket, asio::dynamic_buffer(answer), error);
  EXPECT_TRUE(answer.empty());
  EXPECT_EQ(error, asio::error::eof);
  EXPECT_EQ(handled, 0);
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

}  // namespace
}  // namespace ui::web
