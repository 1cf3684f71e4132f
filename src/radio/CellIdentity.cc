#include "radio/CellIdentity.h"

namespace radio {
namespace {

constexpr std::uint32_t kCellIdentityLimit = 1u << 28;
constexpr unsigned kEnbCellBits = 8;
constexpr unsigned kUtranCellBits = 16;

constexpr std::uint32_t lowBits(std::uint32_t value, unsigned count) {
  return value & ((1u << count) - 1);
}

}  // namespace

std::optional<EutranCell> splitEutranCellId(std::uint32_t cellIdentity) {
  if (cellIdentity >= kCellIdentityLimit) return std::nullopt;
  return EutranCell{cellIdentity >> kEnbCellBits, lowBits(cellIdentity, kEnbCellBits)};
}

std::optional<UtranCell> splitUtranCellId(std::uint32_t cellIdentity) {
  if (cellIdentity >= kCellIdentityLimit) return std::nullopt;
  return UtranCell{cellIdentity >> kUtranCellBits, lowBits(cellIdentity, kUtranCellBits)};
}

}  // namespace radio
