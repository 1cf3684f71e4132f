#include <gtest/gtest.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <set>
#include <sstream>

#include "export/CsvExport.h"
#include "export/CsvText.h"
#include "messages/RecordFields.h"
#include "messages/Records.h"

namespace exporting {
namespace {

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
      {"cr\r", "\"cr\r\""},
      {"\"", "\"\"\"\""},
      {" spaced ", " spaced "},
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
