// The fake modem's scripted drive end to end: through tarnd --source modemmanager on a bus of
// its own and a client's store, and through the service built into norvo. The store must show
// ModemManager's own dBm and dB again, value by value.
#include "Drive.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <stdlib.h>

#include <csignal>
#include <functional>

#include "FakeModemManager.h"
#include "PrivateBus.h"
#include "StoreValues.h"
#include "Tarnd.h"
#include "TemporaryFolder.h"
#include "app/ServiceOption.h"
#include "client/TarnWrapper.h"
#include "platform/MainQueue.h"
#include "screens/SecondLevelViewController.h"
#include "store/MetricValidator.h"
#include "tarn/client/Transport.h"
#include "tarn/dbus/BusTransport.h"
#include "tarn/mm/ModemManagerSource.h"

namespace mmtest {
namespace {

using namespace std::chrono_literals;
using store::MetricValidator;
namespace mm = tarn::mm;

constexpr auto kStepTimeout = 20s;

// A client session whose metrics fill a store of its own, as the viewer's do.
class StoreSession {
 public:
  // Over the transport the application chose, or over `transport`.
  StoreSession() { start(); }
  explicit StoreSession(tarn::client::Transport& transport) : session_(transport) { start(); }

  MetricValidator& store() { return *store_; }

  // Runs the main queue until `shown` holds for the store.
  bool shows(const std::function<bool(const MetricValidator&)>& shown) {
    return platform::runMainQueueUntil([&] { return shown(*store_); }, kStepTimeout);
  }
  // Runs the main queue until the store shows every one of `values`.
  bool shows(std::initializer_list<Shown> values) {
    return shows([values](const MetricValidator& store) { return showsAll(store, values); });
  }

 private:
  void start() {
    session_.setDelegate(store_);
    EXPECT_TRUE(session_.addVelaConfigForAppId("vexmora",
                                               NORVO_RESOURCES_DIR "/fen_test_lte.deviceconfig"));
    session_.listen();
  }

