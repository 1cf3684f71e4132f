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

void appendHexByte(std::string& out, unsigned char byte) {
  static constexpr char kDigits[] = "0123456789abcdef";
  out += kDigits[byte >> 4];
  out += kDigits[byte & 0xF];
}

}  // namespace platform
