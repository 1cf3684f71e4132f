#include "tarn/dbus/Marshal.h"

#include <systemd/sd-bus.h>

#include <cstring>
#include <limits>

#include "platform/Format.h"

namespace tarn::dbus {

namespace {

// sdbus-c++ appends and reads byte arrays one byte at a time; sd-bus does it in one call, and
// payloads are most of what travels. The message is reached through the wrapper's own member.
struct MessageAccess : sdbus::Message {
  static sd_bus_message* raw(sdbus::Message& message) {
    return static_cast<sd_bus_message*>(message.*(&MessageAccess::msg_));
  }
};

void check(int result, std::string_view doing) {
  if (result < 0) {
    throw MalformedRecord(platform::format("%s: %s", doing, std::strerror(-result)));
  }
}

// The D-Bus type of a value; none for null.
const char* signatureOf(const ipc::Object& object) {
  struct Signature {
    const char* operator()(std::monostate) const { return nullptr; }
    const char* operator()(std::int64_t) const { return "x"; }
    const char* operator()(const platform::Bytes&) const { return "ay"; }
    const char* operator()(const std::string&) const { return "s"; }
    const char* operator()(const ipc::Object::Array&) const { return "av"; }
    const char* operator()(const ipc::Object::Entries&) const { return "a{sv}"; }
  };
  return object.visit(Signature{});
}

void appendValue(sd_bus_message* message, const ipc::Object& value);

void appendVariant(sd_bus_message* message, const ipc::Object& value) {
  const char* signature = signatureOf(value);
  check(sd_bus_message_open_container(message, SD_BUS_TYPE_VARIANT, signature), "open variant");
  appendValue(message, value);
  check(sd_bus_message_close_container(message), "close variant");
}

void appendEntries(sd_bus_message* message, const ipc::Object::Entries& entries) {
  check(sd_bus_message_open_container(message, SD_BUS_TYPE_ARRAY, "{sv}"), "open a{sv}");
  for (const auto& [key, value] : entries) {
    if (value.isNull()) continue;
    check(sd_bus_message_open_container(message, SD_BUS_TYPE_DICT_ENTRY, "sv"), "open entry");
    check(sd_bus_message_append_basic(message, SD_BUS_TYPE_STRING, key.c_str()),
          platform::format("key '%s'", key));
    appendVariant(message, value);
    check(sd_bus_message_close_container(message), "close entry");
  }
  check(sd_bus_message_close_container(message), "close a{sv}");
}

void appendValue(sd_bus_message* message, const ipc::Object& value) {
  struct Append {
    sd_bus_message* message;
    void operator()(std::monostate) const {}
    void operator()(std::int64_t integer) const {
      check(sd_bus_message_append_basic(message, SD_BUS_TYPE_INT64, &integer), "integer");
    }
    void operator()(const platform::Bytes& bytes) const {
      check(sd_bus_message_append_array(message, SD_BUS_TYPE_BYTE, bytes.data(), bytes.size()),
            "byte buffer");
    }
    void operator()(const std::string& text) const {
      if (text.find('\0') != std::string::npos) throw MalformedRecord("text holds a NUL character");
      check(sd_bus_message_append_basic(message, SD_BUS_TYPE_STRING, text.c_str()), "text");
    }
    void operator()(const ipc::Object::Array& elements) const {
      check(sd_bus_message_open_container(message, SD_BUS_TYPE_ARRAY, "v"), "open av");
      for (const ipc::Object& element : elements) {
        if (!element.isNull()) appendVariant(message, element);
      }
      check(sd_bus_message_close_container(message), "close av");
    }
    void operator()(const ipc::Object::Entries& entries) const { appendEntries(message, entries); }
  };
  value.visit(Append{message});
}

template <class Integer>
std::int64_t readInteger(sd_bus_message* message, char type, std::string_view key) {
  Integer integer{};
  check(sd_bus_message_read_basic(message, type, &integer), "read integer");
  if constexpr (std::is_same_v<Integer, std::uint64_t>) {
    if (integer > static_cast<std::uint64_t>(std::numeric_limits<std::int64_t>::max())) {
      throw MalformedRecord(platform::format(
          "argument %s is %llu, larger than a 64-bit integer holds", key, integer));
    }
  }
  return static_cast<std::int64_t>(integer);
}

struct IntegerType {
  char type;
  std::int64_t (*read)(sd_bus_message* message, char type, std::string_view key);
};

// Every D-Bus integer type reads as a 64-bit integer.
constexpr IntegerType kIntegerTypes[] = {
    {SD_BUS_TYPE_BYTE, &readInteger<std::uint8_t>},
    {SD_BUS_TYPE_INT16, &readInteger<std::int16_t>},
    {SD_BUS_TYPE_UINT16, &readInteger<std::uint16_t>},
    {SD_BUS_TYPE_INT32, &readInteger<std::int32_t>},
    {SD_BUS_TYPE_UINT32, &readInteger<std::uint32_t>},
    {SD_BUS_TYPE_INT64, &readInteger<std::int64_t>},
    {SD_BUS_TYPE_UINT64, &readInteger<std::uint64_t>},
};

ipc::Object readEntries(sd_bus_message* message);
ipc::Object readArray(sd_bus_message* message);

// Reads the value of type `signature` at the current position.
ipc::Object readValue(sd_bus_message* message, std::string_view signature, std::string_view key) {
  for (const IntegerType& integer : kIntegerTypes) {
    if (signature.size() == 1 && signature[0] == integer.type) {
      return ipc::Object::integer(integer.read(message, integer.type, key));
    }
  }
  if (signature == "s") {
    const char* text = nullptr;
    check(sd_bus_message_read_basic(message, SD_BUS_TYPE_STRING, &text), "read text");
    return ipc::Object::text(text);
  }
  if (signature == "ay") {
    const void* data = nullptr;
    std::size_t size = 0;
    check(sd_bus_message_read_array(message, SD_BUS_TYPE_BYTE, &data, &size), "read bytes");
    const auto* bytes = static_cast<const std::uint8_t*>(data);
    return ipc::Object::bytes(platform::Bytes(bytes, bytes + size));
  }
  if (signature == "av") return readArray(message);
  if (signature == "a{sv}") return readEntries(message);
  throw MalformedRecord(platform::format(
      "argument %s has the D-Bus type '%s', which records do not carry; use x, ay, s, av or a{sv}",
      key, signature));
}

ipc::Object readVariant(sd_bus_message* message, std::string_view key) {
  char type = 0;
  const char* contents = nullptr;
  check(sd_bus_message_peek_type(message, &type, &contents), "peek variant");
  check(sd_bus_message_enter_container(message, SD_BUS_TYPE_VARIANT, contents), "enter variant");
  ipc::Object value = readValue(message, contents, key);
  check(sd_bus_message_exit_container(message), "exit variant");
  return value;
}

ipc::Object readArray(sd_bus_message* message) {
  check(sd_bus_message_enter_container(message, SD_BUS_TYPE_ARRAY, "v"), "enter av");
  ipc::Object::Array elements;
  while (sd_bus_message_at_end(message, false) == 0) {
    elements.push_back(readVariant(message, "in an array"));
  }
  check(sd_bus_message_exit_container(message), "exit av");
  return ipc::Object::array(std::move(elements));
}

ipc::Object readEntries(sd_bus_message* message) {
  if (sd_bus_message_enter_container(message, SD_BUS_TYPE_ARRAY, "{sv}") <= 0) {
    throw MalformedRecord("the record is not a{sv}");
  }
  ipc::Object::Entries entries;
  int entered = 0;
  while ((entered = sd_bus_message_enter_container(message, SD_BUS_TYPE_DICT_ENTRY, "sv")) > 0) {
    const char* key = nullptr;
    check(sd_bus_message_read_basic(message, SD_BUS_TYPE_STRING, &key), "read key");
    ipc::Object value = readVariant(message, key);
    entries.emplace_back(key, std::move(value));
    check(sd_bus_message_exit_container(message), "exit entry");
  }
  check(entered, "enter entry");
  check(sd_bus_message_exit_container(message), "exit a{sv}");
  return ipc::Object::dictionary(std::move(entries));
}

}  // namespace

void appendRecord(sdbus::Message& message, const ipc::Object& record) {
  static const ipc::Object::Entries kNoEntries;
  const ipc::Object::Entries* entries = record.asDictionary();
  appendEntries(MessageAccess::raw(message), entries != nullptr ? *entries : kNoEntries);
}

ipc::Object readRecord(sdbus::Message& message) {
  return readRecord(MessageAccess::raw(message));
}

ipc::Object readRecord(sd_bus_message* message) {
  return readEntries(message);
}

void appendEvents(sdbus::Message& message, std::span<const Event> events) {
  sd_bus_message* raw = MessageAccess::raw(message);
  check(sd_bus_message_open_container(raw, SD_BUS_TYPE_ARRAY, "(sa{sv})"), "open events");
  for (const Event& event : events) {
    check(sd_bus_message_open_container(raw, SD_BUS_TYPE_STRUCT, "sa{sv}"), "open event");
    check(sd_bus_message_append_basic(raw, SD_BUS_TYPE_STRING, event.name.c_str()), "event name");
    appendRecord(message, event.record);
    check(sd_bus_message_close_container(raw), "close event");
  }
  check(sd_bus_message_close_container(raw), "close events");
}

std::vector<Event> readEvents(sdbus::Message& message) {
  return readEvents(MessageAccess::raw(message));
}

std::vector<Event> readEvents(sd_bus_message* raw) {
  if (sd_bus_message_enter_container(raw, SD_BUS_TYPE_ARRAY, "(sa{sv})") <= 0) {
    throw MalformedRecord("the events are not a(sa{sv})");
  }
  std::vector<Event> events;
  int entered = 0;
  while ((entered = sd_bus_message_enter_container(raw, SD_BUS_TYPE_STRUCT, "sa{sv}")) > 0) {
    const char* name = nullptr;
    check(sd_bus_message_read_basic(raw, SD_BUS_TYPE_STRING, &name), "read event name");
    ipc::Object record = readEntries(raw);
    events.push_back({name, std::move(record)});
    check(sd_bus_message_exit_container(raw), "exit event");
  }
  check(entered, "enter event");
  check(sd_bus_message_exit_container(raw), "exit events");
  return events;
}

}  // namespace tarn::dbus
