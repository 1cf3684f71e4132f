#pragma once

// The connections of Server, over a plain or a TLS stream. Only Server.cc and Tls.cc include
// this, as it brings in Beast's stream and HTTP code.

#include <boost/asio/ip/tcp.hpp>
#include <boost/beast/core/flat_buffer.hpp>
#include <boost/beast/core/stream_traits.hpp>
#include <boost/beast/core/tcp_stream.hpp>
#include <boost/beast/http/error.hpp>
#include <boost/beast/http/parser.hpp>
#include <boost/beast/http/read.hpp>
#include <boost/beast/http/write.hpp>
#include <exception>
#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <set>
#include <utility>

#include "ui/web/Responses.h"
#include "ui/web/Server.h"

namespace ui::web::serving {

namespace beast = boost::beast;
using tcp = boost::asio::ip::tcp;

class Connection {
 public:
  virtual ~Connection() = default;
  virtual void close() = 0;
};

// What the server and its connections share; used on the server's io_context only.
struct Shared {
  Server::Handler handler;
  Server::Limits limits;
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

// What a stream does once accepted, before its first request is read: `open(stream, done)` calls
// `done` with the error that ends the connection, or none. Specialised beside each use.
template <class Stream>
struct Opening;

template <>
struct Opening<beast::tcp_stream> {
  template <class Done>
  static void open(beast::tcp_stream&, Done&& done) {
    done(beast::error_code());
  }
};

// One client connection: requests are read and answered one after another until the client
// closes, asks to close, goes quiet for longer than the read timeout or sends something broken.
template <class Stream>
class Session final : public Connection, public std::enable_shared_from_this<Session<Stream>> {
 public:
  // `streamArguments` make the stream: the accepted socket first.
  template <class... StreamArguments>
  Session(boost::asio::ip::address client, std::shared_ptr<Shared> shared,
          StreamArguments&&... streamArguments)
      : stream_(std::forward<StreamArguments>(streamArguments)...),
        client_(std::move(client)),
        shared_(std::move(shared)) {}

  void start() {
    shared_->connections.insert(this->weak_from_this());
    ++shared_->byClient[client_];
    // Opening counts against the read timeout, so a client that never finishes it is let go.
    tcpStream().expires_after(shared_->limits.readTimeout);
    Opening<Stream>::open(stream_, [self = this->shared_from_this()](beast::error_code error) {
      if (error) return self->close();
      self->read();
    });
  }

  void close() override {
    beast::error_code ignored;
    tcpStream().socket().shutdown(tcp::socket::shutdown_both, ignored);
    tcpStream().close();
  }

  ~Session() override {
    shared_->connections.erase(this->weak_from_this());
    if (--shared_->byClient[client_] == 0) shared_->byClient.erase(client_);
  }

 private:
  beast::tcp_stream& tcpStream() { return beast::get_lowest_layer(stream_); }

  void read() {
    parser_.emplace();
    parser_->header_limit(static_cast<std::uint32_t>(shared_->limits.headerBytes));
    parser_->body_limit(shared_->limits.bodyBytes);
    tcpStream().expires_after(shared_->limits.readTimeout);
    beast::http::async_read(stream_, buffer_, *parser_,
                            [self = this->shared_from_this()](
                                beast::error_code error, std::size_t) { self->onRead(error); });
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
    tcpStream().expires_after(shared_->limits.writeTimeout);
    beast::http::async_write(stream_, *response_,
                             [self = this->shared_from_this()](
                                 beast::error_code error, std::size_t) { self->onWrite(error); });
  }

  void onWrite(beast::error_code error) {
    const bool keepAlive = response_->keep_alive();
    response_.reset();
    if (error || !keepAlive) return close();
    read();
  }

  Stream stream_;
  const boost::asio::ip::address client_;
  beast::flat_buffer buffer_;
  std::optional<beast::http::request_parser<beast::http::string_body>> parser_;
  std::optional<Response> response_;
  std::shared_ptr<Shared> shared_;
};

// Serves `socket` over TLS with `tls` (Tls.cc).
void startTlsSession(tcp::socket socket, boost::asio::ip::address client,
                     std::shared_ptr<Shared> shared, TlsContext& tls);

}  // namespace ui::web::serving
