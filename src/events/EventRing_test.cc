#include "events/EventRing.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace events {
namespace {

Event event(std::int64_t timeMs, std::string_view kind, Severity severity, std::string text = "x") {
  Event made;
  made.timeMs = timeMs;
  made.kind = kind;
  made.severity = severity;
  made.text = std::move(text);
  return made;
}

std::vector<std::uint64_t> ids(const std::vector<const Event*>& events) {
  std::vector<std::uint64_t> found;
  for (const Event* each : events)
    found.push_back(each->id);
  return found;
}

TEST(EventRingTest, KeepsTheNewestAndDropsTheOldest) {
  EventRing ring(3);
  for (int i = 0; i < 5; ++i)
    ring.add(event(i * 10, kind::kRrc, Severity::Info));
  EXPECT_EQ(ring.size(), 3u);
  EXPECT_EQ(ids(ring.newestFirst({}, 10)), (std::vector<std::uint64_t>{5, 4, 3}));
  EXPECT_EQ(ids(ring.newestFirst({}, 2)), (std::vector<std::uint64_t>{5, 4}));
  EXPECT_EQ(ring.find(2), nullptr);
  ASSERT_NE(ring.find(3), nullptr);
  EXPECT_EQ(ring.find(3)->timeMs, 20);
  EXPECT_EQ(ring.find(6), nullptr);

  // Ids go on counting after a clear, so a reader that asks for what came after the last id it
  // saw never takes a new event for an old one.
  ring.clear();
  EXPECT_EQ(ring.size(), 0u);
  EXPECT_TRUE(ring.newestFirst({}, 10).empty());
  EXPECT_EQ(ring.find(5), nullptr);
  EXPECT_EQ(ring.add(event(0, kind::kSim, Severity::Info)), 6u);
}

TEST(EventRingTest, FiltersByTimeKindSeverityAndId) {
  EventRing ring;
  ring.add(event(100, kind::kRrc, Severity::Info));
  ring.add(event(200, kind::kRadioLink, Severity::Failure));
  ring.add(event(300, kind::kHandover, Severity::Info));
  ring.add(event(400, kind::kReject, Severity::Failure));
  ring.add(event(500, kind::kRrc, Severity::Warning));

  const auto filter = [](std::optional<std::int64_t> sinceMs, std::vector<std::string_view> kinds,
                         std::vector<Severity> severities, std::optional<std::uint64_t> afterId) {
    EventFilter made;
    made.sinceMs = sinceMs;
    made.kinds = std::move(kinds);
    made.severities = std::move(severities);
    made.afterId = afterId;
    return made;
  };
  const struct {
    EventFilter filter;
    std::vector<std::uint64_t> expected;
  } cases[] = {
      {filter({}, {}, {}, {}), {5, 4, 3, 2, 1}},
      {filter(300, {}, {}, {}), {5, 4, 3}},
      {filter({}, {kind::kRrc}, {}, {}), {5, 1}},
      {filter({}, {kind::kRrc, kind::kHandover}, {}, {}), {5, 3, 1}},
      {filter({}, {}, {Severity::Failure}, {}), {4, 2}},
      {filter(150, {kind::kRrc}, {Severity::Info}, {}), {}},
      {filter({}, {}, {}, 3), {5, 4}},
      {filter({}, {}, {}, 5), {}},
  };
  for (const auto& each : cases)
    EXPECT_EQ(ids(ring.newestFirst(each.filter, 100)), each.expected);
  EXPECT_EQ(ids(ring.addedAfter(3)), (std::vector<std::uint64_t>{4, 5}));
}

TEST(EventRingTest, CutsLongTextsBetweenCharacters) {
  EventRing ring(1);
  // Two-byte characters: a cut at an odd length would split one.
  std::string text;
  for (std::size_t i = 0; i < EventRing::kMaxTextBytes; ++i)
    text += "é";
  ring.add(event(0, kind::kRrc, Severity::Info, text));
  const Event* kept = ring.find(1);
  ASSERT_NE(kept, nullptr);
  EXPECT_EQ(kept->text.size(), EventRing::kMaxTextBytes);
  EXPECT_EQ(kept->text, text.substr(0, EventRing::kMaxTextBytes));

  ring.add(event(0, kind::kRrc, Severity::Info, "a" + text));
  EXPECT_EQ(ring.find(2)->text.size(), EventRing::kMaxTextBytes - 1);
}

}  // namespace
}  // namespace events
