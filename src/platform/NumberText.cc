#include "platform/NumberText.h"

#include <cmath>

namespace platform {

namespace {

template <std::floating_point F>
void appendShortest(std::string& out, F value) {
  if (std::isnan(value)) {
    out += "nan";
    return;
  }
  char text[64];
  const auto result = std::to_chars(text, text + sizeof text, value);
  const std::string_view written(text, static_cast<std::size_t>(result.ptr - text));
  out += written;
  if (std::isfinite(value) && written.find_first_of(".e") == std::string_view::npos) out += ".0";
}

}  // namespace

void appendShortestFloat(std::string& out, float value) {
  appendShortest(out, value);
}
void appendShortestFloat(std::string& out, double value) {
  appendShortest(out, value);
}

namespace {
constexpr char kHexDigits[] = "0123456789abcdef";
}  // namespace

void appendHexByte(std::string& out, unsigned char byte) {
  out += kHexDigits[byte >> 4];
  out += kHexDigits[byte & 0xF];
}

void appendHex(std::string& out, const std::uint8_t* bytes, std::size_t size, std::size_t group) {
  if (size == 0) return;
  const std::size_t spaces = group == 0 ? 0 : (size - 1) / group;
  std::size_t at = out.size();
  out.resize(at + 2 * size + spaces);
  for (std::size_t i = 0; i < size; ++i) {
    if (group != 0 && i > 0 && i % group == 0) out[at++] = ' ';
    out[at++] = kHexDigits[bytes[i] >> 4];
    out[at++] = kHexDigits[bytes[i] & 0xF];
  }
}

}  // namespace platform
