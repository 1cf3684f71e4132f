// The generated records, tested through the real schemas.
#include "messages/Records.h"

#include <gtest/gtest.h>

#include "codec/Writer.h"
#include "messages/KBBMetricUtility.h"
#include "messages/Metrics.h"
#include "platform/Log.h"

namespace messages {
namespace {

using platform::Bytes;
using platform::Value;

// Builds payloads field by field, as a baseband would send them.
struct Payload {
  codec::Writer writer;
  Payload& varint(std::uint32_t field, std::uint64_t value) {
    writer.writeUint64(value, field);
    return *this;
  }
  Payload& bytes(std::uint32_t field, const Bytes& value) {
    writer.writeBytes(value, field);
    return *this;
  }
  Payload& raw(const Bytes& value) {
    for (const auto byte : value)
      writer.writeUint32(byte, codec::Writer::kBare);
    return *this;
  }
  Bytes data() const { return writer.data(); }
};

template <class Record>
std::shared_ptr<Record> decode(const Bytes& bytes, bool expectSuccess = true) {
  auto record = std::make_shared<Record>();
  codec::Reader reader(bytes);
  EXPECT_EQ(record->readFrom(reader), expectSuccess);
  return record;
}

TEST(ARecord, DecodesAnEmptyPayloadToNothingButItsPackedRuns) {
  for (const auto& recordClass : recordClasses()) {
    const auto record = recordClass.create();
    codec::Reader reader(nullptr, 0);
    EXPECT_TRUE(record->readFrom(reader)) << recordClass.name;
    for (const auto& [key, value] : record->dictionaryRepresentation()) {
      EXPECT_EQ(value, Value(platform::List{})) << recordClass.name << " " << key;
    }
  }
  const auto selResel = decode<KCellularLteSelReselCellInfo>({});
  EXPECT_EQ(selResel->dictionaryRepresentation().description(), "[\"multi_band_info\": []]");
}

TEST(ARecord, ConsumesAndLogsAFieldNumberedLikeAMetricId) {
  platform::log::Capture capture;
  const auto rrc =
      decode<KCellularLteRrcState>(Payload().varint(19, 7).varint(11788, 5).varint(2, 3).data());
  EXPECT_EQ(capture.plainLines(),
            (std::vector<std::string>{"valid metricId tag", "Unknown tag: 13:7",
                                      "valid metricId tag", "Unknown tag: 2e0c:5"}));
  EXPECT_EQ(rrc->dictionaryRepresentation().description(),
            "[\"state\": \"KLTE_RRC_STATE_CONNECTED\"]");

  // Even where the schema has a real field 19, the tag rule wins.
  const auto idle = decode<KCellularGsmIdleConfig>(Payload().varint(19, 4).data());
  EXPECT_FALSE(idle->hasCrOffset());
  const auto selResel =
      decode<KCellularLteSelReselCellInfo>(Payload().varint(19, 4).varint(54541, 9).data());
  EXPECT_FALSE(selResel->hasThreshServingLowQ());
  EXPECT_EQ(capture.count("Unknown tag: d50d:9"), 1u);

  // ...though such a field is still written when set.
  KCellularGsmIdleConfig written;
  written.setCrOffset(4);
  EXPECT_EQ(written.data(), Payload().varint(19, 4).data());
}

TEST(ARecord, AppliesTheTagRuleToTheMetricIdWhateverItsWireType) {
  platform::log::Capture capture;
  // Field 19 as length-delimited: the rule reads one varint (the length byte) and goes on.
  const Bytes payload = {0x9A, 0x01, 0x08, 0x10, 0x01};  // key (19 << 3) | 2 as a varint
  const auto rrc = decode<KCellularLteRrcState>(payload);
  EXPECT_EQ(capture.count("Unknown tag: 13:8"), 1u);
  EXPECT_EQ(rrc->state(), KCellularLteRrcState::KLTE_RRC_STATE_IDLE);
}

TEST(ARecord, WithoutTheTagRuleSkipsAMetricIdFieldSilentlyAndKeepsFullFieldNumbers) {
  platform::log::Capture capture;
  const auto scc =
      decode<SccRxMeasurement>(Payload().varint(19, 7).varint(65537, 3).varint(1, 2).data());
  EXPECT_TRUE(capture.plainLines().empty());
  EXPECT_EQ(scc->index(), 2u);
  const auto cells = decode<KCellularLteSecondaryCellMeasurements>(
      Payload().varint(19, 7).varint(65537, 3).data());
  EXPECT_FALSE(cells->hasTimestamp());
  EXPECT_TRUE(capture.plainLines().empty());
}

TEST(ARecord, WrapsFieldNumbersStopsAtAnEndGroupAndTakesScalarsAndPackedRunsAsSent) {
  EXPECT_EQ(decode<KCellularLteRrcState>(Payload().varint(65537, 42).data())->timestamp(), 42u);

  const auto ended =
      decode<KCellularLteRrcState>(Payload().varint(1, 5).raw({0x0C}).varint(2, 3).data());
  EXPECT_EQ(ended->timestamp(), 5u);
  EXPECT_FALSE(ended->hasState());

  // A known scalar is read as a varint whatever its wire type.
  EXPECT_EQ(decode<KCellularLteRrcState>({(4 << 3) | 2, 0x05})->prevStateDurMs(), 5u);

  const auto rf = decode<KCellularGsmCsRfMeasurement>(Payload().varint(5, 3).varint(5, 4).data());
  EXPECT_EQ(Value(rf->dictionaryRepresentation()).description(), "[\"cs_tx_pwr\": [-2, 2]]");
}

TEST(ARecord, KeepsWhatWasReadWhenTheInputIsCutShort) {
  // A scalar cut short is present, as 0.
  auto rrc = decode<KCellularLteRrcState>({0x08, 0x96, 0x01, 0x10, 0x83}, false);
  EXPECT_EQ(rrc->timestamp(), 150u);
  EXPECT_TRUE(rrc->hasState());
  EXPECT_EQ(rrc->state(), 0);

  // A packed value cut short is appended, as 0.
  const auto rf = decode<KCellularGsmCsRfMeasurement>({0x2A, 0x02, 0x04, 0x80}, false);
  EXPECT_EQ(rf->csTxPwrsCount(), 2u);
  EXPECT_EQ(rf->csTxPwrAtIndex(1), 0);

  // An element is in its list before it is read, and stays there.
  const auto status = decode<KCellularLteCarrierAggregationStatus>({0x12, 0x05, 0x08, 0x01}, false);
  EXPECT_EQ(status->sccListsCount(), 1u);
  EXPECT_FALSE(status->sccListAtIndex(0)->hasIndex());

  // A nested record that fails inside a region that fits.
  const auto emm = decode<KCellularEmmContext>({0x32, 0x02, 0x08, 0x80, 0x10, 0x01}, false);
  ASSERT_TRUE(emm->hasGuti());
  EXPECT_FALSE(emm->hasUpdateStatus());

  // A skip of an unknown field that cannot be skipped.
  const Bytes unskippable = {0x4E};
  EXPECT_EQ(KCellularLteRrcState::initWithData(&unskippable), nullptr);
}

TEST(ARecord, ComesOutOfInitWithDataOnlyWhenThePayloadDecodesCleanly) {
  const Bytes good = Payload().varint(2, 1).data();
  const Bytes bad = {0x10};
  ASSERT_NE(KCellularLteRrcState::initWithData(&good), nullptr);
  EXPECT_EQ(KCellularLteRrcState::initWithData(&good)->state(),
            KCellularLteRrcState::KLTE_RRC_STATE_IDLE);
  EXPECT_EQ(KCellularLteRrcState::initWithData(&bad), nullptr);
  ASSERT_NE(KCellularLteRrcState::initWithData(nullptr), nullptr);
}

TEST(AnEnum, ShowsItsNameOrTheUnknownValue) {
  const auto rrcText = [](std::uint64_t cause) {
    return Value(decode<KCellularLteRrcState>(Payload().varint(5, cause).data())
                     ->dictionaryRepresentation())
        .description();
  };
  EXPECT_EQ(rrcText(255), "[\"cause\": \"KLTE_RRC_CAUSE_NA\"]");
  EXPECT_EQ(rrcText(31), "[\"cause\": \"(unknown: 31)\"]");
  EXPECT_EQ(rrcText(0xFFFFFFFFFFFFFFFF), "[\"cause\": \"(unknown: -1)\"]");
  const auto wcdma = decode<KCellularWcdmaRrcConnectionState>(Payload().varint(2, 11).data());
  EXPECT_EQ(*wcdma->dictionaryRepresentation().find("state"), Value("(unknown: 11)"));

  const auto cell = decode<KCellularWcdmaCellInfo>(Payload().varint(8, 2).varint(14, 3).data());
  EXPECT_EQ(*cell->dictionaryRepresentation().find("wcdma_band"), Value("(unknown: 2)"));
  const auto gsmCell = decode<KCellularGsmScellInfo>(Payload().varint(8, 168).varint(11, 0).data());
  EXPECT_EQ(*gsmCell->dictionaryRepresentation().find("state"), Value("(unknown: 0)"));
}

TEST(AnEnum, ReadsAsItsDefaultWhileAbsent) {
  EXPECT_EQ(KCellularGsmScellInfo().state(), KCellularGsmScellInfo::DEDICATED_STATE);
  EXPECT_EQ(KCellularMmContext().updateStatus(), KCellularMmContext::STATUS_UPDATED);
  EXPECT_EQ(KCellularGmmContext().updateStatus(), KCellularGmmContext::GPRS_STATUS_UPDATED);
  KCellularMmContext mm;
  mm.setUpdateStatus(KCellularMmContext::STATUS_ROAMING_NOT_ALLOWED);
  mm.setHasUpdateStatus(false);
  EXPECT_EQ(mm.updateStatus(), KCellularMmContext::STATUS_UPDATED);
}

TEST(ARecord, SharesOnCopyToAndCopiesOnCopyWithZone) {
  KCellularEmmContext original;
  original.setRegStatus(KCellularEmmContext::KREG_STATUS_NO_SERVICE);
  original.setGuti(std::make_shared<Guti>());
  original.addTaiList(std::make_shared<KCellularTrackingAreaId>());

  KCellularEmmContext shallow;
  original.copyTo(shallow);
  const auto deep = original.copyWithZone();
  EXPECT_TRUE(shallow.isEqual(original));
  EXPECT_TRUE(deep->isEqual(original));

  original.guti()->setMmec(9);
  original.taiListAtIndex(0)->setTac(77);
  EXPECT_EQ(shallow.guti()->mmec(), 9u);
  EXPECT_EQ(shallow.taiListAtIndex(0)->tac(), 77u);
  EXPECT_FALSE(deep->guti()->hasMmec());
  EXPECT_FALSE(deep->taiListAtIndex(0)->hasTac());
}

// Value-by-value equality, copies, merges and the dictionary form are held against libprotobuf
// by the oracle tests; what follows is what it cannot see.
TEST(ARecord, ComparesByClassTooAndThrowsForAnIndexPastItsList) {
  EXPECT_FALSE(KCellularLteTxPower().isEqual(KCellularWcdmaTxPower()));
  KCellularWcdmaSelReselCellInfo runs;
  runs.addMultiBandInfo(1);
  EXPECT_THROW((void)runs.multiBandInfoAtIndex(1), std::out_of_range);
  EXPECT_THROW((void)KCellularEmmContext().taiListAtIndex(0), std::out_of_range);
  SecondaryComponentCarrier carrier;
  carrier.setHasUplink(false);
  EXPECT_TRUE(carrier.hasHasUplink());
}

TEST(ARecord, DescribesItselfByClassIdentityAndDictionary) {
  Guti guti;
  guti.setMmec(3);
  const std::string text = guti.description();
  EXPECT_EQ(text.rfind("<Guti: 0x", 0), 0u) << text;
  EXPECT_NE(text.find("> [\"mmec\": 3]"), std::string::npos) << text;
}

TEST(TheRecordClasses, NumberFiftySixAndMatchTheMetricTable) {
  EXPECT_EQ(recordClasses().size(), 56u);
  int withoutRule = 0;
  for (const auto& recordClass : recordClasses())
    withoutRule += recordClass.appliesMetricIdTagRule ? 0 : 1;
  EXPECT_EQ(withoutRule, 2);
  int withRecord = 0;
  for (const MetricKind& kind : kMetricKinds) {
    if (kind.recordClass.empty()) continue;
    ++withRecord;
    EXPECT_NE(recordClassNamed(kind.recordClass), nullptr) << kind.name;
  }
  EXPECT_EQ(withRecord, 31) << "every metric but the radio link failure";
}

TEST(TheMetricIdTagTable, IsTheSchemasTaggedMetricsWithTheBasebandsNames) {
  std::vector<std::pair<std::uint16_t, std::string_view>> tagged;
  for (const MetricKind& kind : kMetricKinds) {
    if (kind.tagListed) tagged.emplace_back(kind.metricID & 0xFFFF, kind.name);
  }
  std::vector<std::pair<std::uint16_t, std::string_view>> table;
  for (const auto& entry : KBBMetricUtility::metricIdTable())
    table.emplace_back(entry.metricId, entry.messageName);
  EXPECT_EQ(table, tagged);
  // Names that differ from class names only in the case of the leading "k" still name a class.
  int named = 0;
  for (const auto& entry : KBBMetricUtility::metricIdTable()) {
    std::string name(entry.messageName);
    name[0] = 'K';
    named += recordClassNamed(name) != nullptr ? 1 : 0;
  }
  EXPECT_EQ(named, 29) << "all but the radio link failure and the RSRP/RSRQ/SINR names";
}

}  // namespace
}  // namespace messages
