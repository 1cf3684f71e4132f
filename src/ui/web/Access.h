#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "ui/web/Http.h"

namespace ui::web {

// Who may look when the pages are shown beyond this machine: whoever holds the secret token. A
// browser brings it once in the address (/?token=...); the answer sets a cookie that carries it
// from then on (HttpOnly, so scripts cannot read it; SameSite=Strict, so other sites cannot send
// it; Secure too when the pages are served over HTTPS, so that it never travels in the clear) and
// sends the browser on to the same address without the token, out of its history.
class Access {
 public:
  static constexpr std::string_view kQueryKey = "token";
  static constexpr std::string_view kCookieName = "norvo_token";

  // `token` is not empty. `secure`: the pages are served over HTTPS.
  explicit Access(std::string token, bool secure = false);

  // Empty when `request` may have its answer. Otherwise the answer instead: a redirect that sets
  // the cookie, or 401 with a short page that says how to get in.
  std::optional<Response> check(const Request& request) const;

  // 32 random bytes from the system's source, as hexadecimal text. Throws std::runtime_error
  // when there is no such source.
  static std::string makeToken();

  // The token in the file at `path`: its first line, which may hold only what an address and a
  // cookie carry as they are; empty when it holds anything else, as kTokenFileRule says.
  static std::optional<std::string> readToken(std::string_view path);
  static constexpr std::string_view kTokenFileRule =
      "the file's first line must hold the token, made of letters, digits and - . _ ~";

 private:
  bool matches(std::string_view candidate) const;

  const std::string token_;
  const bool secure_;
};

}  // namespace ui::web
