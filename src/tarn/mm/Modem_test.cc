#include <ModemManager.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cmath>
#include <limits>

#include "messages/Metrics.h"
#include "messages/Records.h"
#include "tarn/mm/Names.h"
#include "tarn/mm/Reader.h"
#include "tarn/mm/Reading.h"
#include "tarn/mm/Selection.h"
#include "tarn/mm/SimFiles.h"

namespace tarn::mm {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::SizeIs;

Value u(std::uint64_t number) {
  return {"u", number};
}
Value s(std::string text) {
  return {"s", std::move(text)};
}
Value d(double number) {
  return {"d", number};
}
Value b(bool flag) {
  return {"b", flag};
}

TEST(ReadingACell, TakesEachTechnologysKeysAndSkipsCellTypesWithoutARecord) {
  Problems problems;
  const std::optional<Cell> lte = readCell({{"cell-type", u(MM_CELL_TYPE_LTE)},
                                            {"serving", b(true)},
                                            {"operator-id", s("21034")},
                                            {"tac", s("84CD")},
                                            {"ci", s("D30156")},
                                            {"physical-ci", s("1A0")},
                                            {"earfcn", u(1300)},
                                            {"rsrp", d(-97)},
                                            {"rsrq", d(-11.5)},
                                            {"timing-advance", u(3)}},
                                           "cell 0", problems);
  Cell expected;  // LTE, with nothing of the other technologies
  expected.serving = true;
  expected.plmn = Plmn{210, 34, 2, "21034"};
  expected.tac = 0x84CD;
  expected.cellId = 0xD30156;
  expected.pci = 0x1A0;
  expected.channel = 1300;
  expected.rsrp = -97;
  expected.rsrq = -11.5;
  EXPECT_EQ(lte, expected);

  const std::optional<Cell> gsm = readCell({{"cell-type", u(MM_CELL_TYPE_GSM)},
                                            {"serving", b(false)},
                                            {"operator-id", s("310410")},
                                            {"lac", s("1F")},
                                            {"arfcn", u(62)},
                                            {"base-station-id", s("2A")},
                                            {"rx-level", u(40)}},
                                           "cell 1", problems);
  ASSERT_TRUE(gsm);
  EXPECT_EQ(gsm->plmn, (Plmn{310, 410, 3, "310410"}));
  EXPECT_EQ(gsm->bsic, 0x2Au);
  EXPECT_EQ(gsm->rxLevel, 40u);
  EXPECT_THAT(problems, IsEmpty());

  EXPECT_FALSE(readCell({{"cell-type", u(MM_CELL_TYPE_5GNR)}, {"serving", b(true)}}, "", problems));
  EXPECT_FALSE(readCell({{"cell-type", u(MM_CELL_TYPE_LTE)}}, "", problems));
  EXPECT_FALSE(readCell({{"cell-type", s("LTE")}, {"serving", b(true)}}, "cell 4", problems));
  EXPECT_THAT(problems, ElementsAre("cell 4 \"cell-type\": wanted u, got s; dropped"));
}

TEST(ReadingACell, DropsOddValuesButKeepsTheRest) {
  Problems problems;
  const std::optional<Cell> cell = readCell({{"cell-type", u(MM_CELL_TYPE_UMTS)},
                                             {"serving", b(true)},
                                             {"operator-id", s("2103")},
                                             {"lac", s("zz")},
                                             {"uarfcn", s("10700")},
                                             {"psc", u(600)},
                                             {"rscp", d(-80)},
                                             {"ecio", d(5)}},
                                            "cell 0", problems);
  Cell expected;  // the RSCP alone
  expected.rat = Rat::Umts;
  expected.serving = true;
  expected.rscp = -80;
  EXPECT_EQ(cell, expected);
  EXPECT_THAT(problems, SizeIs(5));
}

TEST(ReadingABearer, TakesAConnectedOnesSettingsAndAddresses) {
  Problems problems;
  const auto properties = std::make_shared<const Dict>(
      Dict{{"apn", s("internet")}, {"ip-type", u(MM_BEARER_IP_FAMILY_IPV4V6)}});
  const auto ip4 = std::make_shared<const Dict>(
      Dict{{"address", s("10.1.2.3")}, {"dns1", s("8.8.8.8")}, {"dns2", s("not an address")}});
  const auto ip6 = std::make_shared<const Dict>(Dict{{"address", s("2001:db8::1")}});
  const std::optional<Bearer> bearer = readBearer({{"Connected", b(true)},
                                                   {"Properties", {"a{sv}", properties}},
                                                   {"Ip4Config", {"a{sv}", ip4}},
                                                   {"Ip6Config", {"a{sv}", ip6}},
                                                   {"ProfileId", {"i", std::int64_t{-1}}}},
                                                  "Bearer 1", problems);
  ASSERT_TRUE(bearer);
  EXPECT_EQ(bearer->apn, "internet");
  EXPECT_EQ(bearer->ipFamily, static_cast<std::uint32_t>(MM_BEARER_IP_FAMILY_IPV4V6));
  EXPECT_FALSE(bearer->profileId);
  EXPECT_EQ(bearer->ip4, (platform::Bytes{10, 1, 2, 3}));
  EXPECT_THAT(bearer->ip6, ::testing::Optional(SizeIs(16)));
  EXPECT_THAT(bearer->dns, ElementsAre(platform::Bytes{8, 8, 8, 8}));
  EXPECT_THAT(problems, ElementsAre("Bearer 1 Ip4Config \"dns2\": \"not an address\" is not an IP "
                                    "address; dropped"));

  EXPECT_FALSE(readBearer({{"Connected", b(false)}}, "Bearer 2", problems));
}

TEST(ReadingTheRegistration, LeavesWhatModemManagerCallsUnknownAbsent) {
  Problems problems;
  const Registration known =
      readRegistration({{"AccessTechnologies", u(MM_MODEM_ACCESS_TECHNOLOGY_LTE)}},
                       {{"RegistrationState", u(MM_MODEM_3GPP_REGISTRATION_STATE_ROAMING)},
                        {"EpsUeModeOperation", u(MM_MODEM_3GPP_EPS_UE_MODE_OPERATION_CSPS_2)}},
                       problems);
  EXPECT_EQ(known.state, static_cast<std::uint32_t>(MM_MODEM_3GPP_REGISTRATION_STATE_ROAMING));
  EXPECT_EQ(known.epsUeMode, 4u);
  const Registration unknown =
      readRegistration({{"AccessTechnologies", u(MM_MODEM_ACCESS_TECHNOLOGY_UNKNOWN)}},
                       {{"RegistrationState", u(MM_MODEM_3GPP_REGISTRATION_STATE_UNKNOWN)},
                        {"EpsUeModeOperation", u(MM_MODEM_3GPP_EPS_UE_MODE_OPERATION_UNKNOWN)},
                        {"PacketServiceState", u(MM_MODEM_3GPP_PACKET_SERVICE_STATE_UNKNOWN)}},
                       problems);
  EXPECT_FALSE(unknown.accessTechnologies);
  EXPECT_FALSE(unknown.state);
  EXPECT_FALSE(unknown.epsUeMode);
  EXPECT_FALSE(unknown.packetService);
  EXPECT_THAT(problems, IsEmpty());
}

TEST(AReader, AnswersWellFormedValuesAndDropsTheRestWithOneLineEach) {
  const Dict dict = {
      {"rsrp", d(-97.5)},
      {"nan", d(std::nan(""))},
      {"infinite", d(std::numeric_limits<double>::infinity())},
      {"low", d(-200)},
      {"string", s("-90")},
      {"earfcn", u(6300)},
      {"big", u(1u << 20)},
      {"pci", s("1A0")},
      {"notHex", s("1G")},
      {"empty", s("")},
      {"hexTooBig", s("200")},
      {"broken", {"d", std::monostate{}}},
  };
  Problems problems;
  const Reader reader(dict, "Signal.Lte", problems);
  EXPECT_EQ(reader.real("rsrp", -156, -31), -97.5);
  EXPECT_EQ(reader.real("missing", -156, -31), std::nullopt);
  EXPECT_EQ(reader.unsignedInt("earfcn", 262143), 6300u);
  EXPECT_EQ(reader.hex("pci", 503), 0x1A0u);
  EXPECT_THAT(problems, IsEmpty());

  EXPECT_EQ(reader.real("nan", -156, -31), std::nullopt);
  EXPECT_EQ(reader.real("infinite", -156, -31), std::nullopt);
  EXPECT_EQ(reader.real("low", -156, -31), std::nullopt);
  EXPECT_EQ(reader.real("string", -156, -31), std::nullopt);
  EXPECT_EQ(reader.unsignedInt("big", 262143), std::nullopt);
  EXPECT_EQ(reader.hex("notHex", 503), std::nullopt);
  EXPECT_EQ(reader.text("empty"), std::nullopt);
  EXPECT_EQ(reader.hex("hexTooBig", 0xFF), std::nullopt);
  EXPECT_EQ(reader.real("broken", -156, -31), std::nullopt);
  EXPECT_EQ(reader.dictionary("rsrp"), nullptr);
  EXPECT_THAT(problems, ElementsAre("Signal.Lte \"nan\": not a number; dropped",
                                    "Signal.Lte \"infinite\": not a number; dropped",
                                    "Signal.Lte \"low\": -200 is outside -156 to -31; dropped",
                                    "Signal.Lte \"string\": wanted d, got s; dropped",
                                    "Signal.Lte \"big\": 1048576 is above 262143; dropped",
                                    "Signal.Lte \"notHex\": \"1G\" is not hexadecimal; dropped",
                                    "Signal.Lte \"hexTooBig\": 200 is above FF; dropped",
                                    "Signal.Lte \"rsrp\": wanted a{sv}, got d; dropped"));
}

std::map<std::string, Dict, std::less<>> modem(std::string imei) {
  return {
      {std::string(kModemInterface), Dict{{"EquipmentIdentifier", Value{"s", std::move(imei)}}}}};
}

TEST(ChoosingAModem, PicksByPathIndexOrImeiAndTheLowestIndexWithoutASelector) {
  const Objects objects = {
      {"/org/freedesktop/ModemManager1/Modem/12", modem("356938035643809")},
      {"/org/freedesktop/ModemManager1/Modem/3", modem("490154203237518")},
      {"/org/freedesktop/ModemManager1/SIM/3", {{std::string(kSimInterface), Dict{}}}},
  };
  const struct {
    std::string_view selector;
    std::optional<std::string> chosen;
  } cases[] = {
      {"", "/org/freedesktop/ModemManager1/Modem/3"},
      {"12", "/org/freedesktop/ModemManager1/Modem/12"},
      {"/org/freedesktop/ModemManager1/Modem/12", "/org/freedesktop/ModemManager1/Modem/12"},
      {"356938035643809", "/org/freedesktop/ModemManager1/Modem/12"},
      {"4", std::nullopt},
      {"/org/freedesktop/ModemManager1/SIM/3", std::nullopt},
  };
  for (const auto& test : cases)
    EXPECT_EQ(chooseModem(objects, test.selector), test.chosen) << test.selector;
  EXPECT_EQ(chooseModem({}, ""), std::nullopt);
  EXPECT_EQ(modemIndex("/org/freedesktop/ModemManager1/Modem/12"), "12");
}

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
