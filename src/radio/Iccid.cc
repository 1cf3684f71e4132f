#include "radio/Iccid.h"

#include "radio/Bcd.h"

namespace radio {
namespace {

constexpr std::size_t kShortestIccid = 19;

bool isIccidLength(std::size_t length) {
  return length == kShortestIccid || length == 2 * kEfIccidSize;
}

}  // namespace

std::optional<std::string> decodeEfIccid(std::span<const std::uint8_t> bytes) {
  if (bytes.size() != kEfIccidSize) return std::nullopt;
  std::optional<std::string> digits = decodeSwappedBcd(bytes);
  if (!digits || !isIccidLength(digits->size())) return std::nullopt;
  return digits;
}

std::optional<platform::Bytes> encodeEfIccid(std::string_view iccid) {
  if (!isIccidLength(iccid.size())) return std::nullopt;
  return encodeSwappedBcd(iccid, kEfIccidSize);
}

}  // namespace radio
