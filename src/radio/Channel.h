#pragma once

#include <cstdint>
#include <ranges>
#include <string>

// What the band tables share. Frequencies are whole kHz, exact on every raster (100 kHz for
// LTE, 200 kHz for UMTS and GSM, the 100 kHz offsets of the UMTS additional channels).
namespace radio {

enum class Duplex {
  fdd,           // paired uplink and downlink frequencies
  tdd,           // one frequency, uplink and downlink in turn
  downlinkOnly,  // supplemental downlink: no uplink at all
};

// The frequency in MHz with as many decimals as it needs, at least one: "806.0", "1842.5",
// "1452.025".
std::string megahertzText(std::uint32_t kHz);

// The one row of `table` that `matches`, or null when none does or several do: a channel
// number that two bands share reads as no band at all rather than a guess.
template <std::ranges::range Table, class Match>
const std::ranges::range_value_t<Table>* onlyMatchingRow(const Table& table, Match matches) {
  const std::ranges::range_value_t<Table>* found = nullptr;
  for (const auto& row : table) {
    if (!matches(row)) continue;
    if (found != nullptr) return nullptr;
    found = &row;
  }
  return found;
}

}  // namespace radio
