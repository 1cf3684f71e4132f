#include "export/UtcTime.h"

#include <algorithm>
#include <chrono>

namespace exporting {

namespace {

void appendDigits(std::string& out, unsigned value, int count) {
  char digits[4];
  for (int i = count - 1; i >= 0; --i) {
    digits[i] = static_cast<char>('0' + value % 10);
    value /= 10;
  }
  out.append(digits, static_cast<std::size_t>(count));
}

}  // namespace

std::string utcTimeText(std::int64_t millisecondsSince1970) {
  constexpr std::int64_t kLatestMs = 253402300799999;  // 9999-12-31T23:59:59.999Z
  using namespace std::chrono;
  const sys_time<milliseconds> time{
      milliseconds(std::clamp<std::int64_t>(millisecondsSince1970, 0, kLatestMs))};
  const sys_days day = floor<days>(time);
  const year_month_day date{day};
  const hh_mm_ss clock{time - day};
  std::string text;
  text.reserve(24);
  appendDigits(text, static_cast<unsigned>(static_cast<int>(date.year())), 4);
  text += '-';
  appendDigits(text, static_cast<unsigned>(date.month()), 2);
  text += '-';
  appendDigits(text, static_cast<unsigned>(date.day()), 2);
  text += 'T';
  appendDigits(text, static_cast<unsigned>(clock.hours().count()), 2);
  text += ':';
  appendDigits(text, static_cast<unsigned>(clock.minutes().count()), 2);
  text += ':';
  appendDigits(text, static_cast<unsigned>(clock.seconds().count()), 2);
  text += '.';
  appendDigits(text, static_cast<unsigned>(clock.subseconds().count()), 3);
  text += 'Z';
  return text;
}

}  // namespace exporting
