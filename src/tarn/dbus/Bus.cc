#include "tarn/dbus/Bus.h"

#include <sdbus-c++/Error.h>
#include <systemd/sd-bus.h>

#include <cstring>
#include <string>

namespace tarn::dbus {

namespace {

// Throws sdbus::Error when the bus at `address` does not take a client. The library's own
// connection to an address keeps the sd-bus object of every attempt that fails, so that a
// session that keeps trying a bus that is not there would grow; this attempt frees its own.
void checkReachable(const std::string& address) {
  sd_bus* bus = nullptr;
  int result = sd_bus_new(&bus);
  if (result >= 0) result = sd_bus_set_address(bus, address.c_str());
  if (result >= 0) result = sd_bus_set_bus_client(bus, 1);
  if (result >= 0) result = sd_bus_start(bus);
  sd_bus_flush_close_unref(bus);
  if (result < 0) {
    throw sdbus::Error("org.freedesktop.DBus.Error.Failed",
                       "Failed to open bus (" + std::string(std::strerror(-result)) + ")");
  }
}

}  // namespace

std::unique_ptr<sdbus::IConnection> connectToBus(std::string_view bus) {
  if (bus == "session") return sdbus::createSessionBusConnection();
  if (bus == "system") return sdbus::createSystemBusConnection();
  const std::string address(bus);
  checkReachable(address);
  return sdbus::createSessionBusConnectionWithAddress(address);
}

}  // namespace tarn::dbus
