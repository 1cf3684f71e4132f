// The ModemManager source on a bus of its own, against a fake ModemManager: following a modem,
// and what happens when ModemManager, the modem or polkit get in the way.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <mutex>
#include <utility>

#include "Drive.h"
#include "Eventually.h"
#include "FakeModemManager.h"
#include "PrivateBus.h"
#include "messages/Metrics.h"
#include "messages/Records.h"
#include "tarn/mm/ModemManagerSource.h"

namespace mmtest {
namespace {

using namespace std::chrono_literals;
using bustest::eventually;
using ::testing::Contains;
using ::testing::HasSubstr;
namespace ids = messages::metric;

// What the source delivers and says, as it comes.
class Seen {
 public:
  void say(const std::string& line) {
    const std::lock_guard lock(mutex_);
    lines_.push_back(line);
  }
  void deliver(tarn::service::Metric metric) {
    const std::lock_guard lock(mutex_);
    metrics_.push_back(std::move(metric));
  }
  std::vector<std::string> lines() const {
    const std::lock_guard lock(mutex_);
    return lines_;
  }
  std::size_t count(std::string_view fragment) const {
    return static_cast<std::size_t>(std::ranges::count_if(
        lines(), [&](const std::string& line) { return line.find(fragment) != line.npos; }));
  }
  bool said(std::string_view fragment) const { return count(fragment) > 0; }
  // The last metric of `metricId` decoded with `Record`, if one came.
  template <class Record>
  std::shared_ptr<Record> last(std::uint32_t metricId) const {
    const std::lock_guard lock(mutex_);
    const auto found = std::find_if(metrics_.rbegin(), metrics_.rend(), [&](const auto& metric) {
      return metric.metricId == metricId;
    });
    if (found == metrics_.rend()) return nullptr;
    return Record::initWithData(&found->payload);
  }
  void clear() {
    const std::lock_guard lock(mutex_);
    metrics_.clear();
    lines_.clear();
  }

 private:
  mutable std::mutex mutex_;
  std::vector<std::string> lines_;
  std::vector<tarn::service::Metric> metrics_;
};

class ModemManagerSourceTest : public ::testing::Test {
 protected:
  void startSource(std::string modem = {}) {
    source = std::make_unique<tarn::mm::ModemManagerSource>(
        tarn::mm::ModemManagerOptions{
            .bus = bus.address(), .modem = std::move(modem), .refresh = 100ms},
        [this](const std::string& line) { seen.say(line); });
    source->start([this](tarn::service::Metric metric) { seen.deliver(std::move(metric)); });
  }

  std::shared_ptr<messages::KCellularLteRsrpRsrqSinr> levels() const {
    return seen.last<messages::KCellularLteRsrpRsrqSinr>(ids::KCellularLteRsrpRsrqSinr);
  }

  // The serving PCI of the last LTE serving cell metric, or -1.
  std::int64_t servingPci() const {
    const auto info = seen.last<messages::KCellularLteScellInfo>(ids::KCellularLteScellInfo);
    return info && info->hasPhyCellId() ? std::int64_t{info->phyCellId()} : -1;
  }

