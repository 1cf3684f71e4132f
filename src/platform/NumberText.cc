#include "platform/NumberText.h"

#include <algorithm>
#include <cmath>
#include <string_view>

namespace platform {

namespace {

template <std::floating_point F>
char* writeShortest(char* at, F value) {
  if (std::isnan(value)) {
    constexpr std::string_view nan = "nan";
    return std::copy(nan.begin(), nan.end(), at);
  }
  // Two places stay free for the fractional part.
  char* const end = std::to_chars(at, at + kShortestFloatCapacity - 2, value).ptr;
  if (!std::isfinite(value) ||
      std::string_view(at, end).find_first_of(".e") != std::string_view::npos) {
    return end;
  }
  end[0] = '.';
  end[1] = '0';
  return end + 2;
}

constexpr char kHexDigits[] = "0123456789abcdef";

}  // namespace

char* writeShortestFloat(char* at, float value) {
  return writeShortest(at, value);
}
char* writeShortestFloat(char* at, double value) {
  return writeShortest(at, value);
}

void appendHexByte(std::string& out, unsigned char byte) {
  out += kHexDigits[byte >> 4];
  out += kHexDigits[byte & 0xF];
}

char* writeHex(char* at, const std::uint8_t* bytes, std::size_t size, std::size_t group) {
  for (std::size_t i = 0; i < size; ++i) {
    if (group != 0 && i > 0 && i % group == 0) *at++ = ' ';
    *at++ = kHexDigits[bytes[i] >> 4];
    *at++ = kHexDigits[bytes[i] & 0xF];
  }
  return at;
}

void appendHex(std::string& out, const std::uint8_t* bytes, std::size_t size, std::size_t group) {
  const std::size_t at = out.size();
  out.resize(at + hexLength(size, group));
  writeHex(out.data() + at, bytes, size, group);
}

}  // namespace platform
