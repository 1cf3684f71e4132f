#include "ui/web/Access.h"

#include <algorithm>
#include <boost/beast/http/field.hpp>
#include <cctype>
#include <fstream>
#include <stdexcept>

#include "platform/Format.h"
#include "ui/web/Responses.h"

namespace ui::web {

namespace {

constexpr std::string_view kHowToGetIn =
    "<!DOCTYPE html>\n<html><head><meta charset=\"utf-8\"><title>Norvo: access token "
    "needed</title></head>\n<body><h1>Access token needed</h1>\n<p>This Norvo shows its pages "
    "only to those who hold its access token. Open the address that Norvo printed when it "
    "started, which carries the token once (<code>/?token=...</code>); this browser then keeps "
    "it.</p></body></html>\n";

// The value of `key` in a query such as "a=1&token=x", and the query without it.
struct Found {
  std::optional<std::string_view> value;
  std::string rest;
};

Found takeQueryValue(std::string_view query, std::string_view key) {
  Found found;
  while (!query.empty()) {
    const std::size_t end = std::min(query.find('&'), query.size());
    const std::string_view pair = query.substr(0, end);
    query.remove_prefix(std::min(end + 1, query.size()));
    if (pair.size() > key.size() && pair.starts_with(key) && pair[key.size()] == '=') {
      found.value = pair.substr(key.size() + 1);
    } else if (!pair.empty()) {
      found.rest += (found.rest.empty() ? "" : "&") + std::string(pair);
    }
  }
  return found;
}

// The value of the cookie `name` among the request's Cookie headers.
std::optional<std::string_view> cookieValue(const Request& request, std::string_view name) {
  const auto [first, last] = request.equal_range(http::field::cookie);
  for (auto header = first; header != last; ++header) {
    std::string_view cookies = header->value();
    while (!cookies.empty()) {
      const std::size_t end = std::min(cookies.find(';'), cookies.size());
      std::string_view pair = cookies.substr(0, end);
      cookies.remove_prefix(std::min(end + 1, cookies.size()));
      while (pair.starts_with(' '))
        pair.remove_prefix(1);
      if (pair.size() > name.size() && pair.starts_with(name) && pair[name.size()] == '=')
        return pair.substr(name.size() + 1);
    }
  }
  return std::nullopt;
}

}  // namespace

Access::Access(std::string token, bool secure) : token_(std::move(token)), secure_(secure) {}

// Compares every byte whatever the first difference, so that the time taken tells nothing.
bool Access::matches(std::string_view candidate) const {
  if (candidate.size() != token_.size()) return false;
  unsigned char difference = 0;
  for (std::size_t i = 0; i < token_.size(); ++i)
    difference |= static_cast<unsigned char>(candidate[i] ^ token_[i]);
  return difference == 0;
}

std::optional<Response> Access::check(const Request& request) const {
  const std::string_view target = request.target();
  const std::size_t question = target.find('?');
  if (question != std::string_view::npos) {
    const Found given = takeQueryValue(target.substr(question + 1), kQueryKey);
    if (given.value && matches(*given.value)) {
      Response response = makeResponse(http::status::see_other, "text/plain", {}, request.version(),
                                       request.keep_alive());
      std::string location(target.substr(0, question));
      if (!given.rest.empty()) location += "?" + given.rest;
      response.set(http::field::location, location);
      response.set(http::field::set_cookie,
                   platform::format("%s=%s; HttpOnly; SameSite=Strict; Path=/%s", kCookieName,
                                    token_, secure_ ? "; Secure" : ""));
      return response;
    }
  }
  if (const auto cookie = cookieValue(request, kCookieName); cookie && matches(*cookie))
    return std::nullopt;
  return makeResponse(http::status::unauthorized, "text/html; charset=utf-8",
                      std::string(kHowToGetIn), request.version(), request.keep_alive());
}

std::string Access::makeToken() {
  std::ifstream random("/dev/urandom", std::ios::binary);
  unsigned char bytes[32];
  if (!random.read(reinterpret_cast<char*>(bytes), sizeof bytes))
    throw std::runtime_error("cannot read /dev/urandom to make an access token");
  std::string token;
  for (const unsigned char byte : bytes)
    token += platform::format("%02x", byte);
  return token;
}

std::optional<std::string> Access::readToken(std::string_view path) {
  std::ifstream file{std::string(path)};
  std::string token;
  if (!file || !std::getline(file, token)) return std::nullopt;
  while (!token.empty() && std::isspace(static_cast<unsigned char>(token.back())))
    token.pop_back();
  const bool plain = std::all_of(token.begin(), token.end(), [](char c) {
    return std::isalnum(static_cast<unsigned char>(c)) || c == '-' || c == '.' || c == '_' ||
           c == '~';
  });
  if (token.empty() || !plain) return std::nullopt;
  return token;
}

}  // namespace ui::web
