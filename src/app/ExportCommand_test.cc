#include "app/ExportCommand.h"

#include <gtest/gtest.h>

#include <sstream>

#include "app/ProgressBar.h"

namespace app {
namespace {

// Remembers what it was given, and can fail like a closed pipe.
class Collect final : public exporting::MetricExport {
 public:
  explicit Collect(std::size_t failAfter = SIZE_MAX) : failAfter_(failAfter) {}
  bool write(const exporting::ExportedMetric& metric) override {
    ids.push_back(metric.metricID);
    return ids.size() < failAfter_;
  }
  bool finish(std::string&) override { return true; }

  std::vector<std::uint32_t> ids;

 private:
  const std::size_t failAfter_;
};

constexpr std::string_view kLog = R"({"kKeyMetricID":3952132,"kKeyPayload":"CAE=","t_ms":0})"
                                  "\n"
                                  "{\"kKeyMetricID\": 3952132,\n"  // 2: cut short
                                  R"({"kKeyMetricID":3952132,"kKeyPayload":"not base64!"})"
                                  "\n"
                                  R"({"kKeyPayload":"CAE="})"
                                  "\n"
                                  "\n"  // 5: blank
                                  R"({"kKeyMetricID":4294967296,"kKeyPayload":"CAE="})"
                                  "\n"
                                  R"({"kKeyMetricID":3986195})"
                                  "\r\n"
                                  R"({"kKeyMetricID":3986195,"kKeyPayload":"","t_ms":9})"
                                  "\n";

TEST(ExportMetricLog, ExportsEveryGoodLineAndReportsTheOthersByLine) {
  std::istringstream log{std::string(kLog)};
  std::ostringstream errors;
  Collect out;
  const ExportTally tally = exportMetricLog(log, "drive.jsonl", out, errors);
  EXPECT_EQ(out.ids, (std::vector<std::uint32_t>{0x3C4E04, 0x3CD313}));
  EXPECT_EQ(tally.metrics, 2u);
  EXPECT_EQ(tally.skipped, 5u);
  EXPECT_TRUE(tally.readToEnd);
  EXPECT_TRUE(tally.written);
  std::string report = errors.str();
  // The JSON parser's own words for line 2 are its business.
  const auto detail = report.find("not JSON (");
  ASSERT_NE(detail, std::string::npos) << report;
  report.erase(detail + 10, report.find(')', detail) - detail - 10);
  EXPECT_EQ(report,
            "drive.jsonl:2: not JSON (); line skipped\n"
            "drive.jsonl:3: \"kKeyPayload\" is not standard base64 text; line skipped\n"
            "drive.jsonl:4: no \"kKeyMetricID\" that is a whole number of 32 bits; line skipped\n"
            "drive.jsonl:6: no \"kKeyMetricID\" that is a whole number of 32 bits; line skipped\n"
            "drive.jsonl:7: no \"kKeyPayload\"; line skipped\n");
}

TEST(ExportMetricLog, StopsWhenTheOutputFails) {
  std::istringstream log{std::string(kLog)};
  std::ostringstream errors;
  Collect out(1);
  const ExportTally tally = exportMetricLog(log, "drive.jsonl", out, errors);
  EXPECT_FALSE(tally.written);
  EXPECT_EQ(out.ids.size(), 1u);
}

TEST(ProgressBar, RedrawsOnlyWhenTheWholePercentageMovesAndWipesItself) {
  std::ostringstream terminal;
  ProgressBar bar(terminal, 1000);
  for (const std::uint64_t done : {0u, 4u, 9u, 10u, 500u, 2000u})
    bar.update(done);
  const std::string bar0 = "\r[" + std::string(40, ' ') + "] 0%";
  const std::string bar1 = "\r[" + std::string(40, ' ') + "] 1%";
  const std::string bar50 = "\r[" + std::string(20, '#') + std::string(20, ' ') + "] 50%";
  const std::string bar100 = "\r[" + std::string(40, '#') + "] 100%";
  EXPECT_EQ(terminal.str(), bar0 + bar1 + bar50 + bar100);
  terminal.str("");
  bar.wipe();
  bar.update(1000);
  EXPECT_EQ(terminal.str(), "\r" + std::string(48, ' ') + "\r" + bar100)
      << "a wiped bar comes back with the next update";
}

TEST(ExportCommand, RefusesArgumentsThatMakeNoSense) {
  const std::vector<std::vector<std::string_view>> cases = {
      {},
      {"drive.jsonl"},
      {"drive.jsonl", "--to", "xml"},
      {"drive.jsonl", "--to", "csv"},
      {"drive.jsonl", "--to", "csv", "-o", "-"},
      {"drive.jsonl", "--to", "pcapng", "--raw"},
      {"drive.jsonl", "--to"},
      {"drive.jsonl", "other.jsonl", "--to", "jsonl"},
  };
  for (const auto& arguments : cases) {
    testing::internal::CaptureStderr();
    EXPECT_EQ(runExportCommand(arguments), 2);
    EXPECT_NE(testing::internal::GetCapturedStderr().find("usage: norvo export"),
              std::string::npos);
  }
}

}  // namespace
}  // namespace app
