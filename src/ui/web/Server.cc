#include "ui/web/Server.h"

#include <boost/asio/dispatch.hpp>
#include <boost/asio/strand.hpp>
#include <boost/beast/core/flat_buffer.hpp>
#include <boost/beast/core/tcp_stream.hpp>
#include <boost/beast/http/error.hpp>
#include <boost/beast/http/parser.hpp>
#include <boost/beast/http/read.hpp>
#include <boost/beast/http/write.hpp>
#include <exception>
#include <map>
#include <optional>
#include <set>
#include <utility>

#include "ui/web/Responses.h"

namespace ui::web {

namespace beast = boost::beast;
using tcp = boost::asio::ip::tcp;

struct Server::Shared {
  Handler handler;
  Limits limits;
  std::set<std::weak_ptr<Connection>, std::owner_less<>> connections;
  std::map<boost::asio::ip::address, std::size_t> byClient;
  bool stopped = false;

  // Whether a new connection from `client` may have a slot.
  bool admits(const boost::asio::ip::address& client) const {
    const auto found = byClient.find(client);
    if (found != byClient.end() && found->second >= limits.maxPerClient) return false;
    const std::size_t slots = client.is_loopback() || limits.keptForLoopback > limits.maxConnections
                                  ? limits.maxConnections
                                  : limits.maxConnections - limits.keptForLoopback;
    return connections.size() < slots;
  }
};

// One client connection: requests are read and answered one after another until the client
// closes, asks to close, goes quiet for longer than the read timeout or sends something broken.
class Server::Connection : public std::enable_shared_from_this<Connection> {
 public:
  Connection(tcp::socket socket, boost::asio::ip::address client, std::shared_ptr<Shared> shared)
      : stream_(std::move(socket)), client_(std::move(client)), shared_(std::move(shared)) {}

  void start() {
    shared_->connections.insert(weak_from_this());
    ++shared_->byClient[client_];
    read();
  }

  void close() {
    beast::error_code ignored;
    stream_.socket().shutdown(tcp::socket::shutdown_both, ignored);
    stream_.close();
  }

  ~Connection() {
    shared_->connections.erase(weak_from_this());
    if (--shared_->byClient[client_] == 0) shared_->byClient.erase(client_);
  }

 private:
  void read() {
    parser_.emplace();
    parser_->header_limit(static_cast<std::uint32_t>(shared_->limits.headerBytes));
    parser_->body_limit(shared_->limits.bodyBytes);
    stream_.expires_after(shared_->limits.readTimeout);
    beast::http::async_read(
        stream_, buffer_, *parser_,
        [self = shared_from_this()](beast::error_code error, std::size_t) { self->onRead(error); });
  }

  void onRead(beast::error_code error) {
    if (error == beast::http::error::end_of_stream || error == beast::error::timeout ||
        error == boost::asio::error::operation_aborted || error == boost::asio::error::eof ||
        error == boost::asio::error::connection_reset)
      return close();
    if (error) return reject(error);
    respond(answer(parser_->get()));
  }

  Response answer(const Request& request) {
    try {
      return shared_->handler(request);
    } catch (const std::exception&) {
      return errorResponse(beast::http::status::internal_server_error, ErrorFormat::Text,
                           request.version(), false);
    }
  }

  // The request was malformed or too large: say so, then close.
  void reject(beast::error_code error) {
    auto status = beast::http::status::bad_request;
    if (error == beast::http::error::body_limit)
      status = beast::http::status::payload_too_large;
    else if (error == beast::http::error::header_limit)
      status = beast::http::status::request_header_fields_too_large;
    respond(errorResponse(status, ErrorFormat::Text, 11, false));
  }

  void respond(Response response) {
    response_ = std::move(response);
    stream_.expires_after(shared_->limits.writeTimeout);
    beast::http::async_write(stream_, *response_,
                             [self = shared_from_this()](beast::error_code error, std::size_t) {
                               self->onWrite(error);
                             });
  }

  void onWrite(beast::error_code error) {
    const bool keepAlive = response_->keep_alive();
    response_.reset();
    if (error || !keepAlive) return close();
    read();
  }

  beast::tcp_stream stream_;
  const boost::asio::ip::address client_;
  beast::flat_buffer buffer_;
  std::optional<beast::http::request_parser<beast::http::string_body>> parser_;
  std::optional<Response> response_;
  std::shared_ptr<Shared> shared_;
};

Server::Server(boost::asio::io_context& context, Handler handler, Limits limits)
    : acceptor_(context),
      shared_(std::make_shared<Shared>(Shared{std::move(handler), limits, {}, {}, false})) {}

Server::~Server() {
  stop();
}

boost::system::error_code Server::listen(const tcp::endpoint& endpoint) {
  boost::system::error_code error;
  acceptor_.open(endpoint.protocol(), error);
  if (!error) acceptor_.set_option(tcp::acceptor::reuse_address(true), error);
  if (!error) acceptor_.bind(endpoint, error);
  if (!error) acceptor_.listen(tcp::acceptor::max_listen_connections, error);
  if (error) {
    boost::system::error_code ignored;
    acceptor_.close(ignored);
    return error;
  }
  accept();
  return {};
}

tcp::endpoint Server::localEndpoint() const {
  boost::system::error_code ignored;
  return acceptor_.local_endpoint(ignored);
}

void Server::stop() {
  shared_->stopped = true;
  boost::system::error_code ignored;
  acceptor_.close(ignored);
  // Closing may end a connection, which then leaves the set.
  const auto open = shared_->connections;
  for (const auto& weak : open)
    if (auto connection = weak.lock()) connection->close();
}

std::size_t Server::openConnections() const {
  return shared_->connections.size();
}

void Server::accept() {
  acceptor_.async_accept(
      [this, shared = shared_](boost::system::error_code error, tcp::socket socket) {
        // The server may be gone by now; `shared` tells.
        if (shared->stopped) return;
        if (!error) {
          boost::system::error_code unknown;
          const boost::asio::ip::address client = socket.remote_endpoint(unknown).address();
          if (unknown || !shared->admits(client)) {
            boost::system::error_code ignored;
            socket.close(ignored);
          } else {
            std::make_shared<Connection>(std::move(socket), client, shared)->start();
          }
        }
        accept();
      });
}

}  // namespace ui::web
