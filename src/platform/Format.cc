#include "platform/Format.h"

#include <algorithm>
#include <charconv>
#include <cmath>
#include <optional>
#include <type_traits>

#include "platform/NumberText.h"

namespace platform::format_detail {

namespace {

// Widths and precisions beyond this are taken as this; no log line needs more.
constexpr std::size_t kLargestWidth = 4096;

struct Conversion {
  bool leftAlign = false;
  bool zeroPad = false;
  bool spaceSign = false;
  bool plusSign = false;
  bool alternate = false;
  std::size_t width = 0;
  std::optional<std::size_t> precision;
  char letter = 0;
};

struct ParsedConversion {
  Conversion conversion;
  std::size_t length;
};

enum class Family { Integer, Floating, Text, Unknown };

Family familyOf(char letter) {
  switch (letter) {
    case 'd':
    case 'i':
    case 'u':
    case 'x':
    case 'X':
    case 'o':
    case 'c':
      return Family::Integer;
    case 'f':
    case 'F':
    case 'e':
    case 'E':
    case 'g':
    case 'G':
      return Family::Floating;
    case 's':
    case '@':
      return Family::Text;
    default:
      return Family::Unknown;
  }
}

std::size_t parseNumber(std::string_view text, std::size_t& position) {
  std::size_t number = 0;
  while (position < text.size() && text[position] >= '0' && text[position] <= '9') {
    number = std::min(number * 10 + static_cast<std::size_t>(text[position] - '0'), kLargestWidth);
    ++position;
  }
  return number;
}

// Parses what follows a '%'; nothing when the text ends before the conversion letter.
std::optional<ParsedConversion> parseConversion(std::string_view text) {
  Conversion conversion;
  std::size_t position = 0;
  for (; position < text.size(); ++position) {
    const char flag = text[position];
    if (flag == '-') {
      conversion.leftAlign = true;
    } else if (flag == '0') {
      conversion.zeroPad = true;
    } else if (flag == ' ') {
      conversion.spaceSign = true;
    } else if (flag == '+') {
      conversion.plusSign = true;
    } else if (flag == '#') {
      conversion.alternate = true;
    } else {
      break;
    }
  }
  conversion.width = parseNumber(text, position);
  if (position < text.size() && text[position] == '.') {
    ++position;
    conversion.precision = parseNumber(text, position);
  }
  while (position < text.size() &&
         std::string_view("hlztjLq").find(text[position]) != std::string_view::npos) {
    ++position;
  }
  if (position == text.size()) return std::nullopt;
  conversion.letter = text[position];
  return ParsedConversion{conversion, position + 1};
}

// A converted argument: sign or base prefix, zeros demanded by the precision, then the body.
struct Pieces {
  std::string_view prefix{};
  std::size_t zeros = 0;
  std::string_view body{};
};

void appendPadded(std::string& out, const Conversion& conversion, const Pieces& pieces,
                  bool zeroPadAllowed) {
  const std::size_t length = pieces.prefix.size() + pieces.zeros + pieces.body.size();
  const std::size_t fill = conversion.width > length ? conversion.width - length : 0;
  if (conversion.leftAlign) {
    out += pieces.prefix;
    out.append(pieces.zeros, '0');
    out += pieces.body;
    out.append(fill, ' ');
  } else if (conversion.zeroPad && zeroPadAllowed) {
    out += pieces.prefix;
    out.append(fill + pieces.zeros, '0');
    out += pieces.body;
  } else {
    out.append(fill, ' ');
    out += pieces.prefix;
    out.append(pieces.zeros, '0');
    out += pieces.body;
  }
}

std::string_view signFor(const Conversion& conversion, bool negative) {
  if (negative) return "-";
  if (conversion.plusSign) return "+";
  if (conversion.spaceSign) return " ";
  return "";
}

void uppercase(char* first, char* last) {
  std::transform(first, last, first, [](char c) {
    return c >= 'a' && c <= 'z' ? static_cast<char>(c - 'a' + 'A') : c;
  });
}

void appendInteger(std::string& out, const Conversion& conversion, const Integer& integer) {
  const char letter = conversion.letter;
  if (letter == 'c') {
    const char character = static_cast<char>(integer.bits & 0xFF);
    appendPadded(out, conversion, {.body = std::string_view(&character, 1)}, false);
    return;
  }
  const bool isDecimal = letter == 'd' || letter == 'i';
  const bool negative =
      isDecimal && integer.isSigned && static_cast<std::int64_t>(integer.bits) < 0;
  std::uint64_t magnitude = integer.bits;
  if (negative) {
    magnitude = 0 - integer.bits;
  } else if (integer.width < 64) {
    magnitude &= (std::uint64_t{1} << integer.width) - 1;
  }

  const int base = letter == 'x' || letter == 'X' ? 16 : letter == 'o' ? 8 : 10;
  char digits[24];
  char* const last = std::to_chars(digits, digits + sizeof digits, magnitude, base).ptr;
  if (letter == 'X') uppercase(digits, last);

  Pieces pieces{.prefix = isDecimal ? signFor(conversion, negative) : "",
                .body = std::string_view(digits, static_cast<std::size_t>(last - digits))};
  if (conversion.precision) {
    if (*conversion.precision == 0 && magnitude == 0) pieces.body = {};
    pieces.zeros = *conversion.precision - std::min(*conversion.precision, pieces.body.size());
  }
  if (conversion.alternate && magnitude != 0 && base == 16) {
    pieces.prefix = letter == 'x' ? "0x" : "0X";
  }
  if (conversion.alternate && base == 8 && pieces.zeros == 0 &&
      (pieces.body.empty() || pieces.body.front() != '0')) {
    pieces.zeros = 1;
  }
  appendPadded(out, conversion, pieces, !conversion.precision);
}

void appendFloating(std::string& out, const Conversion& conversion, double value) {
  const char letter = conversion.letter;
  const std::chars_format style = letter == 'f' || letter == 'F'   ? std::chars_format::fixed
                                  : letter == 'e' || letter == 'E' ? std::chars_format::scientific
                                                                   : std::chars_format::general;
  const int precision = static_cast<int>(conversion.precision.value_or(6));
  // Room for the 309 integer digits of the largest double in fixed notation, and the fraction.
  std::string text(320 + static_cast<std::size_t>(precision), '\0');
  char* const first = text.data();
  char* const last = std::to_chars(first, first + text.size(), value, style, precision).ptr;
  if (letter == 'F' || letter == 'E' || letter == 'G') uppercase(first, last);

  std::string_view body(first, static_cast<std::size_t>(last - first));
  const bool negative = body.front() == '-';
  if (negative) body.remove_prefix(1);
  appendPadded(out, conversion, {.prefix = signFor(conversion, negative), .body = body},
               std::isfinite(value));
}

void appendText(std::string& out, const Conversion& conversion, std::string_view text) {
  if (conversion.precision) text = text.substr(0, *conversion.precision);
  appendPadded(out, conversion, {.body = text}, false);
}

std::optional<Integer> integerIn(const Argument& argument) {
  if (const auto* integer = std::get_if<Integer>(&argument)) return *integer;
  if (const auto* value = std::get_if<const Value*>(&argument)) {
    return (*value)->visit([](const auto& stored) -> std::optional<Integer> {
      if constexpr (std::is_integral_v<std::decay_t<decltype(stored)>>) {
        return std::get<Integer>(makeArgument(stored));
      } else {
        return std::nullopt;
      }
    });
  }
  return std::nullopt;
}

std::optional<double> floatingIn(const Argument& argument) {
  if (const auto* floating = std::get_if<double>(&argument)) return *floating;
  if (const auto* value = std::get_if<const Value*>(&argument)) {
    return (*value)->visit([](const auto& stored) -> std::optional<double> {
      if constexpr (std::is_floating_point_v<std::decay_t<decltype(stored)>>) {
        return stored;
      } else {
        return std::nullopt;
      }
    });
  }
  return std::nullopt;
}

void appendMismatch(std::string& out, char letter, const Argument& argument) {
  out += "%!";
  out += letter;
  out += '(';
  std::visit(
      [&out](const auto& held) {
        using Held = std::decay_t<decltype(held)>;
        if constexpr (std::is_same_v<Held, Integer>) {
          out += "integer=";
          if (held.isSigned) {
            appendDecimal(out, static_cast<std::int64_t>(held.bits));
          } else {
            appendDecimal(out, held.bits);
          }
        } else if constexpr (std::is_same_v<Held, double>) {
          out += "float=";
          appendShortestFloat(out, held);
        } else if constexpr (std::is_same_v<Held, std::string_view>) {
          out += "string=";
          out += held;
        } else if constexpr (std::is_same_v<Held, const Value*>) {
          out += "value=";
          out += held->description();
        } else {
          out += "object=";
          out += held.describe(held.object);
        }
      },
      argument);
  out += ')';
}

// Appends one argument, or answers false when it does not suit the conversion.
bool appendArgument(std::string& out, const Conversion& conversion, const Argument& argument) {
  switch (familyOf(conversion.letter)) {
    case Family::Integer:
      if (const std::optional<Integer> integer = integerIn(argument)) {
        appendInteger(out, conversion, *integer);
        return true;
      }
      return false;
    case Family::Floating:
      if (const std::optional<double> floating = floatingIn(argument)) {
        appendFloating(out, conversion, *floating);
        return true;
      }
      return false;
    case Family::Text:
      if (const auto* text = std::get_if<std::string_view>(&argument)) {
        appendText(out, conversion, *text);
      } else if (const auto* value = std::get_if<const Value*>(&argument)) {
        appendText(out, conversion, (*value)->description());
      } else if (const auto* described = std::get_if<Described>(&argument)) {
        appendText(out, conversion, described->describe(described->object));
      } else {
        return false;
      }
      return true;
    case Family::Unknown:
      break;
  }
  return false;
}

}  // namespace

std::string formatArguments(std::string_view pattern, std::span<const Argument> arguments) {
  std::string out;
  out.reserve(pattern.size() + 16 * arguments.size());
  std::size_t nextArgument = 0;
  while (!pattern.empty()) {
    const std::size_t percent = pattern.find('%');
    out += pattern.substr(0, percent);
    if (percent == std::string_view::npos) break;
    pattern.remove_prefix(percent + 1);

    const std::optional<ParsedConversion> parsed = parseConversion(pattern);
    if (!parsed) {
      out += "%!(incomplete)";
      break;
    }
    pattern.remove_prefix(parsed->length);
    const Conversion& conversion = parsed->conversion;
    const char letter = conversion.letter;
    if (letter == '%') {
      out += '%';
    } else if (familyOf(letter) == Family::Unknown) {
      out += "%!";
      out += letter;
      out += "(unknown)";
    } else if (nextArgument == arguments.size()) {
      out += "%!";
      out += letter;
      out += "(missing)";
    } else {
      const Argument& argument = arguments[nextArgument++];
      if (!appendArgument(out, conversion, argument)) appendMismatch(out, letter, argument);
    }
  }
  return out;
}

}  // namespace platform::format_detail
