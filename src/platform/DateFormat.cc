#include "platform/DateFormat.h"

#include <sys/stat.h>
#include <unicode/fieldpos.h>
#include <unicode/fpositer.h>
#include <unicode/locid.h>
#include <unicode/smpdtfmt.h>
#include <unicode/timezone.h>
#include <unicode/udat.h>
#include <unicode/unistr.h>

#include <array>
#include <cmath>
#include <cstdint>
#include <cstdlib>
#include <ctime>
#include <memory>

namespace platform {

namespace {

// Dates as far as 100,000,000 days either side of 1970, the range that calendars agree on.
constexpr double kLimitMilliseconds = 8.64e15;
constexpr std::int64_t kMillisecondsPerSecond = 1000;
constexpr std::int64_t kMillisecondsPerMinute = 60 * kMillisecondsPerSecond;

constexpr const char* kSystemZoneFile = "/etc/localtime";

std::string utf8(const icu::UnicodeString& text) {
  std::string result;
  text.toUTF8String(result);
  return result;
}

std::int64_t floorDivide(std::int64_t dividend, std::int64_t divisor) {
  const std::int64_t quotient = dividend / divisor;
  return quotient * divisor > dividend ? quotient - 1 : quotient;
}

// What decides the current time zone: TZ when set, otherwise the system's zone file. Cheap to
// check on every call, unlike asking ICU to detect the zone.
struct ZoneSource {
  bool tzSet = false;
  std::string tz;
  dev_t device = 0;
  ino_t inode = 0;
  timespec modified{};

  static ZoneSource current() {
    ZoneSource source;
    if (const char* tz = std::getenv("TZ")) {
      source.tzSet = true;
      source.tz = tz;
    } else {
      source.readZoneFile();
    }
    return source;
  }

  // Whether this is still the current source; compares TZ in place, without a copy.
  bool isCurrent() const {
    const char* tzNow = std::getenv("TZ");
    if (tzNow != nullptr || tzSet) return tzNow != nullptr && tzSet && tz == tzNow;
    ZoneSource now;
    now.readZoneFile();
    return device == now.device && inode == now.inode && modified.tv_sec == now.modified.tv_sec &&
           modified.tv_nsec == now.modified.tv_nsec;
  }

 private:
  void readZoneFile() {
    if (struct stat status{}; stat(kSystemZoneFile, &status) == 0) {
      device = status.st_dev;
      inode = status.st_ino;
      modified = status.st_mtim;
    }
  }
};

// An ICU formatter for one pattern, zone and locale. ICU takes microseconds per text, so within
// one local minute the text is made once: the seconds, when the pattern shows them, are spliced
// into it from a table of their 60 texts. Patterns that show fractions of a second are formatted
// afresh every time.
class Formatter {
 public:
  // Empty when ICU refuses the pattern.
  static std::unique_ptr<Formatter> make(std::string_view pattern, const icu::Locale& locale) {
    UErrorCode status = U_ZERO_ERROR;
    auto formatter = std::make_unique<icu::SimpleDateFormat>(
        icu::UnicodeString::fromUTF8(
            icu::StringPiece(pattern.data(), static_cast<std::int32_t>(pattern.size()))),
        locale, status);
    if (U_FAILURE(status)) return nullptr;
    // The C library and ICU both read the zone afresh here.
    tzset();
    formatter->adoptTimeZone(icu::TimeZone::detectHostTimeZone());
    return std::unique_ptr<Formatter>(new Formatter(std::move(formatter)));
  }

  std::string format(double millisecondsSince1970) {
    // Records often share one time: a list's elements carry their parent's.
    if (millisecondsSince1970 != lastTime_) {
      writeText(millisecondsSince1970);
      lastTime_ = millisecondsSince1970;
    }
    return lastText_;
  }

 private:
  enum class Reuse {
    Whole,          // nothing finer than minutes shows
    SpliceSeconds,  // one seconds field and nothing finer
    None,           // fractions of a second, or seconds more than once
  };

  // One local minute, from startMs (UTC) on, as text split around its seconds field; all of it
  // is in `after` when the pattern shows no seconds.
  struct Minute {
    std::int64_t startMs;
    std::string before;
    std::string after;

    bool holds(double millisecondsSince1970) const {
      const auto at = static_cast<std::int64_t>(std::floor(millisecondsSince1970));
      return at >= startMs && at < startMs + kMillisecondsPerMinute;
    }
  };

  struct Formatted {
    icu::UnicodeString text;
    icu::FieldPosition seconds{UDAT_SECOND_FIELD};  // begin and end 0 when absent
    int secondsFields = 0;
    bool finerThanSeconds = false;
  };

  // Into lastText_, whose storage is reused from one second to the next.
  void writeText(double millisecondsSince1970) {
    if (reuse_ != Reuse::None && !(minute_ && minute_->holds(millisecondsSince1970))) {
      minute_ = minuteAround(millisecondsSince1970);
    }
    if (reuse_ == Reuse::None || !minute_) {
      lastText_ = utf8(formatted(millisecondsSince1970).text);
      return;
    }
    const auto second = static_cast<std::size_t>(
        (static_cast<std::int64_t>(std::floor(millisecondsSince1970)) - minute_->startMs) /
        kMillisecondsPerSecond);
    lastText_.assign(minute_->before).append(secondsTexts_[second]).append(minute_->after);
  }

