#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <vector>

#include "events/EventDetector.h"
#include "events/EventJson.h"
#include "events/EventRing.h"
#include "messages/Records.h"
#include "platform/Json.h"
#include "platform/Log.h"
#include "store/MetricValidator.h"

namespace events {
namespace {

using namespace messages;
using platform::Bytes;
using store::MetricValidator;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

constexpr std::uint64_t kStartMs = 1718100000000;

struct Step {
  std::int64_t metricID;
  Bytes payload;
};

Step lteRrc(KCellularLteRrcState::State state, KCellularLteRrcState::Cause cause) {
  KCellularLteRrcState record;
  record.setState(state);
  record.setCause(cause);
  return {MetricValidator::K_LTE_RRC_STATE, record.data()};
}

Step lteCell(std::uint32_t pci, std::uint32_t earfcn, std::uint32_t tac) {
  KCellularLteScellInfo record;
  record.setPhyCellId(pci);
  record.setDlFreq(earfcn);
  record.setTrackingAreaCode(tac);
  return {MetricValidator::K_LTE_SCELL_INFO, record.data()};
}

Step umtsRrc(KCellularWcdmaRrcConnectionState::State state,
             KCellularWcdmaRrcConnectionState::EstablishmentCause establishment,
             KCellularWcdmaRrcConnectionState::ReleaseCause release) {
  KCellularWcdmaRrcConnectionState record;
  record.setState(state);
  record.setEstablishmentCause(establishment);
  record.setReleaseCause(release);
  return {MetricValidator::K_UMTS_RRC_STATE, record.data()};
}

Step umtsCell(std::uint32_t psc, std::uint32_t uarfcn, std::uint32_t lac) {
  KCellularWcdmaCellInfo record;
  record.setPsc(psc);
  record.setDlUarfcn(uarfcn);
  record.setLac(lac);
  return {MetricValidator::K_UMTS_SCELL_INFO, record.data()};
}

Step gsmCell(std::uint32_t bsic, std::uint32_t arfcn, std::uint32_t lac,
             KCellularGsmScellInfo::State state) {
  KCellularGsmScellInfo record;
  record.setBsic(bsic);
  record.setArfcn(arfcn);
  record.setLac(lac);
  record.setState(state);
  return {MetricValidator::K_GSM_SCELL_INFO, record.data()};
}

Step emm(KCellularEmmContext::RegStatus status, KCellularEmmContext::RegProc procedure,
         KCellularEmmContext::RejectCause reject = KCellularEmmContext::EMM_CAUSE_NO_CAUSE) {
  KCellularEmmContext record;
  record.setRegStatus(status);
  record.setRegProc(procedure);
  record.setRejectCause(reject);
  return {MetricValidator::K_LTE_EMM_CTXT, record.data()};
}

Step mm(KCellularEmmContext::RegStatus status, KCellularMmContext::RejectCause reject) {
  KCellularMmContext record;
  record.setRegStatus(status);
  record.setRejectCause(reject);
  return {MetricValidator::K_CELLULAR_MM_CTXT, record.data()};
}

Step gmm(KCellularEmmContext::RegStatus status, KCellularGmmContext::RegProc procedure,
         KCellularMmContext::ProcFailureCause failure) {
  KCellularGmmContext record;
  record.setRegStatus(status);
  record.setRegProc(procedure);
  record.setProcFailureCause(failure);
  return {MetricValidator::K_CELLULAR_GMM_CTXT, record.data()};
}

struct Carrier {
  std::uint32_t index;
  SecondaryComponentCarrier::State state;
  std::uint32_t pci;
  std::uint32_t earfcn;
  std::int32_t rsrp = -9000;
};

Step carriers(const std::vector<Carrier>& list) {
  KCellularLteCarrierAggregationStatus record;
  for (const Carrier& carrier : list) {
    auto scc = std::make_shared<SecondaryComponentCarrier>();
    scc->setIndex(carrier.index);
    scc->setState(carrier.state);
    scc->setPci(carrier.pci);
    scc->setDlEarfcn(carrier.earfcn);
    scc->setRsrp(carrier.rsrp);
    record.addSccList(scc);
  }
  return {MetricValidator::K_LTE_CA_STATUS, record.data()};
}

Step bearers(const std::vector<std::pair<std::uint32_t, std::string>>& list) {
  KCellularActivatedBearerContexts record;
  for (const auto& [cid, apn] : list) {
    auto bearer = std::make_shared<BearerContext>();
    bearer->setCid(cid);
    bearer->setApn(apn);
    bearer->setPdpType(BearerContext::PDP_TYPE_IPv4v6);
    record.addBearerContexts(bearer);
  }
  return {MetricValidator::K_CELLULAR_ACTIVE_BEARER, record.data()};
}

Step simFiles(std::size_t count) {
  KCellularSimCardFiles record;
  for (std::size_t i = 0; i < count; ++i) {
    auto file = std::make_shared<ElementaryFile>();
    file->setEfId(static_cast<std::uint32_t>(0x6F07 + i));
    record.addEfList(file);
  }
  return {MetricValidator::K_SIM_FILE_INFO, record.data()};
}

// An intake with the detection behind it, as the viewer wires them.
class DetectorsTest : public ::testing::Test {
 protected:
  DetectorsTest() { detector.watch(intake); }

