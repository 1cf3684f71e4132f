#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <memory>

#include "messages/Records.h"
#include "store/StoreTesting.h"

namespace store {
namespace {

using namespace messages;
using platform::Bytes;
using platform::Dictionary;
using platform::List;
using platform::Value;
using store::fixtures::kJuly14;
using store::fixtures::kJuly14Text;
using store::fixtures::row;
using V = MetricValidator;

class GsmNasConversionTest : public store::fixtures::StoreTest {};

TEST_F(GsmNasConversionTest, ConvertsGsmNeighbourLevelsAndLeavesAbsentListsAlone) {
  KCellularGsmGrrEventMeasCr measurement;
  measurement.setTimestamp(kJuly14);
  auto gsm = std::make_shared<GsmNcellMeas>();
  gsm->setRxlev(20);
  measurement.addGsmNcellMeas(gsm);
  auto umts = std::make_shared<UmtsNcellMeas>();
  umts->setCpichRscp(10);
  umts->setCpichEcn0(6);
  measurement.addUmtsNcellMeas(umts);
  deliver(V::K_GSM_NCELL_MEAS, measurement);

  const GSM& stored = validator.myGSM();
  EXPECT_EQ(row(stored.geraNbrMeas, 0),
            (Dictionary{{"rxlev", std::int64_t{-90}}, {"timestamp", kJuly14Text}}));
  EXPECT_EQ(row(stored.utraNbrMeas, 0), (Dictionary{{"cpich_rscp", std::int64_t{-106}},
                                                    {"cpich_ecn0", -21.5f},
                                                    {"timestamp", kJuly14Text}}));
  EXPECT_EQ(stored.eUtraNbrMeas, placeholderList());

  KCellularGsmGrrEventMeasCr lteOnly;
  auto lte = std::make_shared<LteNcellMeas>();
  lte->setRsrp(97);
  lte->setRsrq(34);
  lteOnly.addLteNcellMeas(lte);
  deliver(V::K_GSM_NCELL_MEAS, lteOnly);
  EXPECT_EQ(validator.myGSM().eUtraNbrMeas,
            (List{Dictionary{{"rsrp", std::int64_t{-43}}, {"rsrq", -2.5f}}}));
  EXPECT_EQ(row(validator.myGSM().geraNbrMeas, 0).find("rxlev")->asInteger(), -90);
}

TEST_F(GsmNasConversionTest, ShowsTheEmmIdentityAndTrackingAreasAsOneTextEach) {
  KCellularEmmContext context;
  context.setTimestamp(kJuly14);
  auto guti = std::make_shared<Guti>();
  guti->setMmegi(32769);
  guti->setMmec(12);
  context.setGuti(guti);
  for (const std::uint32_t tac : {1u, 2u}) {
    auto area = std::make_shared<KCellularTrackingAreaId>();
    area->setTac(tac);
    context.addTaiList(area);
  }
  deliver(V::K_LTE_EMM_CTXT, context);
  const Dictionary& stored = *validator.myLTEEMMContextDict();
  EXPECT_EQ(*stored.find("guti"), Value(R"(["mmegi": 32769, "mmec": 12])"));
  EXPECT_EQ(*stored.find("tai_list"), Value(R"([["tac": 1], ["tac": 2]])"));
  EXPECT_EQ(*stored.find("timestamp"), Value(kJuly14Text));
  EXPECT_EQ(log.plainLines()[1], "Received EMM Context is " + stored.description());
}

TEST_F(GsmNasConversionTest, LogsTheBearersBeforeTheirTimestampBecomesText) {
  KCellularActivatedBearerContexts bearers;
  bearers.setTimestamp(kJuly14);
  auto bearer = std::make_shared<BearerContext>();
  bearer->setCid(5);
  bearer->setApn("internet");
  bearers.addBearerContexts(bearer);
  deliver(V::K_CELLULAR_ACTIVE_BEARER, bearers);

  EXPECT_EQ(log.plainLines()[1],
            R"(Received Bearer Context Info is ["timestamp": 1500000000000, "bearer_contexts": )"
            R"([["cid": 5, "apn": "internet"]]])");
  EXPECT_EQ(*validator.myCellularActiveBearerDict()->find("timestamp"), Value(kJuly14Text));
  const List expected{Dictionary{{"cid", 5u}, {"apn", "internet"}, {"timestamp", kJuly14Text}}};
  EXPECT_EQ(validator.myCommon().activeBearer, expected);

  // A metric without bearer contexts leaves the list as it was.
  deliver(V::K_CELLULAR_ACTIVE_BEARER, KCellularActivatedBearerContexts());
  EXPECT_EQ(validator.myCommon().activeBearer, expected);
}

TEST_F(GsmNasConversionTest, CopiesSimFilesUnchanged) {
  KCellularSimCardFiles files;
  files.setTimestamp(kJuly14);
  for (const std::uint32_t id : {0x6F07u, 0x6F46u, 0x2FE2u}) {
    auto file = std::make_shared<ElementaryFile>();
    file->setEfId(id);
    file->setContent(Bytes{0x01, 0x02});
    files.addEfList(file);
  }
  deliver(V::K_SIM_FILE_INFO, files);
  const List& contents = validator.myCommon().simContents;
  ASSERT_EQ(contents.size(), 3u);
  EXPECT_EQ(row(contents, 2), (Dictionary{{"ef_id", 0x2FE2u}, {"content", Bytes{0x01, 0x02}}}));
}

}  // namespace
}  // namespace store
