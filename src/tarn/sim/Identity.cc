#include "tarn/sim/Identity.h"

#include <cstdint>

namespace tarn::sim {
namespace {

std::string padded(std::uint32_t value, std::size_t width) {
  std::string text = std::to_string(value);
  return std::string(width > text.size() ? width - text.size() : 0, '0') + text;
}

std::string randomDigits(std::size_t count, Random& random) {
  std::string digits;
  for (std::size_t i = 0; i < count; ++i)
    digits += static_cast<char>('0' + random.between(0, 9));
  return digits;
}

std::uint8_t nibble(char digit) {
  return static_cast<std::uint8_t>(digit - '0');
}

}  // namespace

Subscriber makeSubscriber(const Plmn& home, Random& random) {
  const std::string plmn = padded(home.mcc, 3) + padded(home.mnc, home.mncDigits);
  const std::string iccidBody = "89" + plmn + randomDigits(16 - plmn.size(), random);
  return {plmn + randomDigits(15 - plmn.size(), random),
          iccidBody + identity::luhnCheckDigit(iccidBody)};
}

namespace identity {

platform::Bytes encodePlmn(const Plmn& plmn) {
  const std::string mcc = padded(plmn.mcc, 3);
  const std::string mnc = padded(plmn.mnc, plmn.mncDigits);
  const std::uint8_t mnc3 = mnc.size() == 3 ? nibble(mnc[2]) : 0xF;
  return {static_cast<std::uint8_t>(nibble(mcc[1]) << 4 | nibble(mcc[0])),
          static_cast<std::uint8_t>(mnc3 << 4 | nibble(mcc[2])),
          static_cast<std::uint8_t>(nibble(mnc[1]) << 4 | nibble(mnc[0]))};
}

platform::Bytes encodeImsi(std::string_view imsi) {
  platform::Bytes bytes = {static_cast<std::uint8_t>((imsi.size() + 2) / 2),
                           static_cast<std::uint8_t>(nibble(imsi[0]) << 4 | 0x9)};
  const platform::Bytes rest = encodeSwappedBcd(imsi.substr(1), imsi.size() / 2);
  bytes.insert(bytes.end(), rest.begin(), rest.end());
  return bytes;
}

platform::Bytes encodeSwappedBcd(std::string_view digits, std::size_t size) {
  platform::Bytes bytes(size, 0xFF);
  for (std::size_t i = 0; i < digits.size() && i / 2 < size; ++i) {
    std::uint8_t& byte = bytes[i / 2];
    byte = i % 2 == 0 ? static_cast<std::uint8_t>((byte & 0xF0) | nibble(digits[i]))
                      : static_cast<std::uint8_t>((byte & 0x0F) | nibble(digits[i]) << 4);
  }
  return bytes;
}

char luhnCheckDigit(std::string_view digits) {
  int sum = 0;
  bool doubled = true;  // the digit next to the check digit is doubled
  for (auto it = digits.rbegin(); it != digits.rend(); ++it, doubled = !doubled) {
    int value = *it - '0';
    if (doubled) value = value * 2 > 9 ? value * 2 - 9 : value * 2;
    sum += value;
  }
  return static_cast<char>('0' + (10 - sum % 10) % 10);
}

}  // namespace identity
}  // namespace tarn::sim
