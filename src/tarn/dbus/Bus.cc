#include "tarn/dbus/Bus.h"

#include <string>

namespace tarn::dbus {

std::unique_ptr<sdbus::IConnection> connectToBus(std::string_view bus) {
  if (bus == "session") return sdbus::createSessionBusConnection();
  if (bus == "system") return sdbus::createSystemBusConnection();
  return sdbus::createSessionBusConnectionWithAddress(std::string(bus));
}

}  // namespace tarn::dbus