  std::shared_ptr<MetricValidator> store_ = std::make_shared<MetricValidator>(nullptr);
  TarnWrapper session_;
};

// The rows, name and value, that the detail screen of `launch` and `item` shows.
std::vector<std::pair<std::string, std::string>> screenRows(MetricValidator& store,
                                                            std::string launch, std::string item) {
  SecondLevelViewController screen(store);
  screen.tableView().registerPrototype(
      ui::TableViewCell("SecondClickView", ui::CellStyle::RightDetail));
  screen.setFirstSelection(std::move(launch));
  screen.setSeguedThroughRow(std::move(item));
  screen.tableView().reloadData();
  std::vector<std::pair<std::string, std::string>> rows;
  for (const auto& section : screen.tableView().sections()) {
    for (const auto& cell : section.cells)
      rows.emplace_back(cell->textLabel()->text.value_or(""),
                        cell->detailTextLabel()->text.value_or(""));
  }
  return rows;
}

using Row = std::pair<std::string, std::string>;

// Plays the drive on `fake` and checks each step in `session`'s store. Changes of the cells show
// at the source's next reading of them: `withCellChanges` costs a refresh period each.
void driveAndCheck(FakeModemManager& fake, StoreSession& session, bool withCellChanges) {
  const std::string modem = FakeModemManager::modemPath(0);
  // LTE with neighbours of all three technologies, ModemManager's own dBm and dB shown again.
  ASSERT_TRUE(session.shows({{"myLTESCellInfoDict/phy_cell_id", 0x1A0},
                             {"myLTESCellInfoDict/tracking_area_code", 0x84CD},
                             {"myLTESCellInfoDict/sel_plmn_mnc", 34},
                             {"myLTE/EutraNbrsMeas/nbr_rsrp", -105},
                             {"myLTE/EutraNbrsMeas/nbr_rsrq", -14.5},
                             {"myLTE/EutraNbrsMeas/freq_band_ind", 20},  // EARFCN 6300
                             {"myLTE/UtraNbrsMeas/rscp", -90},
                             {"myLTE/UtraNbrsMeas/ecno", -7.5},
                             {"myLTE/GeraNbrsMeas/rxlev", -80},
                             {"myLTE/RsrpRsrqSinr/rsrp0", -97},
                             {"myLTE/RsrpRsrqSinr/rsrq0", -11},
                             {"myLTE/RsrpRsrqSinr/sinr0", 12.5}}));
  EXPECT_EQ(fake.setupRate(0), 1u);
  // The serving cell's tracking area, its PLMN 210-34 in NAS's three bytes.
  ASSERT_TRUE(session.shows([](const MetricValidator& store) {
    return valueAt(store, "myLTEEMMContextDict/reg_status") ==
           platform::Value("KREG_STATUS_NORMAL_SERVICE");
  }));
  EXPECT_THAT(valueAt(session.store(), "myLTEEMMContextDict/tai_list")->asString(),
              ::testing::Pointee(::testing::HasSubstr("\"tac\": 33997")));
  // Nothing that ModemManager does not report: no bandwidth, no second antenna.
  EXPECT_EQ(valueAt(session.store(), "myLTESCellInfoDict/dl_bw"), std::nullopt);
  EXPECT_EQ(valueAt(session.store(), "myLTE/RsrpRsrqSinr/rsrp1"), std::nullopt);

  // The screens show it as they show a phone's.
  EXPECT_THAT(screenRows(session.store(), "LTE", "Serving Cell Info"),
              ::testing::IsSupersetOf({Row{"phy_cell_id", "416"}, Row{"dl_freq", "1300"},
                                       Row{"freq_band_ind", "3"}, Row{"sel_plmn_mcc", "210"}}));
  EXPECT_THAT(screenRows(session.store(), "LTE", "LTE Neighbor Cell Meas"),
              ::testing::IsSupersetOf({Row{"nbr_phys_cell_id", "17"}, Row{"nbr_rsrp", "-105"},
                                       Row{"nbr_rsrq", "-14.5"}}));

  if (withCellChanges) {
    // A handover to PCI 17.
    fake.setCells(0, {lteCell(true, 17, 1300, -92, -10), lteCell(false, 0x1A0, 1300, -104, -13)});
    ASSERT_TRUE(session.shows({{"myLTESCellInfoDict/phy_cell_id", 17}}));

    // A drop to UMTS.
    fake.setCells(0,
                  {umtsCell(true, 300, 10700, -85, -6), gsmCell(false, 62, 42, 30),
                   umtsCell(false, 301, 10713, -101, -12.5), lteCell(false, 5, 6300, -110, -16)});
    fake.set(modem, mm::kSignalInterface,
             {{"Lte", property(Entries{})},
              {"Umts", property(Entries{{"rscp", sdbus::Variant(-85.0)},
                                        {"ecio", sdbus::Variant(-6.0)},
                                        {"rssi", sdbus::Variant(-60.0)}})}});
    fake.set(modem, mm::kModemInterface,
             {{"AccessTechnologies", property(std::uint32_t{MM_MODEM_ACCESS_TECHNOLOGY_UMTS})}});
    // A WCDMA receive measurement is shown as the baseband reports it: as indexes.
    ASSERT_TRUE(session.shows({{"myUMTSCellInfoDict/psc", 300},
                               {"myUMTSCellInfoDict/dl_uarfcn", 10700},
                               {"myUMTSCellInfoDict/mnc", 34},
                               {"myUMTS/rXInfo/rsrp_range", -85 + 116},
                               {"myUMTS/rXInfo/rsrq_range", (-6 + 24.5) * 2},
                               {"myUMTS/utraNbrMeas/rscp", -101},
                               {"myUMTS/utraNbrMeas/ecno", -12.5},
                               {"myUMTS/eUtraNbrMeas/rsrp", -110},
                               {"myUMTS/geraNbrMeas/rxlev", -80}}));
    EXPECT_EQ(valueAt(session.store(), "myUMTSCellInfoDict/wcdma_band"),
              platform::Value("SYS_BAND_WCDMA_I_IMT_2000"));

    // And on to GSM.
    fake.setCells(0, {gsmCell(true, 62, 42, 33), umtsCell(false, 301, 10700, -106, -21.5),
                      gsmCell(false, 70, 10, 20), lteCell(false, 5, 6300, -120, -18.5)});
    fake.set(modem, mm::kSignalInterface,
             {{"Umts", property(Entries{})},
              {"Gsm", property(Entries{{"rssi", sdbus::Variant(-77.0)}})}});
    ASSERT_TRUE(session.shows({{"myGSMScellInfoDict/arfcn", 62},
                               {"myGSMScellInfoDict/bsic", 42},
                               {"myGSMIdleScellMeasDict/idle_rxlev_dBm", -77},
                               {"myGSM/geraNbrMeas/rxlev", -90},
                               {"myGSM/utraNbrMeas/cpich_rscp", -106},
                               {"myGSM/utraNbrMeas/cpich_ecn0", -21.5},
                               {"myGSM/eUtraNbrMeas/rsrp", -120}}));
    EXPECT_EQ(valueAt(session.store(), "myGSMScellInfoDict/gsm_band"),
              platform::Value("SYS_BAND_GSM_PGSM_900"));

    EXPECT_THAT(screenRows(session.store(), "GSM", "Serving Cell Info"),
                ::testing::IsSupersetOf({Row{"arfcn", "62"}, Row{"bsic", "42"}}));
  }

  // A bearer comes up...
  fake.addBearer(
      1, {{"Connected", property(true)},
          {"ProfileId", property(std::int32_t{1})},
          {"Properties",
           property(Entries{{"apn", sdbus::Variant(std::string("internet"))},
                            {"ip-type", sdbus::Variant(std::uint32_t{MM_BEARER_IP_FAMILY_IPV4})}})},
          {"Ip4Config", property(Entries{{"address", sdbus::Variant(std::string("10.1.2.3"))},
                                         {"dns1", sdbus::Variant(std::string("8.8.8.8"))},
                                         {"dns2", sdbus::Variant(std::string("1.1.1.1"))}})}});
  fake.set(modem, mm::kModemInterface,
           {{"Bearers", property(std::vector<sdbus::ObjectPath>{
                            sdbus::ObjectPath(FakeModemManager::bearerPath(1))})}});
  ASSERT_TRUE(session.shows([](const MetricValidator& store) {
    return valueAt(store, "myCommon/activeBearer/apn") == platform::Value("internet") &&
           shownAt(store, "myCellularActiveBearerDict/bearer_context_count") == 1;
  }));
  const std::pair<std::string_view, platform::Value> bearer[] = {
      {"pdp_type", "PDP_TYPE_IPv4"},
      {"pdp_addr", platform::Bytes{10, 1, 2, 3}},
      {"secondary_dns_addr", platform::Bytes{1, 1, 1, 1}}};
  for (const auto& [key, expected] : bearer)
    EXPECT_EQ(valueAt(session.store(), "myCommon/activeBearer/" + std::string(key)), expected)
        << key;
  EXPECT_EQ(shownAt(session.store(), "myCommon/activeBearer/cid"), 1);
  // ...and goes down.
  fake.set(FakeModemManager::bearerPath(1), mm::kBearerInterface, {{"Connected", property(false)}});
  ASSERT_TRUE(session.shows({{"myCellularActiveBearerDict/bearer_context_count", 0}}));

  // The SIM is reported.
  fake.addSim(0, {{"SimIdentifier", property(std::string("8931041010654378930"))},
                  {"Imsi", property(std::string("310410123456789"))},
                  {"OperatorName", property(std::string("Norvo"))}});
  fake.set(modem, mm::kModemInterface,
           {{"Sim", property(sdbus::ObjectPath(FakeModemManager::simPath(0)))}});
  ASSERT_TRUE(session.shows([](const MetricValidator& store) {
    return store.myCommon().simContents.size() == 3 &&
           shownAt(store, "myCommon/simContents/ef_id") == 0x2FE2;
  }));
}

void addDriveModem(FakeModemManager& fake) {
  fake.addModem(0, lteModem(kImei));
  fake.setCells(0, {lteCell(true, 0x1A0, 1300, -97, -11), lteCell(false, 17, 6300, -105, -14.5),
                    umtsCell(false, 300, 10700, -90, -7.5), gsmCell(false, 62, 42, 30)});
}

// DBUS_SYSTEM_BUS_ADDRESS, pointed at a test's bus while this lives.
class SystemBusAt {
 public:
  explicit SystemBusAt(const std::string& address) {
    if (const char* saved = std::getenv(kVariable)) saved_ = saved;
    setenv(kVariable, address.c_str(), 1);
  }
  ~SystemBusAt() {
    if (saved_) {
      setenv(kVariable, saved_->c_str(), 1);
    } else {
      unsetenv(kVariable);
    }
  }

