#include <gtest/gtest.h>
#include <unicode/locid.h>
#include <unicode/smpdtfmt.h>
#include <unicode/timezone.h>

#include <cmath>
#include <cstdlib>
#include <limits>
#include <memory>
#include <string>

#include "platform/Base64.h"
#include "platform/DateFormat.h"

namespace platform {
namespace {

constexpr std::string_view kPattern = "yyyy-MM-dd HH:mm:ss zzz";

// The texts below are those of the root locale's conventions; fix the locale before ICU first
// reads it.
const bool kPosixLocale = setenv("LC_ALL", "C", 1) == 0;

class DateFormatTest : public testing::Test {
 protected:
  void SetUp() override {
    ASSERT_TRUE(kPosixLocale);
    const char* tz = std::getenv("TZ");
    savedTz_ = tz ? std::optional<std::string>(tz) : std::nullopt;
    useZone("UTC");
  }
  void TearDown() override {
    if (savedTz_) {
      setenv("TZ", savedTz_->c_str(), 1);
    } else {
      unsetenv("TZ");
    }
  }
  static void useZone(const char* zone) { setenv("TZ", zone, 1); }

 private:
  std::optional<std::string> savedTz_;
};

TEST_F(DateFormatTest, FormatsTheEpochAndDropsFractionsOfASecond) {
  EXPECT_EQ(formatDate(0, kPattern), "1970-01-01 00:00:00 UTC");
  EXPECT_EQ(formatDate(1500, kPattern), "1970-01-01 00:00:01 UTC");
  EXPECT_EQ(formatDate(1000, kPattern), formatDate(1999, kPattern));
  EXPECT_EQ(formatDate(-1, kPattern), "1969-12-31 23:59:59 UTC");
}

TEST_F(DateFormatTest, ShowsAChangeOfTimeZoneInTheNextCall) {
  EXPECT_EQ(formatDate(1500000000000, kPattern), "2017-07-14 02:40:00 UTC");
  useZone("America/New_York");
  EXPECT_EQ(formatDate(1500000000000, kPattern), "2017-07-13 22:40:00 EDT");
  EXPECT_EQ(formatDate(1484000000000, kPattern), "2017-01-09 17:13:20 EST");
  useZone("Asia/Tokyo");
  EXPECT_EQ(formatDate(1500000000000, kPattern), "2017-07-14 11:40:00 GMT+9");
  useZone("UTC");
  EXPECT_EQ(formatDate(1500000000000, kPattern), "2017-07-14 02:40:00 UTC");
}

TEST_F(DateFormatTest, AnswersNothingForTimesNoCalendarShows) {
  EXPECT_FALSE(formatDate(std::nan(""), kPattern));
  EXPECT_FALSE(formatDate(std::numeric_limits<double>::infinity(), kPattern));
  EXPECT_FALSE(formatDate(1.8446744073709552e19, kPattern));  // the largest uint64 count
  EXPECT_TRUE(formatDate(8.64e15, kPattern));
  EXPECT_TRUE(formatDate(-8.64e15, kPattern));
}

TEST_F(DateFormatTest, FollowsThePatternItIsGiven) {
  EXPECT_EQ(formatDate(1500000000123, "HH:mm:ss.SSS"), "02:40:00.123");
  EXPECT_EQ(formatDate(1500000000123, kPattern), "2017-07-14 02:40:00 UTC");
}

// What ICU itself makes of a time: a formatter of its own, which keeps nothing from one text to
// the next.
std::unique_ptr<icu::SimpleDateFormat> referenceFormatter(std::string_view pattern,
                                                          const char* zone) {
  UErrorCode status = U_ZERO_ERROR;
  auto formatter = std::make_unique<icu::SimpleDateFormat>(
      icu::UnicodeString::fromUTF8(std::string(pattern)), icu::Locale::getDefault(), status);
  formatter->adoptTimeZone(icu::TimeZone::createTimeZone(zone));
  return formatter;
}

std::string referenceText(const icu::SimpleDateFormat& formatter, double milliseconds) {
  icu::UnicodeString text;
  formatter.format(milliseconds, text);
  std::string result;
  return text.toUTF8String(result);
}

// The formatter is reused within a minute; whatever the zone, locale and pattern, what it gives
// must be what ICU's own gives.
TEST_F(DateFormatTest, ReusesItsWorkWithoutChangingAnyText) {
  const char* zones[] = {
      "UTC",           "Europe/Berlin", "Asia/Kolkata", "Australia/Lord_Howe", "America/St_Johns",
      "Asia/Kathmandu"};
  const char* locales[] = {"en_US", "ar_EG", "th_TH", "fa_IR", "de_DE", "ja_JP@calendar=japanese"};
  const std::string_view patterns[] = {kPattern, "HH:mm", "s", "h:mm:ss a zzzz", "ss.SS"};
  const icu::Locale saved = icu::Locale::getDefault();
  // Around DST changes, before railway time (offsets with seconds), and ordinary days.
  const double times[] = {1711846740000, 1729990740000, -2524525200000, 1500000000000, -1,
                          1699999999999, 1712464140000};
  for (const char* locale : locales) {
    UErrorCode status = U_ZERO_ERROR;
    icu::Locale::setDefault(icu::Locale(locale), status);
    for (const char* zone : zones) {
      useZone(zone);
      for (const std::string_view pattern : patterns) {
        const auto reference = referenceFormatter(pattern, zone);
        for (const double start : times) {
          for (double offset = 0; offset < 150000; offset += 7300) {
            const double at = start + offset;
            ASSERT_EQ(formatDate(at, pattern), referenceText(*reference, at))
                << locale << " " << zone << " " << pattern << " " << at;
          }
        }
      }
    }
  }
  UErrorCode status = U_ZERO_ERROR;
  icu::Locale::setDefault(saved, status);
}

Bytes bytesOf(std::string_view text) {
  return Bytes(text.begin(), text.end());
}

TEST(Base64, EncodesTheRfcExamplesWithPadding) {
  EXPECT_EQ(base64Encode(bytesOf("")), "");
  EXPECT_EQ(base64Encode(bytesOf("f")), "Zg==");
  EXPECT_EQ(base64Encode(bytesOf("fo")), "Zm8=");
  EXPECT_EQ(base64Encode(bytesOf("foo")), "Zm9v");
  EXPECT_EQ(base64Encode(Bytes{0xFB, 0xFF, 0xBF}), "+/+/");
}

TEST(Base64, DecodesWhatItEncodesForEveryByteValueAndLength) {
  Bytes bytes;
  for (int i = 0; i < 256; ++i) {
    bytes.push_back(static_cast<std::uint8_t>(255 - i));
    EXPECT_EQ(base64Decode(base64Encode(bytes)), bytes) << "length " << bytes.size();
  }
}

TEST(Base64, RefusesTextThatIsNotStandardBase64) {
  EXPECT_FALSE(base64Decode("Zg="));       // length not a multiple of four
  EXPECT_FALSE(base64Decode("Zg"));        // padding left out
  EXPECT_FALSE(base64Decode("Z=g="));      // padding inside
  EXPECT_FALSE(base64Decode("Zm9v\n"));    // whitespace
  EXPECT_FALSE(base64Decode("-_8A"));      // the URL-safe alphabet
  EXPECT_FALSE(base64Decode("Zg==Zg=="));  // padding before the end
  EXPECT_EQ(base64Decode(""), Bytes{});
}

}  // namespace
}  // namespace platform
