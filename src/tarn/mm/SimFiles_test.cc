#include "tarn/mm/SimFiles.h"

#include <gtest/gtest.h>

namespace tarn::mm {
namespace {

TEST(EfSpn, HoldsTheNameInTheGsmAlphabetPaddedWithFf) {
  const platform::Bytes expected = {0x00, 'N',  'o',  'r',  'v',  'o',  ' ',  '1', 0xFF,
                                    0xFF, 0xFF, 0xFF, 0xFF, 0xFF, 0xFF, 0xFF, 0xFF};
  EXPECT_EQ(encodeEfSpn("Norvo 1"), expected);
  EXPECT_EQ(encodeEfSpn("ABCDEFGHIJKLMNOP")->size(), 17u);
  EXPECT_EQ(encodeEfSpn("ABCDEFGHIJKLMNOPQ"), std::nullopt);
  EXPECT_EQ(encodeEfSpn("a_b"), std::nullopt);
  EXPECT_EQ(encodeEfSpn("caf\xC3\xA9"), std::nullopt);
  EXPECT_EQ(simFilesMetric(Sim{}, 0), std::nullopt);
}

}  // namespace
}  // namespace tarn::mm
