#include "app/EventsCommand.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <boost/json/parse.hpp>
#include <sstream>
#include <string>

#include "messages/Records.h"
#include "store/MetricValidator.h"
#include "tarn/log/MetricLog.h"

namespace app {
namespace {

using messages::KCellularLteRrcState;
using store::MetricValidator;
using ::testing::ElementsAre;

std::string rrcLine(KCellularLteRrcState::State state, KCellularLteRrcState::Cause cause,
                    std::uint64_t timestamp) {
  KCellularLteRrcState record;
  record.setTimestamp(timestamp);
  record.setState(state);
  record.setCause(cause);
  return *tarn::log::formatMetricLogLine(
      {{"kKeyMetricID", MetricValidator::K_LTE_RRC_STATE}, {"kKeyPayload", record.data()}});
}

std::vector<std::string> lines(const std::string& text) {
  std::vector<std::string> found;
  std::istringstream stream(text);
  for (std::string line; std::getline(stream, line);)
    found.push_back(line);
  return found;
}

TEST(EventsCommand, PrintsEachEventAndReportsBrokenLinesByNumber) {
  setenv("TZ", "UTC", 1);
  const std::string log =
      rrcLine(KCellularLteRrcState::KLTE_RRC_STATE_CONNECTED,
              KCellularLteRrcState::KLTE_RRC_CAUSE_EST_MO_DATA, 1718100000250) +
      "\n{\"kKeyMetricID\": 3952132,\n"                        // 2: cut short
      "{\"kKeyPayload\":\"CAE=\"}\n"                           // 3: no metric ID
      "{\"kKeyMetricID\":3952132,\"kKeyPayload\":\"/w==\"}\n"  // 4: no record
      "{\"kKeyMetricID\":1,\"kKeyPayload\":\"CAE=\"}\n" +      // 5: not ours
      rrcLine(KCellularLteRrcState::KLTE_RRC_STATE_ATMPT_CONNECTION,
              KCellularLteRrcState::KLTE_RRC_CAUSE_REEST_OTHER_FAIL_T310_EXP, 1718100001000) +
      "\n";

  std::istringstream input(log);
  std::ostringstream out, errors;
  ASSERT_TRUE(writeLogEvents(input, "drive.jsonl", false, out, errors));
  EXPECT_THAT(lines(out.str()),
              ElementsAre("2024-06-11 10:00:00.250 UTC  info     rrc           LTE RRC CONNECTED "
                          "(KLTE_RRC_CAUSE_EST_MO_DATA)",
                          "2024-06-11 10:00:01.000 UTC  failure  radio-link    LTE RRC CONNECTED "
                          "→ ATMPT_CONNECTION: radio link failure, re-establishing "
                          "(KLTE_RRC_CAUSE_REEST_OTHER_FAIL_T310_EXP)"));
  const std::vector<std::string> reported = lines(errors.str());
  ASSERT_EQ(reported.size(), 3u) << errors.str();
  EXPECT_TRUE(reported[0].starts_with("drive.jsonl:2: not JSON")) << reported[0];
  EXPECT_EQ(reported[1], "drive.jsonl:3: no integer \"kKeyMetricID\"; line skipped");
  EXPECT_EQ(reported[2], "drive.jsonl:4: the payload does not decode; line skipped");

  std::istringstream again(log);
  std::ostringstream json, ignored;
  ASSERT_TRUE(writeLogEvents(again, "drive.jsonl", true, json, ignored));
  const std::vector<std::string> objects = lines(json.str());
  ASSERT_EQ(objects.size(), 2u);
  EXPECT_EQ(boost::json::parse(objects[1]),
            boost::json::parse(
                R"j({"id":2,"time_ms":1718100001000,"kind":"radio-link","severity":"failure",)j"
                R"j("text":"LTE RRC CONNECTED → ATMPT_CONNECTION: radio link failure, )j"
                R"j(re-establishing (KLTE_RRC_CAUSE_REEST_OTHER_FAIL_T310_EXP)",)j"
                R"j("metric_id":3952132})j"));
}

}  // namespace
}  // namespace app
