#include "radio/Plmn.h"

#include "radio/Bcd.h"

namespace radio {
namespace {

bool isMncLength(std::size_t length) {
  return length == kShortMncLength || length == kLongMncLength;
}

std::uint8_t digitAt(std::string_view digits, std::size_t index) {
  return static_cast<std::uint8_t>(digits[index] - '0');
}

std::uint8_t pair(std::uint8_t high, std::uint8_t low) {
  return static_cast<std::uint8_t>(high << 4 | low);
}

std::uint8_t low(std::uint8_t byte) {
  return byte & 0x0F;
}

std::uint8_t high(std::uint8_t byte) {
  return static_cast<std::uint8_t>(byte >> 4);
}

// `number` as exactly `length` digits with leading zeros, or empty when it needs more.
std::optional<std::string> paddedDigits(std::uint32_t number, std::size_t length) {
  std::string digits(length, '0');
  for (std::size_t index = length; index-- > 0; number /= 10) {
    digits[index] = static_cast<char>('0' + number % 10);
  }
  if (number != 0) return std::nullopt;
  return digits;
}

}  // namespace

std::optional<Plmn> makePlmn(std::string_view mcc, std::string_view mnc) {
  if (mcc.size() != kMccLength || !isMncLength(mnc.size()) || !isDigits(mcc) || !isDigits(mnc)) {
    return std::nullopt;
  }
  return Plmn{std::string(mcc), std::string(mnc)};
}

std::optional<Plmn> decodePlmn(std::span<const std::uint8_t> bytes) {
  if (bytes.size() != kPlmnSize) return std::nullopt;
  // The nibbles in digit order: MCC 1, 2, 3, then MNC 1, 2 and 3.
  const std::uint8_t reordered[kPlmnSize] = {bytes[0], pair(low(bytes[2]), low(bytes[1])),
                                             pair(high(bytes[1]), high(bytes[2]))};
  const std::optional<std::string> digits = decodeSwappedBcd(reordered);
  if (!digits || digits->size() < kMccLength) return std::nullopt;
  return makePlmn(std::string_view(*digits).substr(0, kMccLength),
                  std::string_view(*digits).substr(kMccLength));
}

std::optional<PlmnBytes> encodePlmn(const Plmn& plmn) {
  if (!makePlmn(plmn.mcc, plmn.mnc)) return std::nullopt;
  const std::uint8_t mncDigit3 =
      plmn.mnc.size() == kLongMncLength ? digitAt(plmn.mnc, 2) : kFillerNibble;
  return PlmnBytes{pair(digitAt(plmn.mcc, 1), digitAt(plmn.mcc, 0)),
                   pair(mncDigit3, digitAt(plmn.mcc, 2)),
                   pair(digitAt(plmn.mnc, 1), digitAt(plmn.mnc, 0))};
}

std::optional<Plmn> plmnFromNumbers(std::uint32_t mcc, std::uint32_t mnc, std::uint32_t mncDigits) {
  if (!isMncLength(mncDigits)) return std::nullopt;
  const auto mccText = paddedDigits(mcc, kMccLength);
  const auto mncText = paddedDigits(mnc, mncDigits);
  if (!mccText || !mncText) return std::nullopt;
  return Plmn{*mccText, *mncText};
}

std::optional<Plmn> plmnFromOperatorCode(std::string_view code) {
  if (code.size() < kMccLength) return std::nullopt;
  return makePlmn(code.substr(0, kMccLength), code.substr(kMccLength));
}

std::string plmnText(const Plmn& plmn) {
  return plmn.mcc + '-' + plmn.mnc;
}

std::optional<Plmn> parsePlmnText(std::string_view text) {
  if (text.size() <= kMccLength || text[kMccLength] != '-') return std::nullopt;
  return makePlmn(text.substr(0, kMccLength), text.substr(kMccLength + 1));
}

}  // namespace radio
