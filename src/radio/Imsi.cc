#include "radio/Imsi.h"

#include <algorithm>
#include <vector>

#include "platform/ParseNumber.h"
#include "radio/Bcd.h"

namespace radio {
namespace {

constexpr std::size_t kMinimumImsiLength = 6;
constexpr std::size_t kMaximumImsiLength = 15;
constexpr std::uint8_t kImsiIdentityType = 1;
constexpr std::uint8_t kOddDigitsFlag = 0x8;
constexpr std::size_t kEfAdMncLengthIndex = 3;

constexpr std::uint16_t kThreeDigitMncCountries[] = {302, 310, 311, 312, 313, 314, 315, 316,
                                                     334, 338, 342, 344, 346, 348, 352, 354,
                                                     356, 358, 360, 365, 366, 376, 722, 732};
static_assert(std::ranges::is_sorted(kThreeDigitMncCountries), "usualMncLength searches it");

bool isImsi(std::string_view digits) {
  return digits.size() >= kMinimumImsiLength && digits.size() <= kMaximumImsiLength &&
         isDigits(digits);
}

}  // namespace

std::optional<std::string> decodeImsiIdentity(std::span<const std::uint8_t> bytes) {
  if (bytes.empty() || (bytes[0] & 0x7) != kImsiIdentityType) return std::nullopt;
  const bool odd = (bytes[0] & kOddDigitsFlag) != 0;
  // Digit 1 is nibble 1; an odd count fills every nibble, an even one leaves the last as filler.
  const std::size_t expected = 2 * bytes.size() - (odd ? 1 : 2);
  std::optional<std::string> digits = decodeSwappedBcd(bytes, 1);
  if (!digits || digits->size() != expected || !isImsi(*digits)) return std::nullopt;
  return digits;
}

std::optional<std::string> decodeEfImsi(std::span<const std::uint8_t> bytes) {
  if (bytes.empty() || bytes[0] > kEfImsiSize - 1 || bytes.size() < 1u + bytes[0]) {
    return std::nullopt;
  }
  return decodeImsiIdentity(bytes.subspan(1, bytes[0]));
}

std::optional<platform::Bytes> encodeEfImsi(std::string_view imsi) {
  if (!isImsi(imsi)) return std::nullopt;
  const bool odd = imsi.size() % 2 == 1;
  std::vector<std::uint8_t> nibbles{
      static_cast<std::uint8_t>(kImsiIdentityType | (odd ? kOddDigitsFlag : 0))};
  for (const char digit : imsi)
    nibbles.push_back(static_cast<std::uint8_t>(digit - '0'));
  const std::size_t identitySize = (nibbles.size() + 1) / 2;
  platform::Bytes file{static_cast<std::uint8_t>(identitySize)};
  const platform::Bytes identity = packNibbles(nibbles, kEfImsiSize - 1);
  file.insert(file.end(), identity.begin(), identity.end());
  return file;
}

std::optional<ImsiParts> splitImsi(std::string_view imsi, std::size_t mncLength) {
  if (!isImsi(imsi) || imsi.size() <= kMccLength + mncLength) return std::nullopt;
  std::optional<Plmn> plmn =
      makePlmn(imsi.substr(0, kMccLength), imsi.substr(kMccLength, mncLength));
  if (!plmn) return std::nullopt;
  return ImsiParts{std::move(*plmn), std::string(imsi.substr(kMccLength + mncLength))};
}

std::optional<std::size_t> mncLengthFromEfAd(std::span<const std::uint8_t> bytes) {
  if (bytes.size() <= kEfAdMncLengthIndex) return std::nullopt;
  const auto length = static_cast<std::size_t>(bytes[kEfAdMncLengthIndex] & 0x0F);
  if (length != kShortMncLength && length != kLongMncLength) return std::nullopt;
  return length;
}

std::size_t usualMncLength(std::string_view mcc) {
  const auto number = platform::parseNumber<std::uint16_t>(mcc);
  const bool threeDigits = number && mcc.size() == kMccLength &&
                           std::ranges::binary_search(kThreeDigitMncCountries, *number);
  return threeDigits ? kLongMncLength : kShortMncLength;
}

}  // namespace radio
