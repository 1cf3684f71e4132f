#include "ui/web/Server.h"

#include <utility>

#include "ui/web/Session.h"

namespace ui::web {

using tcp = boost::asio::ip::tcp;
using serving::Session;
using serving::Shared;

Server::Server(boost::asio::io_context& context, Handler handler, Limits limits,
               std::shared_ptr<TlsContext> tls)
    : acceptor_(context),
      shared_(std::make_shared<Shared>(Shared{std::move(handler), limits, {}, {}, false})),
      tls_(std::move(tls)) {}

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
      [this, shared = shared_, tls = tls_](boost::system::error_code error, tcp::socket socket) {
        // The server may be gone by now; `shared` tells.
        if (shared->stopped) return;
        if (!error) {
          boost::system::error_code unknown;
          const boost::asio::ip::address client = socket.remote_endpoint(unknown).address();
          if (unknown || !shared->admits(client)) {
            boost::system::error_code ignored;
            socket.close(ignored);
          } else if (tls) {
            serving::startTlsSession(std::move(socket), client, shared, *tls);
          } else {
            std::make_shared<Session<boost::beast::tcp_stream>>(client, shared, std::move(socket))
                ->start();
          }
        }
        accept();
      });
}

}  // namespace ui::web
