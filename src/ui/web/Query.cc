#include "ui/web/Query.h"

#include <charconv>

namespace ui::web {

namespace {

std::optional<std::string> decodeComponent(std::string_view text) {
  std::string decoded;
  decoded.reserve(text.size());
  for (std::size_t i = 0; i < text.size(); ++i) {
    if (text[i] == '+') {
      decoded += ' ';
    } else if (text[i] != '%') {
      decoded += text[i];
    } else {
      unsigned byte = 0;
      if (i + 2 >= text.size()) return std::nullopt;
      const char* first = text.data() + i + 1;
      const auto [end, error] = std::from_chars(first, first + 2, byte, 16);
      if (error != std::errc() || end != first + 2) return std::nullopt;
      decoded += static_cast<char>(byte);
      i += 2;
    }
  }
  return decoded;
}

}  // namespace

std::optional<QueryParameters> parseQuery(std::string_view target) {
  QueryParameters parameters;
  const std::size_t mark = target.find('?');
  if (mark == std::string_view::npos) return parameters;
  std::string_view rest = target.substr(mark + 1);
  while (!rest.empty()) {
    const std::size_t amp = rest.find('&');
    const std::string_view pair = rest.substr(0, amp);
    rest = amp == std::string_view::npos ? std::string_view() : rest.substr(amp + 1);
    if (pair.empty()) continue;
    const std::size_t equals = pair.find('=');
    auto name = decodeComponent(pair.substr(0, equals));
    auto value = decodeComponent(equals == std::string_view::npos ? std::string_view()
                                                                  : pair.substr(equals + 1));
    if (!name || !value) return std::nullopt;
    parameters.emplace_back(std::move(*name), std::move(*value));
  }
  return parameters;
}

std::optional<std::string_view> queryValue(const QueryParameters& parameters,
                                           std::string_view name) {
  std::optional<std::string_view> found;
  for (const auto& [key, value] : parameters)
    if (key == name) found = value;
  return found;
}

}  // namespace ui::web
