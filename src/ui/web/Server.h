#pragma once

#include <boost/asio/io_context.hpp>
#include <boost/asio/ip/tcp.hpp>
#include <chrono>
#include <cstddef>
#include <functional>
#include <memory>

#include "ui/web/Http.h"
#include "ui/web/Tls.h"

namespace ui::web {

namespace serving {
struct Shared;
}

// An HTTP/1.1 server on one io_context: it reads each request within bounds, hands it to
// `handler` on that io_context and writes the answer back. With a TLS context it speaks HTTPS
// only: a connection that does not shake hands within the read timeout is closed.
class Server {
 public:
  using Handler = std::function<Response(const Request&)>;

  // Slow or greedy clients cannot lock others out: a client (one address) holds a few
  // connections at most, a request must arrive whole soon after it starts or the connection
  // idles, and the last slots are kept for clients on this machine.
  struct Limits {
    std::size_t headerBytes = 8 * 1024;
    std::size_t bodyBytes = 1024;  // pages are only read, so requests carry next to nothing
    // From the moment the server waits for a request, whether idle after an answer or receiving
    // one byte at a time, to the request's last byte.
    std::chrono::steady_clock::duration readTimeout = std::chrono::seconds(5);
    std::chrono::steady_clock::duration writeTimeout = std::chrono::seconds(15);
    std::size_t maxConnections = 256;  // connections past this are closed at once
    std::size_t maxPerClient = 16;     // from one address
    // Of maxConnections, this many only loopback clients may take.
    std::size_t keptForLoopback = 32;
  };

  Server(boost::asio::io_context& context, Handler handler, Limits limits,
         std::shared_ptr<TlsContext> tls = nullptr);
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
  void accept();

  boost::asio::ip::tcp::acceptor acceptor_;
  std::shared_ptr<serving::Shared> shared_;
  const std::shared_ptr<TlsContext> tls_;
};

}  // namespace ui::web
