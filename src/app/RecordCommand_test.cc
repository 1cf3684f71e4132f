#include "app/RecordCommand.h"

#include <gtest/gtest.h>

#include <sstream>
#include <string>

#include "app/IntakeCommand.h"
#include "platform/Json.h"
#include "platform/Log.h"
#include "store/MetricValidator.h"
#include "store/StoreDump.h"

using namespace std::chrono_literals;

namespace app {
namespace {

using store::MetricValidator;

constexpr const char* kShippedConfiguration = NORVO_RESOURCES_DIR "/fen_test_lte.deviceconfig";

TEST(RecordCommand, ARecordingFedToTheIntakeFillsTheStoreAsTheLiveMetricsDid) {
  platform::log::Capture log;
  MetricValidator live(nullptr);
  std::stringstream recording;
  const RecordingRun run{.service = {}, .seed = 7, .speed = 30.0, .duration = 1500ms};
  ASSERT_TRUE(runRecordingSession(run, kShippedConfiguration,
                                  std::make_shared<MetricRecorder>(recording, &live)));

  const std::string text = recording.str();
  tarn::log::MetricLogReader reader(recording);
  std::int64_t lastMs = 0;
  std::size_t lines = 0;
  while (const auto line = reader.next()) {
    ASSERT_TRUE(line->parsed.entry) << line->parsed.error;
    const std::int64_t deliveryMs = line->parsed.entry->deliveryMs.value();
    EXPECT_GE(deliveryMs, lastMs);
    lastMs = deliveryMs;
    ++lines;
  }
  // The SIM files answer the query, and 45 s of drive bring many more metrics.
  EXPECT_GT(lines, 10u);
  EXPECT_NE(text.find("\"kKeyMetricID\":3932179,"), std::string::npos);

  MetricValidator replayed(nullptr);
  std::istringstream input(text);
  std::ostringstream errors;
  EXPECT_TRUE(deliverMetricLog(input, "recording.jsonl", replayed, errors));
  EXPECT_EQ(errors.str(), "");
  EXPECT_EQ(platform::toJson(store::dumpStore(replayed)), platform::toJson(store::dumpStore(live)));
}

TEST(RecordCommand, RefusesArgumentsItCannotUse) {
  for (const auto& arguments : std::vector<std::vector<std::string_view>>{
           {"a.jsonl", "--seconds", "0"},
           {"a.jsonl", "--seed", "-1"},
           {"a.jsonl", "--speed", "0"},
           {"a.jsonl", "--seed", "2", "--service", "dbus"},
       }) {
    EXPECT_EQ(runRecordCommand(arguments), 2) << arguments.back();
  }
}

}  // namespace
}  // namespace app
