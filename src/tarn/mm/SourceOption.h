#pragma once

#include <chrono>
#include <optional>
#include <string>
#include <string_view>

// How tarnd and norvo name the ModemManager source on their command lines.
namespace tarn::mm {

inline constexpr std::string_view kSourceName = "modemmanager";
inline constexpr std::chrono::seconds kDefaultRefresh{2};
inline constexpr std::string_view kRefreshWanted = "--refresh wants whole seconds from 1 to 5";

// The modem that "modemmanager" (empty: the first) or "modemmanager:MODEM" names; empty for
// any other source.
std::optional<std::string> parseModemManagerSource(std::string_view source);

// The value of --refresh: whole seconds from 1 to 5.
std::optional<std::chrono::seconds> parseRefresh(std::string_view text);

}  // namespace tarn::mm
