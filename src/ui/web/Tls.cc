// Everything of the server that knows OpenSSL: the context made from the files, and the session
// over a TLS stream.

#include "ui/web/Tls.h"

#include <openssl/ssl.h>

#include <boost/asio/ssl/context.hpp>
#include <boost/asio/ssl/error.hpp>
#include <boost/beast/ssl/ssl_stream.hpp>
#include <stdexcept>

#include "platform/Format.h"
#include "ui/web/Session.h"

namespace ui::web {

namespace ssl = boost::asio::ssl;
using TlsStream = boost::beast::ssl_stream<boost::beast::tcp_stream>;

class TlsContext {
 public:
  ssl::context context{ssl::context::tls_server};
};

std::shared_ptr<TlsContext> loadTlsContext(const std::string& certificateFile,
                                           const std::string& keyFile) {
  auto tls = std::make_shared<TlsContext>();
  ssl::context& context = tls->context;
  // TLS 1.2 and later only: the older versions have known breaks.
  context.set_options(ssl::context::default_workarounds | ssl::context::no_sslv2 |
                      ssl::context::no_sslv3 | ssl::context::no_tlsv1 | ssl::context::no_tlsv1_1 |
                      ssl::context::single_dh_use);
  boost::system::error_code error;
  context.use_certificate_chain_file(certificateFile, error);
  if (error) {
    throw std::runtime_error(platform::format("--tls-cert %s: not a readable PEM certificate (%s)",
                                              certificateFile, error.message()));
  }
  context.use_private_key_file(keyFile, ssl::context::pem, error);
  if (error) {
    throw std::runtime_error(platform::format(
        "--tls-key %s: not a readable PEM private key of the certificate in %s (%s)", keyFile,
        certificateFile, error.message()));
  }
  if (SSL_CTX_check_private_key(context.native_handle()) != 1) {
    throw std::runtime_error(
        platform::format("--tls-key %s: the key does not belong to the certificate in %s", keyFile,
                         certificateFile));
  }
  return tls;
}

std::shared_ptr<TlsContext> tlsContextOfOptions(std::optional<std::string_view> certificateFile,
                                                std::optional<std::string_view> keyFile) {
  if (certificateFile.has_value() != keyFile.has_value())
    throw std::runtime_error("--tls-cert and --tls-key go together");
  if (!certificateFile) return nullptr;
  return loadTlsContext(std::string(*certificateFile), std::string(*keyFile));
}

namespace serving {

template <>
struct Opening<TlsStream> {
  template <class Done>
  static void open(TlsStream& stream, Done&& done) {
    stream.async_handshake(ssl::stream_base::server, std::forward<Done>(done));
  }
};

void startTlsSession(tcp::socket socket, boost::asio::ip::address client,
                     std::shared_ptr<Shared> shared, TlsContext& tls) {
  std::make_shared<Session<TlsStream>>(std::move(client), std::move(shared), std::move(socket),
                                       tls.context)
      ->start();
}

}  // namespace serving

}  // namespace ui::web
