#include "radio/LteBands.h"

namespace radio {
namespace {

// One row of TS 36.101 table 5.7.3-1. Frequencies in units of 100 kHz, the raster, so that
// every number is exact. A TDD band repeats its downlink columns as the uplink ones, as the
// table does; a downlink-only band has none.
struct LteBand {
  std::uint32_t band;
  Duplex duplex;
  std::uint32_t downlinkLow;     // F_DL_low
  std::uint32_t downlinkOffset;  // N_Offs-DL, the first downlink EARFCN
  std::uint32_t downlinkLast;
  std::uint32_t uplinkLow;     // F_UL_low
  std::uint32_t uplinkOffset;  // N_Offs-UL
  std::uint32_t uplinkLast;
};

constexpr Duplex F = Duplex::fdd;
constexpr Duplex T = Duplex::tdd;
constexpr Duplex S = Duplex::downlinkOnly;

constexpr LteBand kLteBands[] = {
    // band, duplex, F_DL_low, N_Offs-DL, last N_DL, F_UL_low, N_Offs-UL, last N_UL
    {1, F, 21100, 0, 599, 19200, 18000, 18599},
    {2, F, 19300, 600, 1199, 18500, 18600, 19199},
    {3, F, 18050, 1200, 1949, 17100, 19200, 19949},
    {4, F, 21100, 1950, 2399, 17100, 19950, 20399},
    {5, F, 8690, 2400, 2649, 8240, 20400, 20649},
    {6, F, 8750, 2650, 2749, 8300, 20650, 20749},
    {7, F, 26200, 2750, 3449, 25000, 20750, 21449},
    {8, F, 9250, 3450, 3799, 8800, 21450, 21799},
    {9, F, 18449, 3800, 4149, 17499, 21800, 22149},
    {10, F, 21100, 4150, 4749, 17100, 22150, 22749},
    {11, F, 14759, 4750, 4949, 14279, 22750, 22949},
    {12, F, 7290, 5010, 5179, 6990, 23010, 23179},
    {13, F, 7460, 5180, 5279, 7770, 23180, 23279},
    {14, F, 7580, 5280, 5379, 7880, 23280, 23379},
    {17, F, 7340, 5730, 5849, 7040, 23730, 23849},
    {18, F, 8600, 5850, 5999, 8150, 23850, 23999},
    {19, F, 8750, 6000, 6149, 8300, 24000, 24149},
    {20, F, 7910, 6150, 6449, 8320, 24150, 24449},
    {21, F, 14959, 6450, 6599, 14479, 24450, 24599},
    {22, F, 35100, 6600, 7399, 34100, 24600, 25399},
    {23, F, 21800, 7500, 7699, 20000, 25500, 25699},
    {24, F, 15250, 7700, 8039, 16265, 25700, 26039},
    {25, F, 19300, 8040, 8689, 18500, 26040, 26689},
    {26, F, 8590, 8690, 9039, 8140, 26690, 27039},
    {27, F, 8520, 9040, 9209, 8070, 27040, 27209},
    {28, F, 7580, 9210, 9659, 7030, 27210, 27659},
    {29, S, 7170, 9660, 9769, 0, 0, 0},
    {30, F, 23500, 9770, 9869, 23050, 27660, 27759},
    {31, F, 4625, 9870, 9919, 4525, 27760, 27809},
    {32, S, 14520, 9920, 10359, 0, 0, 0},
    {33, T, 19000, 36000, 36199, 19000, 36000, 36199},
    {34, T, 20100, 36200, 36349, 20100, 36200, 36349},
    {35, T, 18500, 36350, 36949, 18500, 36350, 36949},
    {36, T, 19300, 36950, 37549, 19300, 36950, 37549},
    {37, T, 19100, 37550, 37749, 19100, 37550, 37749},
    {38, T, 25700, 37750, 38249, 25700, 37750, 38249},
    {39, T, 18800, 38250, 38649, 18800, 38250, 38649},
    {40, T, 23000, 38650, 39649, 23000, 38650, 39649},
    {41, T, 24960, 39650, 41589, 24960, 39650, 41589},
    {42, T, 34000, 41590, 43589, 34000, 41590, 43589},
    {43, T, 36000, 43590, 45589, 36000, 43590, 45589},
    {44, T, 7030, 45590, 46589, 7030, 45590, 46589},
    {45, T, 14470, 46590, 46789, 14470, 46590, 46789},
    {46, T, 51500, 46790, 54539, 51500, 46790, 54539},
    {47, T, 58550, 54540, 55239, 58550, 54540, 55239},
    {48, T, 35500, 55240, 56739, 35500, 55240, 56739},
    {49, T, 35500, 56740, 58239, 35500, 56740, 58239},
    {50, T, 14320, 58240, 59089, 14320, 58240, 59089},
    {51, T, 14270, 59090, 59139, 14270, 59090, 59139},
    {52, T, 33000, 59140, 60139, 33000, 59140, 60139},
    {53, T, 24835, 60140, 60254, 24835, 60140, 60254},
    {65, F, 21100, 65536, 66435, 19200, 131072, 131971},
    {66, F, 21100, 66436, 67335, 17100, 131972, 132671},
    {67, S, 7380, 67336, 67535, 0, 0, 0},
    {68, F, 7530, 67536, 67835, 6980, 132672, 132971},
    {69, S, 25700, 67836, 68335, 0, 0, 0},
    {70, F, 19950, 68336, 68585, 16950, 132972, 133121},
    {71, F, 6170, 68586, 68935, 6630, 133122, 133471},
    {72, F, 4610, 68936, 68985, 4510, 133472, 133521},
    {73, F, 4600, 68986, 69035, 4500, 133522, 133571},
    {74, F, 14750, 69036, 69465, 14270, 133572, 134001},
    {75, S, 14320, 69466, 70315, 0, 0, 0},
    {76, S, 14270, 70316, 70365, 0, 0, 0},
    {85, F, 7280, 70366, 70545, 6980, 134002, 134181},
    {87, F, 4200, 70546, 70595, 4100, 134182, 134231},
    {88, F, 4220, 70596, 70645, 4120, 134232, 134281},
};

// Rows in ascending EARFCN order without overlaps, and no uplink range wider than its downlink.
constexpr bool isWellFormed() {
  std::uint32_t next = 0;
  for (const LteBand& row : kLteBands) {
    if (row.downlinkOffset < next || row.downlinkLast < row.downlinkOffset) return false;
    if (row.uplinkLast - row.uplinkOffset > row.downlinkLast - row.downlinkOffset) return false;
    next = row.downlinkLast + 1;
  }
  return true;
}
static_assert(isWellFormed());

constexpr std::uint32_t kKHzPerUnit = 100;

}  // namespace

std::optional<LteChannel> decodeEarfcn(std::uint32_t earfcn) {
  const LteBand* row = onlyMatchingRow(kLteBands, [earfcn](const LteBand& band) {
    return earfcn >= band.downlinkOffset && earfcn <= band.downlinkLast;
  });
  if (row == nullptr) return std::nullopt;
  const std::uint32_t step = earfcn - row->downlinkOffset;
  LteChannel channel{row->band, row->duplex, (row->downlinkLow + step) * kKHzPerUnit, {}, {}};
  const std::uint32_t uplinkEarfcn = row->uplinkOffset + step;
  if (row->duplex != Duplex::downlinkOnly && uplinkEarfcn <= row->uplinkLast) {
    channel.uplinkKHz = (row->uplinkLow + step) * kKHzPerUnit;
    channel.uplinkEarfcn = uplinkEarfcn;
  }
  return channel;
}

}  // namespace radio