 private:
  static constexpr const char* kVariable = "DBUS_SYSTEM_BUS_ADDRESS";
  std::optional<std::string> saved_;
};

TEST(TheFakeModemsDrive, ReachesAClientsStoreThroughTarnd) {
  bustest::TemporaryFolder folder;
  bustest::PrivateBus bus;
  FakeModemManager fake(bus.address());
  addDriveModem(fake);
  std::unique_ptr<bustest::ChildProcess> tarnd;
  {
    SystemBusAt systemBus(bus.address());
    tarnd = bustest::startTarnd(bus.address(), {"--source", "modemmanager", "--refresh", "1"},
                                folder / "tarnd");
  }
  ASSERT_TRUE(bus.waitForName("org.norvo.Tarn1", true)) << tarnd->standardError();
  tarn::dbus::BusTransport transport(bus.address());
  {
    // The cells' changes read every second, as tarnd's refresh goes, run through the service
    // built into norvo below; the records take the same way over the bus whatever they hold.
    StoreSession session(transport);
    driveAndCheck(fake, session, false);
  }
  EXPECT_EQ(tarnd->stop(SIGTERM, 10s), 0) << tarnd->standardError();
  EXPECT_NE(tarnd->standardError().find("tarnd: modemmanager: following modem 0 "
                                        "(/org/freedesktop/ModemManager1/Modem/0, Fake EG25, "
                                        "490154203237518)"),
            std::string::npos)
      << tarnd->standardError();
}

TEST(TheFakeModemsDrive, ReachesTheStoreThroughTheServiceBuiltIntoNorvo) {
  bustest::PrivateBus bus;
  FakeModemManager fake(bus.address());
  addDriveModem(fake);
  app::useService(app::ServiceChoice{},
                  std::make_shared<mm::ModemManagerSource>(
                      mm::ModemManagerOptions{.bus = bus.address(), .modem = {}, .refresh = 200ms},
                      [](const std::string&) {}));
  {
    StoreSession session;
    driveAndCheck(fake, session, true);
  }
  tarn::client::useTransport(nullptr);
}

}  // namespace
}  // namespace mmtest
