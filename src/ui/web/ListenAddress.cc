#include "ui/web/ListenAddress.h"

#include <boost/asio/ip/address.hpp>
#include <boost/beast/core/string.hpp>
#include <charconv>
#include <cstdint>

namespace ui::web {

std::optional<boost::asio::ip::tcp::endpoint> parseListenAddress(std::string_view text) {
  const std::size_t colon = text.rfind(':');
  if (colon == std::string_view::npos) return std::nullopt;
  std::string_view host = text.substr(0, colon);
  const std::string_view portText = text.substr(colon + 1);

  std::uint16_t port = 0;
  const auto [end, error] =
      std::from_chars(portText.data(), portText.data() + portText.size(), port);
  if (portText.empty() || error != std::errc() || end != portText.data() + portText.size())
    return std::nullopt;

  if (host.size() >= 2 && host.front() == '[' && host.back() == ']')
    host = host.substr(1, host.size() - 2);
  else if (host.find(':') != std::string_view::npos)
    return std::nullopt;  // an IPv6 address needs its brackets, or its end is not clear
  if (host == "localhost") host = "127.0.0.1";
  boost::system::error_code invalid;
  const auto address = boost::asio::ip::make_address(std::string(host), invalid);
  if (invalid) return std::nullopt;
  return boost::asio::ip::tcp::endpoint(address, port);
}

std::string browserAddress(const boost::asio::ip::tcp::endpoint& endpoint, bool tls) {
  const auto address = endpoint.address();
  std::string host;
  if (address.is_unspecified())
    host = address.is_v6() ? "[::1]" : "127.0.0.1";
  else if (address.is_v6())
    host = "[" + address.to_string() + "]";
  else
    host = address.to_string();
  return (tls ? "https://" : "http://") + host + ":" + std::to_string(endpoint.port()) + "/";
}

bool isLoopbackHost(std::string_view host) {
  if (host.starts_with('[')) {
    const std::size_t close = host.find(']');
    if (close == std::string_view::npos) return false;
    host = host.substr(1, close - 1);
  } else if (const std::size_t colon = host.rfind(':'); colon != std::string_view::npos) {
    host = host.substr(0, colon);
  }
  if (boost::beast::iequals(host, "localhost")) return true;
  boost::system::error_code invalid;
  const auto address = boost::asio::ip::make_address(std::string(host), invalid);
  return !invalid && address.is_loopback();
}

}  // namespace ui::web
