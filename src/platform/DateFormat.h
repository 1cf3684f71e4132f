#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace platform {

// Formats a point in time, in milliseconds since 1970-01-01 00:00:00 UTC, with a date pattern
// (the pattern letters of Unicode Technical Standard #35, e.g. "yyyy-MM-dd HH:mm:ss zzz") in the
// process's current time zone and default locale. The time zone is that of TZ, or the system's
// when TZ is not set; a change of either shows in the next call.
//
// Empty when the time is not finite or lies more than 100,000,000 days from 1970, or when the
// pattern is malformed.
std::optional<std::string> formatDate(double millisecondsSince1970, std::string_view pattern);

}  // namespace platform