  bustest::PrivateBus bus;
  std::unique_ptr<FakeModemManager> fake = std::make_unique<FakeModemManager>(bus.address());
  Seen seen;
  std::unique_ptr<tarn::mm::ModemManagerSource> source;  // stops first
};

TEST_F(ModemManagerSourceTest, NamesTheRefusedPolkitActionOnceAndGoesOnWithTheSignal) {
  fake->refuseDeviceControl(true);
  addServingModem(*fake, 0, kImei, 0x1A0);
  startSource();
  ASSERT_TRUE(eventually([&] { return levels() != nullptr; }));
  ASSERT_TRUE(eventually([&] { return seen.count("refused") == 2; }));
  EXPECT_THAT(seen.lines(),
              Contains("ModemManager refused GetCellInfo: this user lacks the polkit action "
                       "org.freedesktop.ModemManager1.Device.Control; docs/modemmanager.md gives "
                       "the rule that grants it. Going on with what can still be read"));
  EXPECT_TRUE(seen.said("ModemManager refused Signal.Setup"));
  // Several refreshes later, still one line each.
  seen.clear();
  ASSERT_TRUE(eventually([&] { return levels() != nullptr; }));
  ASSERT_TRUE(eventually([&] {
    return seen.last<messages::KCellularEmmContext>(ids::KCellularEmmContext) != nullptr;
  }));
  EXPECT_EQ(seen.count("refused"), 0u);
  EXPECT_EQ(fake->cellInfoCalls(0), 1u);
  EXPECT_EQ(servingPci(), -1);
  EXPECT_EQ(levels()->instValuesAtIndex(0)->rsrp0(), -97);
}

TEST_F(ModemManagerSourceTest, DropsAValueOfTheWrongTypeWithOneLineAndKeepsTheRest) {
  fake->addModem(0, lteModem(kImei));
  Entries serving = lteCell(true, 0x1A0, 1300, -97, -11);
  serving["earfcn"] = sdbus::Variant(std::string("1300"));
  fake->setCells(0, {serving});
  startSource();
  ASSERT_TRUE(eventually([&] { return servingPci() == 0x1A0 && seen.count("earfcn") == 1; }));
  EXPECT_FALSE(seen.last<messages::KCellularLteScellInfo>(ids::KCellularLteScellInfo)->hasDlFreq());
  EXPECT_THAT(seen.lines(), Contains("cell 0 \"earfcn\": wanted u, got s; dropped"));
}

TEST_F(ModemManagerSourceTest, MovesToTheNextModemWhenItsModemGoesAndStaysWithIt) {
  addServingModem(*fake, 0, kImei, 0x1A0);
  addServingModem(*fake, 1, kSecondImei, 33, 6300);
  startSource();
  ASSERT_TRUE(eventually([&] { return servingPci() == 0x1A0; }));

  fake->removeModem(0);
  ASSERT_TRUE(eventually([&] { return servingPci() == 33; }));
  EXPECT_TRUE(seen.said("modem 0 has gone away"));
  EXPECT_TRUE(seen.said("following modem 1 "));

  fake->addModem(0, lteModem(kImei));
  seen.clear();
  ASSERT_TRUE(eventually([&] { return servingPci() == 33; }));
  EXPECT_FALSE(seen.said("following"));
}

TEST_F(ModemManagerSourceTest, PicksTheModemOfAnImeiAndWaitsForIt) {
  startSource(std::string(kSecondImei));
  ASSERT_TRUE(eventually([&] { return seen.said("ModemManager has no modem 356938035643809"); }))
      << ::testing::PrintToString(seen.lines());
  addServingModem(*fake, 0, kImei, 0x1A0);
  addServingModem(*fake, 4, kSecondImei, 33, 6300);
  ASSERT_TRUE(eventually([&] { return servingPci() == 33; }));
  EXPECT_TRUE(seen.said("following modem 4 "));
}

TEST_F(ModemManagerSourceTest, WaitsForModemManagerAndFollowsItThroughARestart) {
  fake.reset();
  startSource();
  ASSERT_TRUE(eventually([&] { return seen.said("ModemManager is not running"); }));
  fake = std::make_unique<FakeModemManager>(bus.address());
  addServingModem(*fake, 0, kImei, 0x1A0);
  ASSERT_TRUE(eventually([&] { return servingPci() == 0x1A0; }));

  fake.reset();
  ASSERT_TRUE(eventually([&] { return seen.said("ModemManager has left the bus"); }));
  EXPECT_TRUE(seen.said("modem 0 has gone away"));
  fake = std::make_unique<FakeModemManager>(bus.address());
  addServingModem(*fake, 0, kImei, 17);
  EXPECT_TRUE(eventually([&] { return servingPci() == 17; }));
}

TEST_F(ModemManagerSourceTest, ReportsTheInitialEpsBearerAmongTheActiveBearers) {
  FakeModemManager::Modem modem = lteModem(kImei);
  modem.modem3gpp["InitialEpsBearer"] =
      property(sdbus::ObjectPath(FakeModemManager::bearerPath(7)));
  fake->addBearer(7,
                  {{"Connected", property(true)},
                   {"Properties", property(Entries{{"apn", sdbus::Variant(std::string("ims"))}})}});
  fake->addModem(0, std::move(modem));
  startSource();
  ASSERT_TRUE(eventually([&] {
    const auto bearers = seen.last<messages::KCellularActivatedBearerContexts>(
        ids::KCellularActivatedBearerContexts);
    return bearers && bearers->bearerContextsCount() == 1 &&
           bearers->bearerContextsAtIndex(0)->apn() == "ims";
  }));
}

TEST_F(ModemManagerSourceTest, SaysWhenTheModemIsLockedOrDisabled) {
  FakeModemManager::Modem locked = lteModem(kImei);
  locked.modem["State"] = property(std::int32_t{MM_MODEM_STATE_LOCKED});
  fake->addModem(2, std::move(locked));
  startSource();
  ASSERT_TRUE(eventually([&] { return seen.said("modem 2 is locked"); }));
  fake->set(FakeModemManager::modemPath(2), tarn::mm::kModemInterface,
            {{"State", property(std::int32_t{MM_MODEM_STATE_DISABLED})}});
  ASSERT_TRUE(
      eventually([&] { return seen.said("modem 2 is disabled; mmcli -m 2 -e enables it"); }));
  fake->set(FakeModemManager::modemPath(2), tarn::mm::kModemInterface,
            {{"State", property(std::int32_t{MM_MODEM_STATE_REGISTERED})}});
  EXPECT_TRUE(eventually([&] { return seen.said("modem 2 is enabled"); }));
}

}  // namespace
}  // namespace mmtest
