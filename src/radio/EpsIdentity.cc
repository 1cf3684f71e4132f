#include "radio/EpsIdentity.h"

#include "platform/Format.h"

namespace radio {
namespace {

constexpr std::size_t kGutiSize = 11;
constexpr std::size_t kTaiSize = 5;
constexpr std::uint8_t kGutiIdentityType = 6;

// The big-endian number in `bytes`.
std::uint32_t bigEndian(std::span<const std::uint8_t> bytes) {
  std::uint32_t number = 0;
  for (const std::uint8_t byte : bytes)
    number = number << 8 | byte;
  return number;
}

}  // namespace

std::optional<Guti> decodeGuti(std::span<const std::uint8_t> bytes) {
  if (bytes.size() != kGutiSize || (bytes[0] & 0x7) != kGutiIdentityType) return std::nullopt;
  std::optional<Plmn> plmn = decodePlmn(bytes.subspan(1, kPlmnSize));
  if (!plmn) return std::nullopt;
  return Guti{std::move(*plmn), static_cast<std::uint16_t>(bigEndian(bytes.subspan(4, 2))),
              bytes[6], bigEndian(bytes.subspan(7, 4))};
}

std::optional<Tai> decodeTai(std::span<const std::uint8_t> bytes) {
  if (bytes.size() != kTaiSize) return std::nullopt;
  std::optional<Plmn> plmn = decodePlmn(bytes.first(kPlmnSize));
  if (!plmn) return std::nullopt;
  return Tai{std::move(*plmn), static_cast<std::uint16_t>(bigEndian(bytes.subspan(kPlmnSize)))};
}

std::string gutiText(const Guti& guti) {
  return platform::format("%s-%04X-%02X-%08X", plmnText(guti.plmn), guti.mmeGroupId, guti.mmeCode,
                          guti.mTmsi);
}

std::string taiText(const Tai& tai) {
  return platform::format("%s-%04X", plmnText(tai.plmn), tai.tac);
}

}  // namespace radio
