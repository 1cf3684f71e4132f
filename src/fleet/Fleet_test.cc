#include "fleet/Fleet.h"

#include <gtest/gtest.h>

#include <boost/json/parse.hpp>

#include "tarn/mqtt/PublishingSource.h"

namespace fleet {
namespace {

// A record in the wire format, written field by field.
class Payload {
 public:
  Payload& varint(std::uint32_t number, std::uint64_t value) {
    key(number, 0);
    write(value);
    return *this;
  }
  Payload& sint(std::uint32_t number, std::int64_t value) {
    return varint(number, static_cast<std::uint64_t>((value << 1) ^ (value >> 63)));
  }
  Payload& nested(std::uint32_t number, const Payload& inner) {
    key(number, 2);
    write(inner.bytes_.size());
    bytes_.insert(bytes_.end(), inner.bytes_.begin(), inner.bytes_.end());
    return *this;
  }
  const platform::Bytes& bytes() const { return bytes_; }

 private:
  void key(std::uint32_t number, std::uint64_t type) { write(std::uint64_t{number} << 3 | type); }
  void write(std::uint64_t value) {
    for (; value >= 0x80; value >>= 7)
      bytes_.push_back(static_cast<std::uint8_t>(value | 0x80));
    bytes_.push_back(static_cast<std::uint8_t>(value));
  }
  platform::Bytes bytes_;
};

std::string message(std::uint32_t metricId, const Payload& payload) {
  return tarn::mqtt::metricMessage({metricId, payload.bytes()}, 0, "car", 1);
}

boost::json::object deviceIn(const Fleet& fleet, std::int64_t nowMs, std::string_view name) {
  const boost::json::value json = boost::json::parse(fleet.json(nowMs));
  for (const boost::json::value& device : json.at("devices").as_array()) {
    if (device.at("device").as_string() == name) return device.as_object();
  }
  return {};
}

TEST(AFleet, SummarisesEachDeviceFromTheMetricsAndStatusItPublishes) {
  const Payload lteCell = Payload()
                              .varint(2, 355)
                              .varint(3, 1300)
                              .varint(7, 227775233)
                              .varint(8, 3)
                              .varint(10, 2)
                              .varint(11, 1)
                              .varint(12, 1);
  const Payload lteLevels = Payload().varint(2, 1).nested(3, Payload().varint(2, 45).varint(3, 19));
  const Payload umtsCell =
      Payload().varint(4, 262).varint(5, 7).varint(7, 4242).varint(9, 10700).varint(10, 42).varint(
          13, 3);
  const Payload umtsLevels = Payload().nested(3, Payload().varint(2, 36).varint(3, 35));
  const Payload gsmCell =
      Payload().varint(4, 1).varint(5, 1).varint(7, 77).varint(9, 62).varint(10, 12);
  const Payload gsmLevels = Payload().sint(5, -81);
  const struct {
    std::string topic;
    std::string payload;
    std::vector<std::pair<std::string, std::string>> expected;  // key, text
  } steps[] = {
      {"fleet/car-1/status",
       R"({"status":"online","source":"sim, seed 1","dropped":3})",
       {{"status", "online"}, {"source", "sim, seed 1"}, {"technology", ""}}},
      {"fleet/car-1/metrics",
       message(0x3C40C2, lteCell),
       {{"technology", "LTE"},
        {"network", "001-01"},
        {"cell", "PCI 355, cell 227775233"},
        {"band", "B3"}}},
      {"fleet/car-1/metrics",
       message(0x3CD301, lteLevels),
       {{"levels", "RSRP -95 dBm, RSRQ -10 dB"}, {"band", "B3"}}},
      // Another radio: the LTE cell no longer holds.
      {"fleet/car-1/metrics",
       message(0x3CD102, umtsLevels),
       {{"technology", "UMTS"}, {"levels", "RSCP -80 dBm, Ec/No -7 dB"}, {"cell", ""}}},
      {"fleet/car-1/metrics",
       message(0x3C300C, umtsCell),
       {{"network", "262-007"}, {"cell", "PSC 42, cell 4242"}, {"band", "UARFCN 10700"}}},
      {"fleet/car-1/metrics",
       message(0x3C2E0C, gsmCell),
       {{"technology", "GSM"},
        {"network", "001-01"},
        {"cell", "BSIC 12, cell 77"},
        {"band", "ARFCN 62"}}},
      {"fleet/car-1/metrics", message(0x3CD002, gsmLevels), {{"levels", "RxLev -81 dBm"}}},
      // Metrics the page does not summarise still count, and keep what is shown.
      {"fleet/car-1/metrics",
       message(0x3C4E04, Payload().varint(2, 3)),
       {{"technology", "GSM"}, {"levels", "RxLev -81 dBm"}}},
      {"fleet/car-1/status", R"({"status":"offline"})", {{"status", "offline"}}},
  };
  Fleet fleet("fleet");
  std::int64_t now = 1000;
  for (const auto& [topic, payload, expected] : steps) {
    fleet.receive(topic, payload, now += 10);
    const boost::json::object device = deviceIn(fleet, now, "car-1");
    for (const auto& [key, text] : expected)
      EXPECT_EQ(device.at(key), text.c_str()) << key;
  }
  const boost::json::object device = deviceIn(fleet, now, "car-1");
  EXPECT_EQ(device.at("metrics"), 7);
  EXPECT_EQ(device.at("dropped"), 0);
  EXPECT_EQ(device.at("refused"), 0);
}

TEST(AFleet, CountsWhatDoesNotReadAndPassesOverOtherTopics) {
  Fleet fleet("drive/test");
  const char* const ignored[] = {"drive/test/metrics", "drive/testing/car/metrics",
                                 "drive/test/car/extra/metrics", "drive/test/car/other",
                                 "other/car/metrics"};
  for (const char* topic : ignored)
    fleet.receive(topic, "{}", 0);
  EXPECT_EQ(fleet.size(), 0u);

  for (const std::string_view bad :
       {std::string_view("not json"),
        std::string_view(R"({"kKeyMetricID":1,"kKeyPayload":"CAM="})")})
    fleet.receive("drive/test/car/metrics", bad, 0);
  fleet.receive("drive/test/car/status", "[]", 0);
  const boost::json::object device = deviceIn(fleet, 0, "car");
  EXPECT_EQ(device.at("refused"), 3);
  EXPECT_EQ(device.at("metrics"), 0);
  EXPECT_TRUE(device.at("age_ms").is_null());
  EXPECT_EQ(device.at("silent"), true);
}

TEST(AFleet, ShowsADeviceAsSilentThirtySecondsAfterItsLastMetric) {
  Fleet fleet("fleet");
  fleet.receive("fleet/car/metrics", message(0x3C4E04, Payload().varint(2, 3)), 5000);
  const struct {
    std::int64_t now;
    std::int64_t age;
    bool silent;
  } cases[] = {{5000, 0, false}, {34'999, 29'999, false}, {35'000, 30'000, true}, {4000, 0, false}};
  for (const auto& [now, age, silent] : cases) {
    const boost::json::object device = deviceIn(fleet, now, "car");
    EXPECT_EQ(device.at("age_ms"), age) << now;
    EXPECT_EQ(device.at("silent"), silent) << now;
  }
}

}  // namespace
}  // namespace fleet
