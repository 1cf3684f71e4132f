#include <gtest/gtest.h>

#include <boost/json/parse.hpp>
#include <boost/json/serialize.hpp>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <set>
#include <sstream>

#include "export/CsvExport.h"
#include "export/CsvText.h"
#include "export/ExportedMetric.h"
#include "export/JsonLinesExport.h"
#include "export/MetricPacket.h"
#include "export/UtcTime.h"
#include "export/testing/SimulatedDrive.h"
#include "messages/RecordFields.h"
#include "messages/Records.h"
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

class TemporaryFolder {
 public:
  TemporaryFolder() {
    std::string pattern = (std::filesystem::temp_directory_path() / "norvo-csv-XXXXXX").string();
    path_ = mkdtemp(pattern.data());
  }
  ~TemporaryFolder() { std::filesystem::remove_all(path_); }
  const std::filesystem::path& path() const { return path_; }

 private:
  std::filesystem::path path_;
};

std::string contentsOf(const std::filesystem::path& path) {
  std::ifstream file(path, std::ios::binary);
  std::ostringstream text;
  text << file.rdbuf();
  return text.str();
}

TEST(CsvText, QuotesAsRfc4180Says) {
  const std::pair<std::string_view, std::string_view> cases[] = {
      {"internet", "internet"},
      {"", ""},
      {"a,b", "\"a,b\""},
      {"say \"hi\"", "\"say \"\"hi\"\"\""},
      {"two\nlines", "\"two\nlines\""},
      {"\"", "\"\"\"\""},
  };
  for (const auto& [text, field] : cases) {
    std::string out;
    csv::appendField(out, text);
    EXPECT_EQ(out, field) << text;
  }
}

TEST(CsvText, CellsOfEachKindOfValue) {
  const std::pair<platform::Value, std::string_view> cases[] = {
      {platform::Value(), ""},
      {-98, "-98"},
      {std::uint64_t{1700000000000}, "1700000000000"},
      {true, "true"},
      {10.5, "10.5"},
      {"KLTE_RRC_STATE_IDLE", "KLTE_RRC_STATE_IDLE"},
      {platform::Bytes{0x00, 0xAB, 0x10}, "00ab10"},
      {platform::List{1, 3, 7}, "1 3 7"},
      {platform::List{}, ""},
  };
  for (const auto& [value, cell] : cases)
    EXPECT_EQ(csv::cellText(value), cell) << value.description();
}

// Bearers with awkward APNs, a nested record and a list: the files and their exact text.
TEST(CsvExport, OneFilePerKindWithListsFlattenedAndTextQuoted) {
  messages::KCellularActivatedBearerContexts bearers;
  bearers.setTimestamp(1'700'000'000'250);
  for (const char* apn : {"internet,\"corp\"\nline 2", "ims"}) {
    auto bearer = std::make_shared<messages::BearerContext>();
    bearer->setApn(std::string(apn));
    bearer->setCid(7);
    bearers.addBearerContexts(bearer);
  }
  messages::KCellularEmmContext emm;
  auto guti = std::make_shared<messages::Guti>();
  guti->setMmec(12);
  emm.setGuti(guti);
  const platform::Bytes bearerPayload = bearers.data();
  const platform::Bytes emmPayload = emm.data();
  const platform::Bytes broken{0x1A, 0x09};

  TemporaryFolder folder;
  const auto out = folder.path() / "csv";
  std::string error;
  const auto csvExport = openCsvExport(out.string(), {}, error);
  ASSERT_TRUE(csvExport) << error;
  EXPECT_TRUE(csvExport->write(
      {0x3CD50D, &bearerPayload, knownMetric(0x3CD50D), 1'700'000'000'250, 250, "car, 7"}));
  EXPECT_TRUE(csvExport->write({0x3CD50C, &emmPayload, knownMetric(0x3CD50C), 1000, 300, ""}));
  EXPECT_TRUE(csvExport->write({0x3CD50D, &broken, knownMetric(0x3CD50D), 1000, std::nullopt, ""}));
  ASSERT_TRUE(csvExport->finish(error)) << error;

  EXPECT_EQ(contentsOf(out / "KCellularActivatedBearerContexts.csv"),
            "layout,row,time,t_ms,metric_id,device,timestamp,bearer_context_count\r\n"
            "1,1,2023-11-14T22:13:20.250Z,250,3986701,\"car, 7\",1700000000250,\r\n");
  const std::string bearerRows =
      contentsOf(out / "KCellularActivatedBearerContexts.bearer_contexts.csv");
  EXPECT_EQ(bearerRows.substr(0, bearerRows.find("\r\n")),
            "layout,row,parent_row,position,time,t_ms,metric_id,device,cid,nsapi,apn,pdp_type,"
            "pdp_addr,primary_dns_type,primary_dns_addr,secondary_dns_type,secondary_dns_addr,"
            "is_addr_irat_mobile");
  EXPECT_EQ(bearerRows.substr(bearerRows.find("\r\n") + 2),
            "1,1,1,0,2023-11-14T22:13:20.250Z,250,3986701,\"car, 7\",7,,"
            "\"internet,\"\"corp\"\"\nline 2\",,,,,,,\r\n"
            "1,2,1,1,2023-11-14T22:13:20.250Z,250,3986701,\"car, 7\",7,,ims,,,,,,,\r\n");
  const std::string emmRows = contentsOf(out / "KCellularEmmContext.csv");
  EXPECT_NE(emmRows.find(",guti.mmegi,guti.mmec,guti.m_tmsi,"), std::string::npos) << emmRows;
  EXPECT_NE(emmRows.find("1,1,1970-01-01T00:00:01.000Z,300,3986700,,,"), std::string::npos);
  EXPECT_NE(emmRows.find(",,12,,"), std::string::npos) << emmRows;
  EXPECT_EQ(contentsOf(out / "undecoded.csv"),
            "layout,row,time,t_ms,metric_id,device,reason,payload\r\n"
            "1,1,1970-01-01T00:00:01.000Z,,3986701,,the payload does not decode as "
            "KCellularActivatedBearerContexts,1a09\r\n");
  EXPECT_FALSE(std::filesystem::exists(out / "KCellularLteRrcState.csv"))
      << "files appear with their first metric";
}

TEST(CsvExport, NoRecordFieldIsNamedLikeALeadingColumn) {
  const std::set<std::string_view> leading = {"layout", "row",  "parent_row", "position",
                                              "time",   "t_ms", "metric_id",  "device"};
  for (const messages::RecordClass& record : messages::recordClasses()) {
    ASSERT_FALSE(messages::recordFields(record.name).empty()) << record.name;
    for (const messages::RecordField& field : messages::recordFields(record.name))
      EXPECT_FALSE(leading.contains(field.key)) << record.name << "." << field.key;
  }
}

TEST(CsvExport, RefusesAFolderThatAFileIsIn) {
  TemporaryFolder folder;
  std::ofstream(folder.path() / "taken") << "x";
  std::string error;
  EXPECT_FALSE(openCsvExport((folder.path() / "taken").string(), {}, error));
  EXPECT_NE(error.find("cannot make the folder"), std::string::npos) << error;
}

}  // namespace
}  // namespace exporting
