// The text form of values, as log lines and screens show them.
#include <type_traits>

#include "platform/NumberText.h"
#include "platform/Value.h"

namespace platform {

namespace {

void appendDescription(std::string& out, const Value& value, bool nested);

void appendQuoted(std::string& out, std::string_view text) {
  out += '"';
  // Runs without quotes or backslashes go in whole: log lines quote many keys.
  std::size_t run = 0;
  for (std::size_t i = 0; i < text.size(); ++i) {
    if (text[i] != '"' && text[i] != '\\') continue;
    out.append(text.substr(run, i - run));
    out += '\\';
    run = i;
  }
  out.append(text.substr(run));
  out += '"';
}

void appendBytes(std::string& out, const Bytes& bytes) {
  out += '<';
  appendHex(out, bytes.data(), bytes.size(), 4);
  out += '>';
}

void appendList(std::string& out, const List& list) {
  out += '[';
  for (std::size_t i = 0; i < list.size(); ++i) {
    if (i > 0) out += ", ";
    appendDescription(out, list[i], true);
  }
  out += ']';
}

void appendDictionary(std::string& out, const Dictionary& dictionary) {
  if (dictionary.empty()) {
    out += "[:]";
    return;
  }
  out += '[';
  bool first = true;
  for (const auto& [key, value] : dictionary) {
    if (!first) out += ", ";
    first = false;
    appendQuoted(out, key);
    out += ": ";
    appendDescription(out, value, true);
  }
  out += ']';
}

void appendDescription(std::string& out, const Value& value, bool nested) {
  value.visit([&out, nested](const auto& stored) {
    using Stored = std::decay_t<decltype(stored)>;
    if constexpr (std::is_same_v<Stored, std::monostate>) {
      out += "(null)";
    } else if constexpr (std::is_same_v<Stored, bool>) {
      out += stored ? '1' : '0';
    } else if constexpr (std::is_integral_v<Stored>) {
      appendDecimal(out, stored);
    } else if constexpr (std::is_floating_point_v<Stored>) {
      appendShortestFloat(out, stored);
    } else if constexpr (std::is_same_v<Stored, std::string>) {
      if (nested) {
        appendQuoted(out, stored);
      } else {
        out += stored;
      }
    } else if constexpr (std::is_same_v<Stored, Bytes>) {
      appendBytes(out, stored);
    } else if constexpr (std::is_same_v<Stored, List>) {
      appendList(out, stored);
    } else {
      appendDictionary(out, stored);
    }
  });
}

}  // namespace

std::string Value::description() const {
  std::string out;
  appendDescription(out, *this, false);
  return out;
}

std::string Dictionary::description() const {
  std::string out;
  appendDictionary(out, *this);
  return out;
}

std::string description(const List& list) {
  std::string out;
  appendList(out, list);
  return out;
}

}  // namespace platform
