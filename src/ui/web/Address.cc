#include "ui/web/Address.h"

#include <cstdint>

namespace ui::web {

namespace {

std::optional<int> hexDigit(char c) {
  if (c >= '0' && c <= '9') return c - '0';
  if (c >= 'a' && c <= 'f') return c - 'a' + 10;
  if (c >= 'A' && c <= 'F') return c - 'A' + 10;
  return std::nullopt;
}

// Percent escapes decoded; in a query, '+' also stands for a space.
std::optional<std::string> decodeComponent(std::string_view component, bool plusIsSpace) {
  std::string text;
  text.reserve(component.size());
  for (std::size_t i = 0; i < component.size(); ++i) {
    if (component[i] != '%') {
      text += plusIsSpace && component[i] == '+' ? ' ' : component[i];
      continue;
    }
    if (i + 2 >= component.size()) return std::nullopt;
    const auto high = hexDigit(component[i + 1]);
    const auto low = hexDigit(component[i + 2]);
    if (!high || !low) return std::nullopt;
    text += static_cast<char>(*high * 16 + *low);
    i += 2;
  }
  return text;
}

std::optional<std::string> decodeSegment(std::string_view segment) {
  if (segment.empty()) return std::nullopt;
  return decodeComponent(segment, false);
}

bool isUnreserved(unsigned char c) {
  return (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z') || (c >= '0' && c <= '9') || c == '-' ||
         c == '.' || c == '_' || c == '~';
}

void appendEncoded(std::string& out, std::string_view text) {
  static constexpr char kHex[] = "0123456789ABCDEF";
  for (const char c : text) {
    const auto byte = static_cast<unsigned char>(c);
    if (isUnreserved(byte)) {
      out += c;
    } else {
      out += '%';
      out += kHex[byte >> 4];
      out += kHex[byte & 0xF];
    }
  }
}

}  // namespace

std::optional<Path> decodePath(std::string_view path) {
  if (path.empty() || path.front() != '/') return std::nullopt;
  Path segments;
  if (path == "/") return segments;
  if (path.ends_with('/')) path.remove_suffix(1);
  std::size_t start = 1;
  while (true) {
    const std::size_t end = path.find('/', start);
    auto segment = decodeSegment(path.substr(start, end - start));
    if (!segment) return std::nullopt;
    segments.push_back(std::move(*segment));
    if (end == std::string_view::npos) return segments;
    start = end + 1;
  }
}

std::optional<QueryParameters> decodeQuery(std::string_view query) {
  QueryParameters parameters;
  while (!query.empty()) {
    const std::size_t end = query.find('&');
    const std::string_view pair = query.substr(0, end);
    query = end == std::string_view::npos ? std::string_view() : query.substr(end + 1);
    if (pair.empty()) continue;
    const std::size_t equals = pair.find('=');
    auto name = decodeComponent(pair.substr(0, equals), true);
    auto value = decodeComponent(
        equals == std::string_view::npos ? std::string_view() : pair.substr(equals + 1), true);
    if (!name || !value) return std::nullopt;
    parameters.insert_or_assign(std::move(*name), std::move(*value));
  }
  return parameters;
}

std::string encodePath(const Path& path) {
  if (path.empty()) return "/";
  std::string address;
  for (const std::string& segment : path) {
    address += '/';
    appendEncoded(address, segment);
  }
  return address;
}

std::string appendToAddress(std::string_view parentAddress, std::string_view rowText) {
  std::string address(parentAddress);
  if (address.empty() || address.back() != '/') address += '/';
  appendEncoded(address, rowText);
  return address;
}

}  // namespace ui::web
