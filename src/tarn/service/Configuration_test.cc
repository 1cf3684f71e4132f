#include "tarn/service/Configuration.h"

#include <gtest/gtest.h>

#include <fstream>
#include <iterator>
#include <string>

using tarn::service::Configuration;
using tarn::service::ConfigurationError;

namespace {

std::string errorOf(std::string_view text) {
  try {
    Configuration::parse(text);
  } catch (const ConfigurationError& error) {
    return error.what();
  }
  return "(accepted)";
}

TEST(AConfiguration, ReadsOneHexMetricIdPerLineUnderTheProfileDeclaredAboveIt) {
  const Configuration configuration = Configuration::parse(
      "\xEF\xBB\xBF# field test\r\n"
      "0x3C4E04   # LTE RRC state\r\n"
      "\r\n"
      "\t0X3cd313\n"
      "profile 12\n"
      "0x3C0013");

  EXPECT_EQ(configuration.size(), 3u);
  EXPECT_EQ(configuration.profileOf(0x3C4E04), 0);
  EXPECT_EQ(configuration.profileOf(0x3CD313), 0);
  EXPECT_EQ(configuration.profileOf(0x3C0013), 12);
  EXPECT_EQ(configuration.profileOf(0x3CD30E), std::nullopt);
}

TEST(AConfiguration, NamesTheLineAndTheFaultOfAMalformedText) {
  const std::pair<std::string_view, std::string_view> cases[] = {
      {"", "the configuration is empty"},
      {"# nothing\n\n", "the configuration subscribes to no metric"},
      {"0x3C4E04\n3C4E04\n",
       "line 2: '3C4E04' is not a metric ID; write metric IDs in hex, like 0x3C4E04"},
      {"0x", "line 1: '0x' is not a metric ID; write metric IDs in hex, like 0x3C4E04"},
      {"0x3C4G04", "line 1: '0x3C4G04' is not a metric ID; write metric IDs in hex, like 0x3C4E04"},
      {"\x01\x02", "line 1: '\?\?' is not a metric ID; write metric IDs in hex, like 0x3C4E04"},
      {"0x0", "line 1: metric ID 0x0 is out of range (0x1 to 0xFFFFFFFF)"},
      {"0x100000000", "line 1: metric ID 0x100000000 is out of range (0x1 to 0xFFFFFFFF)"},
      {"0x3C4E04 0x3CD313",
       "line 1: unexpected '0x3CD313' after the metric ID; write one metric per line"},
      {"0x3C4E04\n# again\n0x3c4e04", "line 3: metric ID 0x3C4E04 is already subscribed on line 1"},
      {"profile\n0x1", "line 1: 'profile' takes one number from 0 to 2147483647"},
      {"profile -1\n0x1", "line 1: 'profile' takes one number from 0 to 2147483647"},
      {"profile 2147483648\n0x1", "line 1: 'profile' takes one number from 0 to 2147483647"},
      {"profile 1 2\n0x1", "line 1: 'profile' takes one number from 0 to 2147483647"},
  };
  for (const auto& [text, error] : cases)
    EXPECT_EQ(errorOf(text), error) << text;

  const std::string largest(Configuration::kLargestText, '#');
  EXPECT_EQ(errorOf(largest), "the configuration subscribes to no metric");
  EXPECT_EQ(errorOf(largest + "\n0x1"),
            "the configuration is 1048580 bytes long; it may be at most 1048576");
}

TEST(TheShippedConfiguration, SubscribesToEveryMetricThatTheIntakeKnows) {
  std::ifstream file(NORVO_RESOURCES_DIR "/fen_test_lte.deviceconfig", std::ios::binary);
  const std::string text{std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>()};
  const Configuration configuration = Configuration::parse(text);

  const std::uint32_t intakeMetrics[] = {
      0x3C4E18, 0x3C4E04, 0x3C40C2, 0x3C4E25, 0x3CD30E, 0x3CD301, 0x3CD302, 0x3C4F6A,
      0x3CD30B, 0x3CD313, 0x3CD310, 0x3CD30F, 0x3CD317, 0x3CD509, 0x3CD50D, 0x3CD50C,
      0x3CD50A, 0x3CD50B, 0x3CD112, 0x3CD113, 0x3C300C, 0x3CD102, 0x3CD103, 0x3CD104,
      0x3CD105, 0x3C2E0C, 0x3CD001, 0x3CD002, 0x3CD003, 0x3CD009, 0x3CD00C, 0x3C0013};
  EXPECT_EQ(configuration.size(), std::size(intakeMetrics));
  for (const std::uint32_t metricId : intakeMetrics) {
    EXPECT_TRUE(configuration.profileOf(metricId)) << std::hex << metricId;
  }
}

}  // namespace
