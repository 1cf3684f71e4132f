#include "platform/Base64.h"

#include <array>
#include <cstdint>

namespace platform {

namespace {

constexpr std::string_view kAlphabet =
    "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/";
constexpr std::uint8_t kNotInAlphabet = 0xFF;

constexpr std::array<std::uint8_t, 256> makeSextets() {
  std::array<std::uint8_t, 256> sextets{};
  sextets.fill(kNotInAlphabet);
  for (std::size_t i = 0; i < kAlphabet.size(); ++i) {
    sextets[static_cast<unsigned char>(kAlphabet[i])] = static_cast<std::uint8_t>(i);
  }
  return sextets;
}
constexpr std::array<std::uint8_t, 256> kSextets = makeSextets();

}  // namespace

std::string base64Encode(const Bytes& bytes) {
  std::string text;
  text.reserve((bytes.size() + 2) / 3 * 4);
  std::size_t i = 0;
  for (; i + 3 <= bytes.size(); i += 3) {
    const std::uint32_t group = std::uint32_t{bytes[i]} << 16 | std::uint32_t{bytes[i + 1]} << 8 |
                                std::uint32_t{bytes[i + 2]};
    for (int shift = 18; shift >= 0; shift -= 6)
      text += kAlphabet[group >> shift & 0x3F];
  }
  const std::size_t rest = bytes.size() - i;
  if (rest > 0) {
    std::uint32_t group = std::uint32_t{bytes[i]} << 16;
    if (rest == 2) group |= std::uint32_t{bytes[i + 1]} << 8;
    text += kAlphabet[group >> 18 & 0x3F];
    text += kAlphabet[group >> 12 & 0x3F];
    text += rest == 2 ? kAlphabet[group >> 6 & 0x3F] : '=';
    text += '=';
  }
  return text;
}

std::optional<Bytes> base64Decode(std::string_view text) {
  if (text.size() % 4 != 0) return std::nullopt;
  std::size_t padding = 0;
  if (!text.empty() && text.back() == '=') padding = text[text.size() - 2] == '=' ? 2 : 1;
  const std::size_t symbols = text.size() - padding;

  // Whole groups of four symbols make three bytes; a last group of two or three makes one or
  // two, its spare low bits dropped.
  Bytes bytes(symbols * 6 / 8);
  const auto sextet = [&text](std::size_t i) -> std::uint32_t {
    return kSextets[static_cast<unsigned char>(text[i])];
  };
  std::size_t i = 0;
  std::size_t out = 0;
  for (; i + 4 <= symbols; i += 4) {
    const std::uint32_t a = sextet(i), b = sextet(i + 1), c = sextet(i + 2), d = sextet(i + 3);
    if (((a | b | c | d) & ~0x3Fu) != 0) return std::nullopt;
    const std::uint32_t group = a << 18 | b << 12 | c << 6 | d;
    bytes[out++] = static_cast<std::uint8_t>(group >> 16);
    bytes[out++] = static_cast<std::uint8_t>(group >> 8);
    bytes[out++] = static_cast<std::uint8_t>(group);
  }
  std::uint32_t group = 0;
  for (std::size_t rest = i; rest < symbols; ++rest) {
    if ((sextet(rest) & ~0x3Fu) != 0) return std::nullopt;
    group = group << 6 | sextet(rest);
  }
  if (symbols - i == 2) bytes[out] = static_cast<std::uint8_t>(group >> 4);
  if (symbols - i == 3) {
    bytes[out] = static_cast<std::uint8_t>(group >> 10);
    bytes[out + 1] = static_cast<std::uint8_t>(group >> 2);
  }
  return bytes;
}

}  // namespace platform
