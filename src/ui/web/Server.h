#pragma once

#include <boost/asio/io_context.hpp>
#include <boost/asio/ip/tcp.hpp>
#include <chrono>
#include <cstddef>
#include <functional>
#include <memory>

#include "ui/web/Http.h"

namespace ui::web {

// An HTTP/1.1 server on one io_context: it reads each request within bounds, hands it to
// `handler` on that io_context and writes the answer back.
class Server {
 public:
  using Handler = std::function<Response(const Request&)>;

  struct Limits {
    std::size_t headerBytes = 8 * 1024;
    std::size_t bodyBytes = 1024;  // pages are only read, so requests carry next to nothing
    std::chrono::steady_clock::duration readTimeout = std::chrono::seconds(15);
    std::chrono::steady_clock::duration writeTimeout = std::chrono::seconds(15);
    std::size_t maxConnections = 256;  // connections past this are closed at once
  };

  Server(boost::asio::io_context& context, Handler handler, Limits limits);
  // Stops, as stop() does.
  ~Server();
  Server(const Server&) = delete;
  Server& operator=(const Server&) = delete;

  // Binds to `endpoint` and starts accepting. The error says why it could not bind.
  boost::system::error_code listen(const boost::asio::ip::tcp::endpoint& endpoint);
  // The bound address: with port 0, the port the system chose.
  boost::asio::ip::tcp::endpoint localEndpoint() const;
  // Accepts no more connections and closes the open ones.
  void stop();

  std::size_t openConnections() const;

 private:
  class Connection;
  struct Shared;

  void accept();

  boost::asio::ip::tcp::acceptor acceptor_;
  std::shared_ptr<Shared> shared_;
};

}  // namespace ui::web
