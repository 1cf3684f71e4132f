#pragma once

#include <cstdint>
#include <string>

namespace exporting {

// ISO 8601 text of a time in UTC with milliseconds, "2026-11-23T16:27:46.123Z", as pandas, jq
// and spreadsheets read it. Times are taken between 1970 and the end of 9999.
std::string utcTimeText(std::int64_t millisecondsSince1970);

}  // namespace exporting
