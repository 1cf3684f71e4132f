#include "platform/Json.h"

#include <cmath>
#include <type_traits>

#include "platform/NumberText.h"
#include "platform/Utf8.h"

namespace platform {

namespace {

constexpr std::string_view kReplacementCharacter = "\xEF\xBF\xBD";

void appendValue(std::string& out, const Value& value);

// Printable ASCII other than the quote and the backslash goes out as it is.
bool isPlainAscii(char c) {
  const auto byte = static_cast<unsigned char>(c);
  return byte >= 0x20 && byte < 0x80 && c != '"' && c != '\\';
}

void appendString(std::string& out, std::string_view text) {
  out += '"';
  while (!text.empty()) {
    std::size_t plain = 0;
    while (plain < text.size() && isPlainAscii(text[plain]))
      ++plain;
    out.append(text.substr(0, plain));
    text.remove_prefix(plain);
    if (text.empty()) break;
    const char c = text.front();
    if (c == '"' || c == '\\') {
      out += '\\';
      out += c;
      text.remove_prefix(1);
    } else if (static_cast<unsigned char>(c) < 0x20) {
      out += "\\u00";
      appendHexByte(out, static_cast<unsigned char>(c));
      text.remove_prefix(1);
    } else {
      const Utf8Sequence sequence = nextUtf8Sequence(text);
      if (sequence.wellFormed) {
        out += text.substr(0, sequence.length);
      } else {
        out += kReplacementCharacter;
      }
      text.remove_prefix(sequence.length);
    }
  }
  out += '"';
}

void appendList(std::string& out, const List& list) {
  out += '[';
  for (std::size_t i = 0; i < list.size(); ++i) {
    if (i > 0) out += ',';
    appendValue(out, list[i]);
  }
  out += ']';
}

void appendDictionary(std::string& out, const Dictionary& dictionary) {
  out += '{';
  bool first = true;
  for (const auto& [key, value] : dictionary) {
    if (!first) out += ',';
    first = false;
    appendString(out, key);
    out += ':';
    appendValue(out, value);
  }
  out += '}';
}

void appendValue(std::string& out, const Value& value) {
  value.visit([&out](const auto& stored) {
    using Stored = std::decay_t<decltype(stored)>;
    if constexpr (std::is_same_v<Stored, std::monostate>) {
      out += "null";
    } else if constexpr (std::is_same_v<Stored, bool>) {
      out += stored ? "true" : "false";
    } else if constexpr (std::is_integral_v<Stored>) {
      appendDecimal(out, stored);
    } else if constexpr (std::is_floating_point_v<Stored>) {
      if (std::isfinite(stored)) {
        appendShortestFloat(out, stored);
      } else {
        out += "null";
      }
    } else if constexpr (std::is_same_v<Stored, std::string>) {
      appendString(out, stored);
    } else if constexpr (std::is_same_v<Stored, Bytes>) {
      out += '"';
      appendHex(out, stored.data(), stored.size(), 0);
      out += '"';
    } else if constexpr (std::is_same_v<Stored, List>) {
      appendList(out, stored);
    } else {
      appendDictionary(out, stored);
    }
  });
}

}  // namespace

void appendJson(std::string& out, const Value& value) {
  appendValue(out, value);
}

void appendJson(std::string& out, const Dictionary& dictionary) {
  appendDictionary(out, dictionary);
}

std::string toJson(const Value& value) {
  std::string out;
  appendValue(out, value);
  return out;
}

std::string toJson(const List& list) {
  std::string out;
  appendList(out, list);
  return out;
}

std::string toJson(const Dictionary& dictionary) {
  std::string out;
  appendDictionary(out, dictionary);
  return out;
}

}  // namespace platform
