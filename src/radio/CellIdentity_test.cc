#include "radio/CellIdentity.h"

#include <gtest/gtest.h>

#include <cstdint>

namespace radio {
namespace {

TEST(CellIdentity, SplitsTwentyEightBitsIntoSiteAndCell) {
  EXPECT_EQ(splitEutranCellId(0x1A2D001), (EutranCell{0x1A2D0, 0x01}));  // eNB 107216, cell 1
  EXPECT_EQ(splitEutranCellId(0xFFFFFFF), (EutranCell{0xFFFFF, 0xFF}));
  EXPECT_EQ(splitEutranCellId(0), (EutranCell{0, 0}));
  EXPECT_FALSE(splitEutranCellId(0x10000000));
  EXPECT_EQ(splitUtranCellId(0x0C8A1B3), (UtranCell{0x0C8, 0xA1B3}));
  EXPECT_EQ(splitUtranCellId(0xFFFFFFF), (UtranCell{0xFFF, 0xFFFF}));
  EXPECT_FALSE(splitUtranCellId(UINT32_MAX));
}

}  // namespace
}  // namespace radio
