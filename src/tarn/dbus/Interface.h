#pragma once

#include <cstdint>
#include <string>
#include <string_view>

// The baseband manager service on D-Bus, as org.norvo.Tarn1.xml describes it. The major version
// is part of every name; a change that breaks callers gets new names.
namespace tarn::dbus {

inline constexpr std::uint32_t kInterfaceVersion = 1;

inline constexpr std::string_view kBusName = "org.norvo.Tarn1";
inline constexpr std::string_view kManagerPath = "/org/norvo/Tarn1";
inline constexpr std::string_view kSessionPathPrefix = "/org/norvo/Tarn1/sessions/";

inline constexpr std::string_view kManagerInterface = "org.norvo.Tarn1.Manager";
inline constexpr std::string_view kSessionInterface = "org.norvo.Tarn1.Session";
// The same names as sdbus-c++ takes them.
inline const std::string kManagerInterfaceName{kManagerInterface};
inline const std::string kSessionInterfaceName{kSessionInterface};

// Manager methods and properties.
inline constexpr std::string_view kOpenSession = "OpenSession";
inline constexpr std::string_view kVersionProperty = "Version";

// Session methods and signals.
inline constexpr std::string_view kPerformCommand = "PerformCommand";
inline constexpr std::string_view kSetEventsOn = "SetEventsOn";
inline constexpr std::string_view kClose = "Close";
inline constexpr std::string_view kEventsSignal = "Events";

// Signatures: a record is a{sv}; an event is its name and record; the Events signal carries the
// events that were ready together, in delivery order.
inline constexpr std::string_view kRecordSignature = "a{sv}";
inline constexpr std::string_view kEventSignature = "(sa{sv})";
inline constexpr std::string_view kEventsSignature = "a(sa{sv})";

}  // namespace tarn::dbus
