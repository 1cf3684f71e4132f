#include "tarn/sim/Bands.h"

#include <array>
#include <stdexcept>

namespace tarn::sim::bands {
namespace {

constexpr std::array<LteBandwidth, 6> kLteBandwidths = {{
    {0, 1.4, 6},
    {1, 3.0, 15},
    {2, 5.0, 25},
    {3, 10.0, 50},
    {4, 15.0, 75},
    {5, 20.0, 100},
}};

constexpr std::array<LteBand, 3> kLteBands = {{
    {3, 1805.0, 1200, 1949, 19200},
    {7, 2620.0, 2750, 3449, 20750},
    {20, 791.0, 6150, 6449, 24150},
}};

constexpr std::array<UmtsBand, 2> kUmtsBands = {{
    {1, messages::SYS_BAND_WCDMA_I_IMT_2000, 10562, 10838, 0.0},
    {8, messages::SYS_BAND_WCDMA_VIII_900, 2937, 3088, 340.0},
}};

constexpr std::array<GsmBand, 2> kGsmBands = {{
    {messages::SYS_BAND_GSM_EGSM_900, 1, 124, 935.2},
    {messages::SYS_BAND_GSM_DCS_1800, 512, 885, 1805.2},
}};

template <class Table, class Key, class KeyOf>
const auto& find(const Table& table, Key key, KeyOf keyOf, const char* what) {
  for (const auto& entry : table) {
    if (keyOf(entry) == key) return entry;
  }
  throw std::out_of_range(what);
}

}  // namespace

const LteBandwidth& lteBandwidth(std::uint32_t code) {
  return find(
      kLteBandwidths, code, [](const LteBandwidth& b) { return b.code; },
      "no such LTE bandwidth code");
}

const LteBand& lteBand(std::uint32_t number) {
  return find(
      kLteBands, number, [](const LteBand& b) { return b.number; }, "no such LTE band");
}

double lteDlMhz(std::uint32_t band, std::uint32_t dlEarfcn) {
  const LteBand& plan = lteBand(band);
  return plan.dlLowMhz + 0.1 * (dlEarfcn - plan.dlFirstEarfcn);
}

std::uint32_t lteUlEarfcn(std::uint32_t band, std::uint32_t dlEarfcn) {
  const LteBand& plan = lteBand(band);
  return plan.ulFirstEarfcn + (dlEarfcn - plan.dlFirstEarfcn);
}

const UmtsBand& umtsBand(std::uint32_t number) {
  return find(
      kUmtsBands, number, [](const UmtsBand& b) { return b.number; }, "no such UMTS band");
}

double umtsDlMhz(std::uint32_t band, std::uint32_t uarfcn) {
  return umtsBand(band).dlOffsetMhz + uarfcn / 5.0;
}

const GsmBand& gsmBand(messages::SysBand sysBand) {
  return find(
      kGsmBands, sysBand, [](const GsmBand& b) { return b.sysBand; }, "no such GSM band");
}

double gsmDlMhz(messages::SysBand sysBand, std::uint32_t arfcn) {
  const GsmBand& plan = gsmBand(sysBand);
  return plan.firstDlMhz + 0.2 * (arfcn - plan.firstArfcn);
}

}  // namespace tarn::sim::bands
