#pragma once

#include <memory>
#include <optional>
#include <string>
#include <string_view>

namespace ui::web {

// The certificate and private key the pages are served with over HTTPS. Only the server's TLS
// code sees inside, so that OpenSSL stays out of everything else that is built.
class TlsContext;

// Reads a PEM certificate (its chain may follow it in the same file) and the PEM private key
// that goes with it. Throws std::runtime_error naming the file at fault and why: unreadable, not
// PEM, or a key that does not belong to the certificate.
std::shared_ptr<TlsContext> loadTlsContext(const std::string& certificateFile,
                                           const std::string& keyFile);

// The context of the options --tls-cert and --tls-key as given: null when neither is. Throws
// std::runtime_error when only one is, or as loadTlsContext does.
std::shared_ptr<TlsContext> tlsContextOfOptions(std::optional<std::string_view> certificateFile,
                                                std::optional<std::string_view> keyFile);

}  // namespace ui::web
