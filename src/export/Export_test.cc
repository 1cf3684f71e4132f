#include <gtest/gtest.h>

#include <boost/json/parse.hpp>
#include <boost/json/serialize.hpp>
#include <sstream>

#include "export/ExportedMetric.h"
#include "export/JsonLinesExport.h"
#include "export/MetricPacket.h"
#include "export/UtcTime.h"
#include "export/testing/SimulatedDrive.h"
#include "platform/Json.h"
#include "platform/Log.h"
#include "store/Dispatch.h"
#include "tarn/log/MetricLog.h"

namespace exporting {
namespace {

std::vector<tarn::log::MetricLogEntry> driveEntries(std::uint64_t durationMs) {
  std::istringstream log(testing::simulatedDriveLog(1, durationMs));
  tarn::log::MetricLogReader reader(log);
  std::vector<tarn::log::MetricLogEntry> entries;
  while (auto line = reader.next())
    entries.push_back(*line->parsed.entry);
  return entries;
}

std::string jsonLineOf(const ExportedMetric& metric, bool withPayload) {
  std::string line;
  appendJsonLine(line, metric, withPayload);
  return line;
}

TEST(MetricPacket, HeaderIsLaidOutAsDocumented) {
  std::string header;
  writeMetricPacketHeader(header, 0x3CD313, "car-7");
  const std::string expected(
      "\x00\x0C\x00\x08"
      "norvo\0\0\0"
      "\x00\x00\x00\x00"
      "\x01\x00\x00\x05"
      "\x00\x3C\xD3\x13"
      "car-7",
      29);
  EXPECT_EQ(header, expected);

  writeMetricPacketHeader(header, 0x3C0013, "");
  EXPECT_EQ(header.substr(16), std::string("\x01\x00\x00\x00\x00\x3C\x00\x13", 8));
  writeMetricPacketHeader(header, 1, std::string(70000, 'd'));
  EXPECT_EQ(header.size(), 24u + 0xFFFF) << "a device name is cut at 65535 bytes";
}

TEST(UtcTime, IsoTextInUtcWithMilliseconds) {
  const std::pair<std::int64_t, std::string_view> cases[] = {
      {0, "1970-01-01T00:00:00.000Z"},
      {1'500'000'000'000, "2017-07-14T02:40:00.000Z"},
      {951'782'400'123, "2000-02-29T00:00:00.123Z"},
      {1'700'000'000'999, "2023-11-14T22:13:20.999Z"},
      {-5, "1970-01-01T00:00:00.000Z"},
      {std::numeric_limits<std::int64_t>::max(), "9999-12-31T23:59:59.999Z"},
  };
  for (const auto& [ms, text] : cases)
    EXPECT_EQ(utcTimeText(ms), text) << ms;
}

TEST(MetricTimes, RecordTimestampThenDeliveryTimeThenTheTimeBefore) {
  const platform::Bytes stateAt42{0x08, 42, 0x10, 3};  // timestamp 42, state 3
  const platform::Bytes noTimestamp{0x10, 3};
  const auto entry = [](std::int64_t id, platform::Bytes payload, std::optional<std::int64_t> tMs) {
    return tarn::log::MetricLogEntry{{{"kKeyMetricID", id}, {"kKeyPayload", std::move(payload)}},
                                     tMs};
  };
  MetricTimes times;
  const struct {
    tarn::log::MetricLogEntry entry;
    std::int64_t timeMs;
  } cases[] = {
      {entry(0x3C4E04, stateAt42, 7), 42},
      {entry(0x3C4E04, noTimestamp, 7), 7},
      {entry(0x3C4E04, noTimestamp, std::nullopt), 7},
      {entry(0x3C4E25, stateAt42, 9), 9},             // no record: the payload is not read
      {entry(0x123456, stateAt42, std::nullopt), 9},  // no schema declares it
      {entry(0x3C4E04, {0x08, 0xFF}, 11), 11},        // cut short inside the timestamp
  };
  for (const auto& [logEntry, timeMs] : cases) {
    const auto metric = times.metricOf(logEntry.record, logEntry.deliveryMs);
    ASSERT_TRUE(std::holds_alternative<ExportedMetric>(metric));
    EXPECT_EQ(std::get<ExportedMetric>(metric).timeMs, timeMs);
  }
}

TEST(MetricTimes, RefusesEntriesWithoutAMetricToExport) {
  const platform::Dictionary records[] = {
      {{"kKeyPayload", platform::Bytes{}}},
      {{"kKeyMetricID", "3952132"}, {"kKeyPayload", platform::Bytes{}}},
      {{"kKeyMetricID", std::int64_t{1} << 32}, {"kKeyPayload", platform::Bytes{}}},
      {{"kKeyMetricID", -1}, {"kKeyPayload", platform::Bytes{}}},
      {{"kKeyMetricID", 3952132}},
  };
  MetricTimes times;
  for (const platform::Dictionary& record : records)
    EXPECT_TRUE(std::holds_alternative<std::string>(times.metricOf(record, 5)))
        << record.description();
}

// Every record kind of a drive: the timestamp read without decoding, and the JSON line's fields,
// agree with the dictionary the intake decodes.
TEST(JsonLines, AgreeWithTheIntakesDictionariesOverADrive) {
  platform::log::Capture quiet;
  MetricTimes times;
  std::set<std::string> records;
  for (const tarn::log::MetricLogEntry& entry : driveEntries(10 * 60 * 1000)) {
    const auto metric = std::get<ExportedMetric>(times.metricOf(entry.record, entry.deliveryMs));
    const boost::json::value line = boost::json::parse(jsonLineOf(metric, true));
    const store::Handler* handler = store::handlerFor(metric.metricID);
    if (handler == nullptr) {
      // A metric the intake leaves alone still shows its record, where one carries it.
      EXPECT_EQ(line.as_object().contains("fields"), metric.known->record != nullptr) << line;
      continue;
    }
    const std::optional<platform::Dictionary> intake = handler->decode(metric.payload);
    ASSERT_TRUE(intake);
    EXPECT_EQ(line.at("fields"), boost::json::parse(platform::toJson(*intake)));
    EXPECT_EQ(line.at("metric_id").as_int64(), metric.metricID);
    EXPECT_EQ(line.at("t_ms").as_int64(), *entry.deliveryMs);
    EXPECT_EQ(line.at("device").as_string(), "sim-1");
    EXPECT_EQ(line.at("time").as_string(), utcTimeText(*intake->find("timestamp")->asInteger()));
    EXPECT_EQ(metric.timeMs, *intake->find("timestamp")->asInteger());
    EXPECT_FALSE(line.at("payload").as_string().empty());
    records.insert(std::string(line.at("record").as_string()));
  }
  EXPECT_GE(records.size(), 20u) << "the drive should show most record kinds";
}

TEST(JsonLines, APayloadThatDoesNotDecodeKeepsItsLine) {
  const platform::Bytes broken{0x12, 0x05, 0x01};
  const ExportedMetric metric{0x3CD313, &broken, knownMetric(0x3CD313), 0, 250, ""};
  EXPECT_EQ(jsonLineOf(metric, false),
            R"({"time":"1970-01-01T00:00:00.000Z","t_ms":250,"metric_id":3986195,)"
            R"("record":"KCellularLteCarrierAggregationStatus","fields":null,)"
            R"("error":"the payload does not decode as KCellularLteCarrierAggregationStatus"})");
  const ExportedMetric unknown{0x3C4E25, &broken, knownMetric(0x3C4E25), 0, std::nullopt, "x"};
  EXPECT_EQ(jsonLineOf(unknown, true),
            R"({"time":"1970-01-01T00:00:00.000Z","metric_id":3952165,"record":null,)"
            R"("device":"x","payload":"EgUB"})");
}

}  // namespace
}  // namespace exporting
