// The text form of values, as log lines and screens show them. Every metric logs its whole
// display dictionary, so the text is written in two passes: one that bounds its length from
// above and one that writes it into a buffer of that size, with no checks or growth on the way.
#include <algorithm>
#include <cstdint>
#include <cstring>
#include <type_traits>

#include "platform/NumberText.h"
#include "platform/Value.h"

namespace platform {

namespace {

// The longest text of a Null, boolean or number of each kind, in the order of Value::Kind.
constexpr std::size_t kScalarCapacity[] = {
    6,                       // (null)
    1,                       // 0 or 1
    11,                      // -2147483648
    10,                      // 4294967295
    kDecimalCapacity,        // int64
    kDecimalCapacity,        // uint64
    kShortestFloatCapacity,  // float
    kShortestFloatCapacity,  // double
};
// ", " between elements or entries, ": " after a key.
constexpr std::size_t kSeparatorLength = 2;

std::size_t quotedCapacity(std::string_view text) {
  // Every character might need a backslash.
  return 2 * text.size() + 2;
}

std::size_t capacityFor(const Value& value, bool nested);

std::size_t listCapacity(const List& list) {
  std::size_t capacity = 2;
  for (const Value& element : list)
    capacity += capacityFor(element, true) + kSeparatorLength;
  return capacity;
}

std::size_t dictionaryCapacity(const Dictionary& dictionary) {
  std::size_t capacity = 3;  // [:]
  for (const auto& [key, value] : dictionary) {
    capacity += quotedCapacity(key) + 2 * kSeparatorLength + capacityFor(value, true);
  }
  return capacity;
}

std::size_t capacityFor(const Value& value, bool nested) {
  if (value.kind() <= Value::Kind::Double) {
    return kScalarCapacity[static_cast<std::size_t>(value.kind())];
  }
  return value.visit([nested](const auto& stored) -> std::size_t {
    using Stored = std::decay_t<decltype(stored)>;
    if constexpr (std::is_same_v<Stored, std::string>) {
      return nested ? quotedCapacity(stored) : stored.size();
    } else if constexpr (std::is_same_v<Stored, Bytes>) {
      return hexLength(stored.size(), 4) + 2;
    } else if constexpr (std::is_same_v<Stored, List>) {
      return listCapacity(stored);
    } else if constexpr (std::is_same_v<Stored, Dictionary>) {
      return dictionaryCapacity(stored);
    } else {
      return 0;  // taken from the table above
    }
  });
}

bool isEscaped(char c) {
  return c == '"' || c == '\\';
}

bool holdsEscapedCharacter(std::uint64_t characters) {
  constexpr std::uint64_t kOnes = 0x0101010101010101;
  constexpr std::uint64_t kHighBits = 0x8080808080808080;
  const auto holdsByte = [characters](unsigned char byte) {
    const std::uint64_t zeroWhereEqual = characters ^ (kOnes * byte);
    return ((zeroWhereEqual - kOnes) & ~zeroWhereEqual & kHighBits) != 0;
  };
  return holdsByte('"') || holdsByte('\\');
}

// Whether quoting the text takes a backslash. Keys and enum names never do, so they are tested
// eight characters at a time, in words that may overlap, and then copied whole.
bool needsEscapes(std::string_view text) {
  const char* const at = text.data();
  const std::size_t size = text.size();
  if (size >= 8) {
    for (std::size_t word = 0; word + 8 <= size; word += 8) {
      if (holdsEscapedCharacter(detail::wordAt<std::uint64_t>(at + word))) return true;
    }
    return holdsEscapedCharacter(detail::wordAt<std::uint64_t>(at + size - 8));
  }
  if (size >= 4) {
    const std::uint64_t low = detail::wordAt<std::uint32_t>(at);
    const std::uint64_t high = detail::wordAt<std::uint32_t>(at + size - 4);
    return holdsEscapedCharacter(low | high << 32);
  }
  if (size > 0) {
    return isEscaped(at[0]) || isEscaped(at[size / 2]) || isEscaped(at[size - 1]);
  }
  return false;
}

// Writes at a position that the capacity pass has made room for.
class TextWriter {
 public:
  explicit TextWriter(char* at) : at_(at) {}

  char* end() const { return at_; }

  void value(const Value& value, bool nested) {
    value.visit([this, nested](const auto& stored) {
      using Stored = std::decay_t<decltype(stored)>;
      if constexpr (std::is_same_v<Stored, std::monostate>) {
        text("(null)");
      } else if constexpr (std::is_same_v<Stored, bool>) {
        *at_++ = stored ? '1' : '0';
      } else if constexpr (std::is_integral_v<Stored>) {
        at_ = writeDecimal(at_, stored);
      } else if constexpr (std::is_floating_point_v<Stored>) {
        at_ = writeShortestFloat(at_, stored);
      } else if constexpr (std::is_same_v<Stored, std::string>) {
        if (nested) {
          quoted(stored);
        } else {
          text(stored);
        }
      } else if constexpr (std::is_same_v<Stored, Bytes>) {
        *at_++ = '<';
        at_ = writeHex(at_, stored.data(), stored.size(), 4);
        *at_++ = '>';
      } else if constexpr (std::is_same_v<Stored, List>) {
        list(stored);
      } else {
        dictionary(stored);
      }
    });
  }

  void list(const List& list) {
    *at_++ = '[';
    for (std::size_t i = 0; i < list.size(); ++i) {
      if (i > 0) separator();
      value(list[i], true);
    }
    *at_++ = ']';
  }

  void dictionary(const Dictionary& dictionary) {
    if (dictionary.empty()) {
      text("[:]");
      return;
    }
    *at_++ = '[';
    bool first = true;
    for (const auto& [key, entry] : dictionary) {
      if (!first) separator();
      first = false;
      quoted(key);
      *at_++ = ':';
      *at_++ = ' ';
      value(entry, true);
    }
    *at_++ = ']';
  }

 private:
  void text(std::string_view text) {
    std::memcpy(at_, text.data(), text.size());
    at_ += text.size();
  }

  void separator() {
    *at_++ = ',';
    *at_++ = ' ';
  }

  void quoted(std::string_view text) {
    *at_++ = '"';
    if (!needsEscapes(text)) {
      this->text(text);
    } else {
      for (const char c : text) {
        if (isEscaped(c)) *at_++ = '\\';
        *at_++ = c;
      }
    }
    *at_++ = '"';
  }

  char* at_;
};

// Appends what write() writes, in one resize of `out`.
template <class Write>
void appendSized(std::string& out, std::size_t capacity, Write write) {
  const std::size_t start = out.size();
  out.resize(start + capacity);
  TextWriter writer(out.data() + start);
  write(writer);
  out.resize(static_cast<std::size_t>(writer.end() - out.data()));
}

}  // namespace

void appendDescription(std::string& out, const Value& value) {
  appendSized(out, capacityFor(value, false),
              [&value](TextWriter& writer) { writer.value(value, false); });
}

void appendDescription(std::string& out, const Dictionary& dictionary) {
  appendSized(out, dictionaryCapacity(dictionary),
              [&dictionary](TextWriter& writer) { writer.dictionary(dictionary); });
}

std::string Value::description() const {
  std::string out;
  appendDescription(out, *this);
  return out;
}

std::string Dictionary::description() const {
  std::string out;
  appendDescription(out, *this);
  return out;
}

std::string description(const List& list) {
  std::string out;
  appendSized(out, listCapacity(list), [&list](TextWriter& writer) { writer.list(list); });
  return out;
}

}  // namespace platform