  // The local minute that holds the time, formatted and split around its seconds field; empty
  // when the zone's offset changes within that minute.
  std::optional<Minute> minuteAround(double millisecondsSince1970) const {
    const std::optional<std::int64_t> offset = offsetAt(millisecondsSince1970);
    if (!offset) return std::nullopt;
    const std::int64_t local =
        static_cast<std::int64_t>(std::floor(millisecondsSince1970)) + *offset;
    const std::int64_t startMs =
        floorDivide(local, kMillisecondsPerMinute) * kMillisecondsPerMinute - *offset;
    const auto lastMs = static_cast<double>(startMs + kMillisecondsPerMinute - 1);
    if (offsetAt(static_cast<double>(startMs)) != offset || offsetAt(lastMs) != offset) {
      return std::nullopt;
    }
    const Formatted text = formatted(millisecondsSince1970);
    return Minute{startMs, utf8(text.text.tempSubString(0, text.seconds.getBeginIndex())),
                  utf8(text.text.tempSubString(text.seconds.getEndIndex()))};
  }

  // Zone and daylight saving offset together.
  std::optional<std::int64_t> offsetAt(double millisecondsSince1970) const {
    std::int32_t rawOffset = 0;
    std::int32_t dstOffset = 0;
    UErrorCode status = U_ZERO_ERROR;
    icu_->getTimeZone().getOffset(millisecondsSince1970, false, rawOffset, dstOffset, status);
    if (U_FAILURE(status)) return std::nullopt;
    return std::int64_t{rawOffset} + dstOffset;
  }

  explicit Formatter(std::unique_ptr<icu::SimpleDateFormat> formatter)
      : icu_(std::move(formatter)) {
    const Formatted probe = formatted(0);
    reuse_ = probe.finerThanSeconds || probe.secondsFields > 1 ? Reuse::None
             : probe.secondsFields == 1                        ? Reuse::SpliceSeconds
                                                               : Reuse::Whole;
    if (reuse_ == Reuse::SpliceSeconds) fillSecondsTexts();
  }

  Formatted formatted(double millisecondsSince1970) const {
    return formattedBy(*icu_, millisecondsSince1970);
  }

  static Formatted formattedBy(const icu::SimpleDateFormat& formatter,
                               double millisecondsSince1970) {
    Formatted result;
    icu::FieldPositionIterator fields;
    UErrorCode status = U_ZERO_ERROR;
    formatter.format(millisecondsSince1970, result.text, &fields, status);
    for (icu::FieldPosition field; fields.next(field);) {
      switch (field.getField()) {
        case UDAT_SECOND_FIELD:
          result.seconds = field;
          ++result.secondsFields;
          break;
        case UDAT_FRACTIONAL_SECOND_FIELD:
        case UDAT_MILLISECONDS_IN_DAY_FIELD:
          result.finerThanSeconds = true;
          break;
        default:
          break;
      }
    }
    return result;
  }

  // The seconds read the same in every zone, so a copy in UTC shows second s at s * 1000.
  void fillSecondsTexts() {
    const std::unique_ptr<icu::SimpleDateFormat> utc(icu_->clone());
    utc->adoptTimeZone(icu::TimeZone::createTimeZone("Etc/UTC"));
    for (std::size_t second = 0; second < secondsTexts_.size(); ++second) {
      const Formatted text =
          formattedBy(*utc, static_cast<double>(second) * kMillisecondsPerSecond);
      secondsTexts_[second] = utf8(
          text.text.tempSubStringBetween(text.seconds.getBeginIndex(), text.seconds.getEndIndex()));
    }
  }

  std::unique_ptr<icu::SimpleDateFormat> icu_;
  Reuse reuse_ = Reuse::None;
  std::array<std::string, 60> secondsTexts_;
  std::optional<Minute> minute_;
  double lastTime_ = std::nan("");
  std::string lastText_;
};

// The formatter of the latest call on this thread and what it was made for.
struct CachedFormatter {
  std::string pattern;
  ZoneSource zone;
  std::string locale;
  std::unique_ptr<Formatter> formatter;

  bool fits(std::string_view wantedPattern, const char* wantedLocale) const {
    return formatter && pattern == wantedPattern && locale == wantedLocale && zone.isCurrent();
  }
};

}  // namespace

std::optional<std::string> formatDate(double millisecondsSince1970, std::string_view pattern) {
  if (!std::isfinite(millisecondsSince1970) ||
      std::fabs(millisecondsSince1970) > kLimitMilliseconds) {
    return std::nullopt;
  }
  thread_local CachedFormatter cached;
  const icu::Locale& locale = icu::Locale::getDefault();
  if (!cached.fits(pattern, locale.getName())) {
    cached.zone = ZoneSource::current();
    cached.formatter = Formatter::make(pattern, locale);
    cached.pattern = pattern;
    cached.locale = locale.getName();
  }
  if (!cached.formatter) return std::nullopt;
  return cached.formatter->format(millisecondsSince1970);
}

}  // namespace platform
