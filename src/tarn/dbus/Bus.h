#pragma once

#include <sdbus-c++/IConnection.h>

#include <memory>
#include <string_view>

namespace tarn::dbus {

// Opens a connection to `bus`: "session", "system", or a D-Bus address such as
// "unix:path=/run/user/1000/bus". Throws sdbus::Error when the bus cannot be reached.
std::unique_ptr<sdbus::IConnection> connectToBus(std::string_view bus);

}  // namespace tarn::dbus
