#include "platform/Utf8.h"

#include <cstdint>

namespace platform {

namespace {

struct LeadByte {
  std::size_t length;
  std::uint8_t secondLow;  // the second byte's range is narrower after some lead bytes
  std::uint8_t secondHigh;
};

// Well-formed byte sequences as the Unicode standard tabulates them: no overlong forms, no
// surrogates, nothing above U+10FFFF.
LeadByte classify(std::uint8_t lead) {
  if (lead < 0x80) return {1, 0, 0};
  if (lead >= 0xC2 && lead <= 0xDF) return {2, 0x80, 0xBF};
  if (lead == 0xE0) return {3, 0xA0, 0xBF};
  if (lead == 0xED) return {3, 0x80, 0x9F};
  if (lead >= 0xE1 && lead <= 0xEF) return {3, 0x80, 0xBF};
  if (lead == 0xF0) return {4, 0x90, 0xBF};
  if (lead >= 0xF1 && lead <= 0xF3) return {4, 0x80, 0xBF};
  if (lead == 0xF4) return {4, 0x80, 0x8F};
  return {0, 0, 0};
}

std::uint8_t byteAt(std::string_view text, std::size_t index) {
  return static_cast<std::uint8_t>(text[index]);
}

}  // namespace

Utf8Sequence nextUtf8Sequence(std::string_view text) {
  const LeadByte lead = classify(byteAt(text, 0));
  if (lead.length == 0) return {1, false};
  if (lead.length == 1) return {1, true};
  if (text.size() < 2 || byteAt(text, 1) < lead.secondLow || byteAt(text, 1) > lead.secondHigh) {
    return {1, false};
  }
  for (std::size_t i = 2; i < lead.length; ++i) {
    if (i >= text.size() || byteAt(text, i) < 0x80 || byteAt(text, i) > 0xBF) return {i, false};
  }
  return {lead.length, true};
}

}  // namespace platform
