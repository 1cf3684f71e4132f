#include "tarn/mm/SimFiles.h"

#include <gtest/gtest.h>

#include "messages/Metrics.h"
#include "messages/Records.h"

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

TEST(SimFiles, HoldTheIdentitiesInTheFilesEncodingsAsAPhoneReadsThem) {
  const Sim sim{.iccid = "8931041010654378930",
                .imsi = "310410123456789",
                .operatorId = "310410",
                .serviceProvider = "Norvo"};
  const std::optional<service::Metric> metric = simFilesMetric(sim, 1500000000000);
  ASSERT_TRUE(metric);
  EXPECT_EQ(metric->metricId, messages::metric::KCellularSimCardFiles);
  const auto files = messages::KCellularSimCardFiles::initWithData(&metric->payload);
  ASSERT_TRUE(files);
  ASSERT_EQ(files->efListsCount(), 3u);
  EXPECT_EQ(files->efListAtIndex(0)->efId(), 0x2FE2u);
  EXPECT_EQ(files->efListAtIndex(0)->content(),
            (platform::Bytes{0x98, 0x13, 0x40, 0x01, 0x01, 0x56, 0x34, 0x87, 0x39, 0xF0}));
  EXPECT_EQ(files->efListAtIndex(1)->efId(), 0x6F07u);
  EXPECT_EQ(files->efListAtIndex(1)->content(),
            (platform::Bytes{0x08, 0x39, 0x01, 0x14, 0x10, 0x32, 0x54, 0x76, 0x98}));
  EXPECT_EQ(files->efListAtIndex(2)->efId(), 0x6F46u);

  const std::optional<service::Metric> common = mmCommonInfoMetric(sim, 1500000000000);
  ASSERT_TRUE(common);
  EXPECT_EQ(messages::KCellularMmCommonInfo::initWithData(&common->payload)->imsi(),
            files->efListAtIndex(1)->content());
  // An identity that does not encode is left out, not made up.
  const auto broken = simFilesMetric(
      Sim{.iccid = "12", .imsi = "31041O", .operatorId = {}, .serviceProvider = {}}, 0);
  EXPECT_EQ(broken, std::nullopt);
}

}  // namespace
}  // namespace tarn::mm
