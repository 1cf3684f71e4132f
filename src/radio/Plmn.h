#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>

// PLMN identities: a mobile country code and a mobile network code, each a digit string whose
// leading zeros count ("001-01" is not "1-1", and "234-015" is not "234-15").
namespace radio {

inline constexpr std::size_t kMccLength = 3;
inline constexpr std::size_t kShortMncLength = 2;
inline constexpr std::size_t kLongMncLength = 3;
inline constexpr std::size_t kPlmnSize = 3;

struct Plmn {
  std::string mcc;  // three digits
  std::string mnc;  // two or three digits

  bool operator==(const Plmn&) const = default;
};

// The three bytes of a PLMN identity as NAS carries it (TS 24.008 10.5.1.3): MCC digit 2 | MCC
// digit 1, MNC digit 3 | MCC digit 3, MNC digit 2 | MNC digit 1, high nibble first in each
// pair. MNC digit 3 = 0xF means a two-digit MNC.
using PlmnBytes = std::array<std::uint8_t, kPlmnSize>;

// Empty unless `bytes` is exactly three bytes of digits (0xF allowed only as MNC digit 3).
std::optional<Plmn> decodePlmn(std::span<const std::uint8_t> bytes);

// Empty unless `plmn` is valid (see makePlmn).
std::optional<PlmnBytes> encodePlmn(const Plmn& plmn);

// The PLMN of these digit strings: a three-digit MCC and a two- or three-digit MNC; else empty.
std::optional<Plmn> makePlmn(std::string_view mcc, std::string_view mnc);

// From the numbers modem records carry: MCC 1 becomes "001"; MNC 1 with 2 digits "01", with 3
// digits "001". Empty when a number does not fit its digits or mncDigits is not 2 or 3.
std::optional<Plmn> plmnFromNumbers(std::uint32_t mcc, std::uint32_t mnc, std::uint32_t mncDigits);

// From an operator code of five or six digits, MCC first ("31026" is 310-26, "310260" is
// 310-260), as AT+COPS and ModemManager give it; else empty.
std::optional<Plmn> plmnFromOperatorCode(std::string_view code);

// "MCC-MNC": "001-01", "310-260", "234-015".
std::string plmnText(const Plmn& plmn);

// The reverse of plmnText; empty for anything else.
std::optional<Plmn> parsePlmnText(std::string_view text);

}  // namespace radio
