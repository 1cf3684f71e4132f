#pragma once

#include <cstdint>
#include <optional>

// The parts of a 28-bit cell identity as the network plans them.
namespace radio {

struct EutranCell {
  std::uint32_t enbId = 0;   // the macro eNB ID, the upper 20 bits
  std::uint32_t cellId = 0;  // the cell (sector) of that eNB, the lower 8 bits

  bool operator==(const EutranCell&) const = default;
};

struct UtranCell {
  std::uint32_t rncId = 0;   // the RNC ID, the upper 12 bits
  std::uint32_t cellId = 0;  // the C-ID, the lower 16 bits

  bool operator==(const UtranCell&) const = default;
};

// The E-UTRAN cell identity (TS 36.331 CellIdentity, TS 36.413 macro eNB ID) split into eNB
// and cell; empty above 28 bits.
std::optional<EutranCell> splitEutranCellId(std::uint32_t cellIdentity);

// The UTRAN cell identity (TS 25.401 6.1.5) split into RNC ID and C-ID; empty above 28 bits.
std::optional<UtranCell> splitUtranCellId(std::uint32_t cellIdentity);

}  // namespace radio