  void deliver(const Step& step) {
    intake.metricsDidUpdate({{"kKeyMetricID", step.metricID}, {"kKeyPayload", step.payload}});
  }

  // "severity kind text" of each event, oldest first.
  std::vector<std::string> found() const {
    std::vector<std::string> lines;
    ring.forEach([&lines](const Event& event) {
      lines.push_back(std::string(severityName(event.severity)) + ' ' + std::string(event.kind) +
                      ' ' + event.text);
    });
    return lines;
  }

  platform::log::Capture log;
  MetricValidator intake{nullptr};
  EventRing ring{64};
  EventDetector detector{ring};
};

using Lte = KCellularLteRrcState;
using Umts = KCellularWcdmaRrcConnectionState;
using Scc = SecondaryComponentCarrier;
using Emm = KCellularEmmContext;

struct Script {
  const char* name;
  std::vector<Step> steps;
  std::vector<std::string> expected;
};

TEST_F(DetectorsTest, TurnsScriptedMetricsIntoEvents) {
  const Script scripts[] = {
      {"an LTE radio link failure, a failed re-establishment and a recovery",
       {lteRrc(Lte::KLTE_RRC_STATE_IDLE, Lte::KLTE_RRC_CAUSE_NA),
        lteRrc(Lte::KLTE_RRC_STATE_CONNECTED, Lte::KLTE_RRC_CAUSE_EST_MO_DATA),
        lteRrc(Lte::KLTE_RRC_STATE_CONNECTED, Lte::KLTE_RRC_CAUSE_EST_MO_DATA),
        lteRrc(Lte::KLTE_RRC_STATE_ATMPT_CONNECTION, Lte::KLTE_RRC_CAUSE_REEST_OTHER_FAIL_T310_EXP),
        lteRrc(Lte::KLTE_RRC_STATE_IDLE, Lte::KLTE_RRC_CAUSE_REL_CONN_FAIL_T311_EXP),
        lteRrc(Lte::KLTE_RRC_STATE_NULL, Lte::KLTE_RRC_CAUSE_NO_SERVICE),
        lteRrc(Lte::KLTE_RRC_STATE_ATMPT_CONNECTION, Lte::KLTE_RRC_CAUSE_REEST_OTHER_FAIL_T310_EXP),
        lteRrc(Lte::KLTE_RRC_STATE_CONNECTED, Lte::KLTE_RRC_CAUSE_REEST_OTHER_FAIL_T310_EXP),
        lteRrc(Lte::KLTE_RRC_STATE_IDLE, Lte::KLTE_RRC_CAUSE_EST_FAIL_REJ)},
       {"info rrc LTE RRC IDLE (KLTE_RRC_CAUSE_NA)",
        "info rrc LTE RRC IDLE → CONNECTED (KLTE_RRC_CAUSE_EST_MO_DATA)",
        ("failure radio-link LTE RRC CONNECTED → ATMPT_CONNECTION: radio link failure, "
         "re-establishing (KLTE_RRC_CAUSE_REEST_OTHER_FAIL_T310_EXP)"),
        ("failure radio-link LTE RRC ATMPT_CONNECTION → IDLE: connection lost "
         "(KLTE_RRC_CAUSE_REL_CONN_FAIL_T311_EXP)"),
        "warning rrc LTE RRC IDLE → NULL: no service (KLTE_RRC_CAUSE_NO_SERVICE)",
        ("failure radio-link LTE RRC NULL → ATMPT_CONNECTION: radio link failure, "
         "re-establishing (KLTE_RRC_CAUSE_REEST_OTHER_FAIL_T310_EXP)"),
        ("warning radio-link LTE RRC ATMPT_CONNECTION → CONNECTED: re-established "
         "(KLTE_RRC_CAUSE_REEST_OTHER_FAIL_T310_EXP)"),
        ("failure rrc LTE RRC CONNECTED → IDLE: connection set-up failed "
         "(KLTE_RRC_CAUSE_EST_FAIL_REJ)")}},
      {"UMTS states show the cause that applies to them",
       {umtsRrc(Umts::KWCDMA_RRC_CONN_STATE_IDLE, Umts::KRRC_EST_ORIG_CONV_CALL,
                Umts::KRRC_REL_OTHER_CAUSE),
        umtsRrc(Umts::KWCDMA_RRC_CONN_STATE_ESTABLISH, Umts::KRRC_EST_ORIG_BACKGND_CALL,
                Umts::KRRC_REL_OTHER_CAUSE),
        umtsRrc(Umts::KWCDMA_RRC_CONN_STATE_CELL_DCH, Umts::KRRC_EST_ORIG_BACKGND_CALL,
                Umts::KRRC_REL_OTHER_CAUSE),
        umtsRrc(Umts::KWCDMA_RRC_CONN_STATE_RADIO_LINK_FAILURE, Umts::KRRC_EST_ORIG_BACKGND_CALL,
                Umts::KRRC_REL_OTHER_CAUSE),
        umtsRrc(Umts::KWCDMA_RRC_CONN_STATE_IDLE, Umts::KRRC_EST_ORIG_BACKGND_CALL,
                Umts::KRRC_REL_CONN_REL_LOWER_LAYER_FAILURE_DL),
        umtsRrc(Umts::KWCDMA_RRC_CONN_STATE_CELL_FACH, Umts::KRRC_EST_REGISTRATION,
                Umts::KRRC_REL_CONN_REL_LOWER_LAYER_FAILURE_DL),
        umtsRrc(Umts::KWCDMA_RRC_CONN_STATE_IDLE, Umts::KRRC_EST_REGISTRATION,
                Umts::KRRC_REL_NORMAL_EVENT)},
       {"info rrc UMTS RRC IDLE", "info rrc UMTS RRC IDLE → ESTABLISH (KRRC_EST_ORIG_BACKGND_CALL)",
        "info rrc UMTS RRC ESTABLISH → CELL_DCH",
        "failure radio-link UMTS RRC CELL_DCH → RADIO_LINK_FAILURE: radio link failure",
        ("failure radio-link UMTS RRC RADIO_LINK_FAILURE → IDLE: connection lost "
         "(KRRC_REL_CONN_REL_LOWER_LAYER_FAILURE_DL)"),
        "info rrc UMTS RRC IDLE → CELL_FACH",
        "info rrc UMTS RRC CELL_FACH → IDLE (KRRC_REL_NORMAL_EVENT)"}},
      {"serving cells: handovers when connected, reselections when idle, technology and area",
       {lteRrc(Lte::KLTE_RRC_STATE_CONNECTED, Lte::KLTE_RRC_CAUSE_EST_MO_DATA),
        lteCell(101, 1300, 7001), lteCell(101, 1300, 7001), lteCell(205, 1300, 7001),
        lteCell(205, 3050, 7001), lteRrc(Lte::KLTE_RRC_STATE_IDLE, Lte::KLTE_RRC_CAUSE_REL_OTHER),
        lteCell(17, 6300, 7002), umtsCell(12, 10700, 300), umtsCell(40, 10700, 300),
        gsmCell(21, 50, 301, KCellularGsmScellInfo::NON_DEDICATED_STATE),
        gsmCell(21, 50, 301, KCellularGsmScellInfo::DEDICATED_STATE),
        gsmCell(35, 60, 301, KCellularGsmScellInfo::DEDICATED_STATE), lteCell(17, 6300, 7002)},
       {"info rrc LTE RRC CONNECTED (KLTE_RRC_CAUSE_EST_MO_DATA)",
        "info technology LTE: camped on PCI 101 EARFCN 1300",
        "info handover LTE handover PCI 101 EARFCN 1300 → PCI 205 EARFCN 1300",
        "info handover LTE handover PCI 205 EARFCN 1300 → PCI 205 EARFCN 3050",
        "info rrc LTE RRC CONNECTED → IDLE (KLTE_RRC_CAUSE_REL_OTHER)",
        "info reselection LTE reselection PCI 205 EARFCN 3050 → PCI 17 EARFCN 6300",
        "info area Tracking area TAC 7001 → TAC 7002",
        "info technology LTE → UMTS: PSC 12 UARFCN 10700",
        "info reselection UMTS reselection PSC 12 UARFCN 10700 → PSC 40 UARFCN 10700",
        "info technology UMTS → GSM: BSIC 21 ARFCN 50", "info area Location area LAC 300 → LAC 301",
        "info rrc GSM RR NON_DEDICATED_STATE → DEDICATED_STATE",
        "info handover GSM handover BSIC 21 ARFCN 50 → BSIC 35 ARFCN 60",
        "info technology GSM → LTE: PCI 17 EARFCN 6300"}},
      {"registrations and rejects with their causes",
       {emm(Emm::KREG_STATUS_NORMAL_SERVICE, Emm::EMM_PROC_ATTACH_COMB),
        emm(Emm::KREG_STATUS_NORMAL_SERVICE, Emm::EMM_PROC_ATTACH_COMB),
        emm(Emm::KREG_STATUS_LIMITED_SERVICE, Emm::EMM_PROC_TAU,
            Emm::EMM_CAUSE_TRACKING_AREA_NOT_ALLOWED),
        mm(Emm::KREG_STATUS_LIMITED_SERVICE, KCellularMmContext::KNAS_MM_REJ_CAUSE_NONE),
        mm(Emm::KREG_STATUS_NORMAL_SERVICE, KCellularMmContext::KNAS_MM_REJ_CAUSE_NONE),
        gmm(Emm::KREG_STATUS_NORMAL_SERVICE,
            KCellularGmmContext::KNAS_MM_REG_PROC_ROUTING_AREA_UPDATE,
            KCellularMmContext::KNAS_MM_PROC_FAILURE_CAUSE_T3317_EXPIRY)},
       {"info registration EMM EMM_PROC_ATTACH_COMB: KREG_STATUS_NORMAL_SERVICE",
        "failure reject EMM reject EMM_CAUSE_TRACKING_AREA_NOT_ALLOWED (EMM_PROC_TAU)",
        "warning registration MM: KREG_STATUS_LIMITED_SERVICE",
        "info registration MM: KREG_STATUS_NORMAL_SERVICE",
        "failure registration GMM procedure failed: KNAS_MM_PROC_FAILURE_CAUSE_T3317_EXPIRY"}},
      {"secondary carriers added, activated, deactivated and removed",
       {carriers({{0, Scc::SCC_STATE_CONFIGURED_DEACTIVATED, 101, 3050}}),
        carriers({{0, Scc::SCC_STATE_ACTIVATED, 101, 3050}}),
        carriers({{0, Scc::SCC_STATE_ACTIVATED, 101, 3050, -9500},
                  {1, Scc::SCC_STATE_ACTIVATED, 101, 6300}}),
        carriers({{0, Scc::SCC_STATE_CONFIGURED_DEACTIVATED, 101, 3050},
                  {1, Scc::SCC_STATE_DECONFIGURED, 101, 6300}}),
        carriers({{0, Scc::SCC_STATE_CONFIGURED_DEACTIVATED, 202, 3050}}), carriers({})},
       {"info carrier SCC 0 added: PCI 101 EARFCN 3050",
        "info carrier SCC 0 activated: PCI 101 EARFCN 3050",
        "info carrier SCC 1 added and activated: PCI 101 EARFCN 6300",
        "info carrier SCC 0 deactivated: PCI 101 EARFCN 3050",
        "info carrier SCC 1 removed: PCI 101 EARFCN 6300",
        "info carrier SCC 0 removed: PCI 101 EARFCN 3050",
        "info carrier SCC 0 added: PCI 202 EARFCN 3050",
        "info carrier SCC 0 removed: PCI 202 EARFCN 3050"}},
      {"bearers set up and torn down, and SIM reads",
       {bearers({{1, "internet"}, {2, "ims"}}), bearers({{1, "internet"}, {2, "ims"}}),
        bearers({{1, "internet"}}), bearers({}), simFiles(3), simFiles(1)},
       {"info bearer Bearer set up: APN internet (cid 1, PDP_TYPE_IPv4v6)",
        "info bearer Bearer set up: APN ims (cid 2, PDP_TYPE_IPv4v6)",
        "info bearer Bearer torn down: APN ims (cid 2, PDP_TYPE_IPv4v6)",
        "info bearer Bearer torn down: APN internet (cid 1, PDP_TYPE_IPv4v6)",
        "info sim SIM read: 3 files", "info sim SIM read: 1 file"}},
      {"metrics the intake turns down find nothing",
       {{MetricValidator::K_LTE_RRC_STATE, Bytes{0xff, 0xff}},
        {MetricValidator::K_LTE_RLF, Bytes{0x08, 0x01}},
        {MetricValidator::K_LTE_RSRP_RSRQ_SINR, Bytes{}}},
       {}},
  };
  for (const Script& script : scripts) {
    ring.clear();
    detector.reset();
    for (const Step& step : script.steps)
      deliver(step);
    EXPECT_EQ(found(), script.expected) << script.name;
  }
}

TEST_F(DetectorsTest, EventsCarryTheRecordsTimeAndTheMetricBehindThem) {
  KCellularLteRrcState connected;
  connected.setTimestamp(kStartMs + 250);
  connected.setState(Lte::KLTE_RRC_STATE_CONNECTED);
  deliver({MetricValidator::K_LTE_RRC_STATE, connected.data()});
  // No timestamp of its own: the time of the metric before.
  deliver(carriers({{0, Scc::SCC_STATE_ACTIVATED, 1, 2}}));

  std::vector<const Event*> events = ring.newestFirst({}, 10);
  ASSERT_EQ(events.size(), 2u);
  EXPECT_EQ(events[1]->timeMs, static_cast<std::int64_t>(kStartMs + 250));
  EXPECT_EQ(events[0]->timeMs, static_cast<std::int64_t>(kStartMs + 250));
  ASSERT_TRUE(events[1]->metric);
  EXPECT_EQ(events[1]->metric->metricID, MetricValidator::K_LTE_RRC_STATE);
  EXPECT_EQ(events[1]->metric->payload, connected.data());
  EXPECT_EQ(platform::toJson(eventDictionary(*events[1])),
            "{\"id\":1,\"time_ms\":1718100000250,\"kind\":\"rrc\",\"severity\":\"info\","
            "\"text\":\"LTE RRC CONNECTED\",\"metric_id\":3952132}");
}

Event event(std::int64_t timeMs, std::string_view kind, Severity severity, std::string text = "x") {
  Event made;
  made.timeMs = timeMs;
  made.kind = kind;
  made.severity = severity;
  made.text = std::move(text);
  return made;
}

std::vector<std::uint64_t> ids(const std::vector<const Event*>& events) {
  std::vector<std::uint64_t> found;
  for (const Event* each : events)
    found.push_back(each->id);
  return found;
}

TEST(EventRingTest, KeepsTheNewestAndDropsTheOldest) {
  EventRing ring(3);
  for (int i = 0; i < 5; ++i)
    ring.add(event(i * 10, kind::kRrc, Severity::Info));
  EXPECT_EQ(ring.size(), 3u);
  EXPECT_EQ(ids(ring.newestFirst({}, 10)), (std::vector<std::uint64_t>{5, 4, 3}));
  EXPECT_EQ(ids(ring.newestFirst({}, 2)), (std::vector<std::uint64_t>{5, 4}));
  EXPECT_EQ(ring.find(2), nullptr);
  ASSERT_NE(ring.find(3), nullptr);
  EXPECT_EQ(ring.find(3)->timeMs, 20);
  EXPECT_EQ(ring.find(6), nullptr);

  // Ids go on counting after a clear, so a reader that asks for what came after the last id it
  // saw never takes a new event for an old one.
  ring.clear();
  EXPECT_EQ(ring.size(), 0u);
  EXPECT_TRUE(ring.newestFirst({}, 10).empty());
  EXPECT_EQ(ring.find(5), nullptr);
  EXPECT_EQ(ring.add(event(0, kind::kSim, Severity::Info)), 6u);
}

TEST(EventRingTest, FiltersByTimeKindSeverityAndId) {
  EventRing ring;
  ring.add(event(100, kind::kRrc, Severity::Info));
  ring.add(event(200, kind::kRadioLink, Severity::Failure));
  ring.add(event(300, kind::kHandover, Severity::Info));
  ring.add(event(400, kind::kReject, Severity::Failure));
  ring.add(event(500, kind::kRrc, Severity::Warning));

  const auto filter = [](std::optional<std::int64_t> sinceMs, std::vector<std::string_view> kinds,
                         std::vector<Severity> severities, std::optional<std::uint64_t> afterId) {
    EventFilter made;
    made.sinceMs = sinceMs;
    made.kinds = std::move(kinds);
    made.severities = std::move(severities);
    made.afterId = afterId;
    return made;
  };
  const struct {
    EventFilter filter;
    std::vector<std::uint64_t> expected;
  } cases[] = {
      {filter({}, {}, {}, {}), {5, 4, 3, 2, 1}},
      {filter(300, {}, {}, {}), {5, 4, 3}},
      {filter({}, {kind::kRrc}, {}, {}), {5, 1}},
      {filter({}, {kind::kRrc, kind::kHandover}, {}, {}), {5, 3, 1}},
      {filter({}, {}, {Severity::Failure}, {}), {4, 2}},
      {filter(150, {kind::kRrc}, {Severity::Info}, {}), {}},
      {filter({}, {}, {}, 3), {5, 4}},
      {filter({}, {}, {}, 5), {}},
  };
  for (const auto& each : cases)
    EXPECT_EQ(ids(ring.newestFirst(each.filter, 100)), each.expected);
  EXPECT_EQ(ids(ring.addedAfter(3)), (std::vector<std::uint64_t>{4, 5}));
}

TEST(EventRingTest, CutsLongTextsBetweenCharacters) {
  EventRing ring(1);
  // Two-byte characters: a cut at an odd length would split one.
  std::string text;
  for (std::size_t i = 0; i < EventRing::kMaxTextBytes; ++i)
    text += "é";
  ring.add(event(0, kind::kRrc, Severity::Info, text));
  const Event* kept = ring.find(1);
  ASSERT_NE(kept, nullptr);
  EXPECT_EQ(kept->text.size(), EventRing::kMaxTextBytes);
  EXPECT_EQ(kept->text, text.substr(0, EventRing::kMaxTextBytes));

  ring.add(event(0, kind::kRrc, Severity::Info, "a" + text));
  EXPECT_EQ(ring.find(2)->text.size(), EventRing::kMaxTextBytes - 1);
}

}  // namespace
}  // namespace events
