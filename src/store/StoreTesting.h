#pragma once

#include <gtest/gtest.h>

#include <cstdint>
#include <cstdlib>
#include <optional>
#include <string>

#include "platform/Log.h"
#include "platform/Value.h"
#include "store/MetricValidator.h"

namespace store::fixtures {

// 2017-07-14 02:40:00 UTC, and its text as the store shows it in UTC.
inline constexpr std::uint64_t kJuly14 = 1500000000000;
inline constexpr std::string_view kJuly14Text = "2017-07-14 02:40:00 UTC";

// A validator of its own, without a session, in a fixed time zone and locale; its log lines go
// to `log`.
class StoreTest : public ::testing::Test {
 protected:
  StoreTest() {
    // Zone names differ between locales; fix the locale before ICU first reads it.
    static const bool posixLocale = setenv("LC_ALL", "C", 1) == 0;
    EXPECT_TRUE(posixLocale);
    if (const char* tz = std::getenv("TZ")) savedTz_ = tz;
    setenv("TZ", "UTC", 1);
  }
  ~StoreTest() override {
    if (savedTz_) {
      setenv("TZ", savedTz_->c_str(), 1);
    } else {
      unsetenv("TZ");
    }
  }

  static platform::Dictionary metric(std::int64_t metricID, const codec::Codable& record) {
    return {{"kKeyMetricID", metricID}, {"kKeyPayload", record.data()}};
  }

  // Delivers a record as the session would.
  void deliver(std::int64_t metricID, const codec::Codable& record) {
    validator.metricsDidUpdate(metric(metricID, record));
  }

  platform::log::Capture log;
  MetricValidator validator{nullptr};

 private:
  std::optional<std::string> savedTz_;
};

// A row of a store list, for comparisons.
inline platform::Dictionary row(const platform::List& list, std::size_t index) {
  const platform::Dictionary* dictionary = list.at(index).asDictionary();
  return dictionary != nullptr ? *dictionary : platform::Dictionary{};
}

}  // namespace store::fixtures
