// What a ModemManager modem leaves out, encoded by the source and taken in by the metric intake:
// no record, or a record without the values it did not report.
#include <ModemManager.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "StoreValues.h"
#include "codec/Codable.h"  // before StoreTesting.h, which uses it
#include "store/StoreTesting.h"
#include "tarn/mm/Metrics.h"
#include "tarn/mm/Reading.h"

namespace {

using tarn::mm::Problems;
using tarn::mm::Snapshot;

class ModemManagerIntakeTest : public store::fixtures::StoreTest {
 protected:
  void take(const Snapshot& snapshot) {
    Problems problems;
    for (const tarn::service::Metric& metric :
         tarn::mm::radioMetrics(snapshot, store::fixtures::kJuly14, problems)) {
      delivered.push_back(metric.metricId);
      validator.metricsDidUpdate(
          {{"kKeyMetricID", std::int64_t{metric.metricId}}, {"kKeyPayload", metric.payload}});
    }
    EXPECT_THAT(problems, ::testing::IsEmpty());
  }

  std::vector<std::uint32_t> delivered;
};

TEST_F(ModemManagerIntakeTest, MakesNoRecordOfWhatModemManagerDoesNotReport) {
  take(Snapshot{});
  Snapshot noServingCell;
  noServingCell.registration.accessTechnologies = MM_MODEM_ACCESS_TECHNOLOGY_LTE;
  take(noServingCell);
  EXPECT_THAT(delivered, ::testing::IsEmpty());

  // Without a serving cell, the operator the modem registered on is all there is to show.
  Snapshot registeredOnly;
  registeredOnly.registration.accessTechnologies = MM_MODEM_ACCESS_TECHNOLOGY_UMTS;
  registeredOnly.registration.operatorPlmn = tarn::mm::parsePlmn("310410");
  take(registeredOnly);
  ASSERT_TRUE(validator.myUMTSCellInfoDict());
  EXPECT_EQ(mmtest::shownAt(validator, "myUMTSCellInfoDict/mcc"), 310);
  EXPECT_EQ(mmtest::shownAt(validator, "myUMTSCellInfoDict/mnc"), 410);
  EXPECT_EQ(validator.myUMTSCellInfoDict()->find("psc"), nullptr);

  // A value that a baseband's index cannot carry is dropped, not clamped.
  Snapshot tooStrong;
  tarn::mm::Cell neighbour;
  neighbour.rat = tarn::mm::Rat::Lte;
  neighbour.rsrp = -30;
  neighbour.pci = 5;
  tooStrong.cells = {neighbour};
  tooStrong.registration.accessTechnologies = MM_MODEM_ACCESS_TECHNOLOGY_LTE;
  Problems problems;
  tarn::mm::radioMetrics(tooStrong, store::fixtures::kJuly14, problems);
  EXPECT_THAT(problems,
              ::testing::ElementsAre("neighbour RSRP -30 is outside what a baseband reports; "
                                     "dropped"));
}

}  // namespace
