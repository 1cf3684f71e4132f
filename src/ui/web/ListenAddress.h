#pragma once

#include <boost/asio/ip/tcp.hpp>
#include <optional>
#include <string>
#include <string_view>

namespace ui::web {

// "127.0.0.1:8080", "0.0.0.0:80", "[::1]:8080" (IPv6 in brackets) or "localhost:8080"; the port
// may be 0 (any free port). Empty for anything else.
std::optional<boost::asio::ip::tcp::endpoint> parseListenAddress(std::string_view text);

// The address a browser opens to reach `endpoint`, e.g. "http://127.0.0.1:8080/", or
// "https://127.0.0.1:8443/" when `tls`.
std::string browserAddress(const boost::asio::ip::tcp::endpoint& endpoint, bool tls = false);

// Whether a request's Host names this machine by loopback: "localhost", "127.0.0.1:8080",
// "[::1]:8080" and the like.
bool isLoopbackHost(std::string_view host);

}  // namespace ui::web
