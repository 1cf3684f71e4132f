#pragma once

#include <sdbus-c++/Message.h>

#include <span>
#include <stdexcept>
#include <string>
#include <vector>

#include "tarn/Ipc.h"

struct sd_bus_message;

// IPC objects in D-Bus messages. A record travels as a{sv} with its entries in their order:
// integers as x, byte buffers as ay, text as s, arrays as av and dictionaries as a{sv}.
namespace tarn::dbus {

// A message that does not hold what it should, or an object that D-Bus cannot carry.
class MalformedRecord : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

// An event as the Events signal carries it.
struct Event {
  std::string name;
  ipc::Object record;

  bool operator==(const Event&) const = default;
};

// Appends `record` as a{sv}. D-Bus has no null, so null entries are left out; an object that is
// no dictionary appends as an empty one.
void appendRecord(sdbus::Message& message, const ipc::Object& record);

// Reads an a{sv} record. Integers of every D-Bus integer type become 64-bit integers; booleans,
// doubles and the other types that IPC objects lack are refused with a message naming the key.
ipc::Object readRecord(sdbus::Message& message);
// The same on sd-bus's own message, at its read position.
ipc::Object readRecord(sd_bus_message* message);

// The Events signal's argument, a(sa{sv}).
void appendEvents(sdbus::Message& message, std::span<const Event> events);
std::vector<Event> readEvents(sdbus::Message& message);
std::vector<Event> readEvents(sd_bus_message* message);

}  // namespace tarn::dbus
