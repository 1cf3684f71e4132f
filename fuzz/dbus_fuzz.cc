// Sends arbitrary bytes as the body of a D-Bus message to a peer, whose sd-bus receives and checks
// the message as tarnd's and a client's do, and reads it as a record (PerformCommand's argument)
// or as events (the Events signal). Nothing a peer on the bus sends may crash or hang the reader;
// what it refuses, it refuses with MalformedRecord.
//
// An input is one byte choosing the reader, the body's signature up to a NUL, and the body.
#include <sys/socket.h>
#include <systemd/sd-bus.h>
#include <systemd/sd-id128.h>
#include <unistd.h>

#include <cerrno>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <string>
#include <string_view>

#include "tarn/dbus/Marshal.h"

namespace {

[[noreturn]] void fail(const char* what, int error) {
  std::fprintf(stderr, "%s: %s\n", what, std::strerror(error));
  std::abort();
}

struct BusUnref {
  void operator()(sd_bus* bus) const { sd_bus_flush_close_unref(bus); }
};
using BusPointer = std::unique_ptr<sd_bus, BusUnref>;

// Two sd-bus peers on the ends of a socket pair, authenticated to each other. The sender's end
// then carries raw bytes, written by hand.
class PeerPair {
 public:
  PeerPair() {
    int fds[2];
    if (socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, fds) < 0) fail("socketpair", errno);
    sendFd_ = fds[1];
    receiver_ = started(fds[0], true);
    sender_ = started(fds[1], false);
    for (int turn = 0; !ready(receiver_.get()) || !ready(sender_.get()); ++turn) {
      if (turn > 1000) fail("the peers do not authenticate", ETIMEDOUT);
      sd_bus_process(receiver_.get(), nullptr);
      sd_bus_process(sender_.get(), nullptr);
    }
  }

  // Writes `bytes` to the receiver and returns the message its sd-bus makes of them, or null when
  // it drops them as malformed.
  sd_bus_message* deliver(std::string_view bytes) {
    while (!bytes.empty()) {
      const ssize_t written = write(sendFd_, bytes.data(), bytes.size());
      if (written < 0 && errno != EAGAIN && errno != EINTR) fail("write", errno);
      if (written > 0) bytes.remove_prefix(static_cast<std::size_t>(written));
      if (sd_bus_message* message = receive()) return message;
    }
    return receive();
  }

 private:
  static BusPointer started(int fd, bool server) {
    sd_bus* raw = nullptr;
    if (const int r = sd_bus_new(&raw); r < 0) fail("sd_bus_new", -r);
    BusPointer bus(raw);
    sd_bus_set_fd(bus.get(), fd, fd);
    if (server) {
      sd_id128_t id;
      sd_id128_randomize(&id);
      sd_bus_set_server(bus.get(), 1, id);
    }
    if (const int r = sd_bus_start(bus.get()); r < 0) fail("sd_bus_start", -r);
    return bus;
  }

  static bool ready(sd_bus* bus) { return sd_bus_is_ready(bus) > 0; }

  sd_bus_message* receive() {
    for (;;) {
      sd_bus_message* message = nullptr;
      const int r = sd_bus_process(receiver_.get(), &message);
      if (r < 0) fail("the receiving peer broke off", -r);
      if (message != nullptr) return message;
      if (r == 0) return nullptr;
    }
  }

  int sendFd_ = -1;
  BusPointer receiver_;
  BusPointer sender_;
};

// A little-endian D-Bus signal around `body`, with the header fields a session's Events carry.
std::string signal(std::string_view signature, std::string_view body) {
  static std::uint32_t serial = 0;
  std::string out;
  const auto align = [&out](std::size_t to) {
    while (out.size() % to != 0)
      out.push_back('\0');
  };
  const auto u32 = [&out](std::size_t value) {
    for (int shift = 0; shift < 32; shift += 8)
      out.push_back(static_cast<char>(value >> shift));
  };
  const auto field = [&](char code, char type, std::string_view value) {
    align(8);
    out.push_back(code);
    out.push_back(1);
    out.push_back(type);
    out.push_back('\0');
    if (type == 'g') {
      out.push_back(static_cast<char>(value.size()));
    } else {
      align(4);
      u32(value.size());
    }
    out.append(value);
    out.push_back('\0');
  };
  out = {'l', 4, 0, 1};
  u32(body.size());
  u32(++serial == 0 ? ++serial : serial);
  u32(0);  // the length of the header fields, below
  const std::size_t fieldsStart = out.size();
  field(1, 'o', "/org/norvo/Tarn1/session/1");
  field(2, 's', "org.norvo.Tarn1.Session");
  field(3, 's', "Events");
  if (!signature.empty()) field(8, 'g', signature);
  const std::size_t fieldsLength = out.size() - fieldsStart;
  for (std::size_t i = 0; i < 4; ++i)
    out[12 + i] = static_cast<char>(fieldsLength >> (8 * i));
  align(8);
  out.append(body);
  return out;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  // Larger than a socket's buffer; a record is a few hundred bytes.
  if (size < 1 || size > 64 * 1024) return 0;
  static PeerPair peers;
  const std::string_view input(reinterpret_cast<const char*>(data) + 1, size - 1);
  const std::size_t end = input.find('\0');
  if (end == std::string_view::npos || end > 255) return 0;

  sd_bus_message* message = peers.deliver(signal(input.substr(0, end), input.substr(end + 1)));
  if (message == nullptr) return 0;
  try {
    if (data[0] % 2 == 0) {
      (void)tarn::dbus::readRecord(message);
    } else {
      (void)tarn::dbus::readEvents(message);
    }
  } catch (const tarn::dbus::MalformedRecord&) {
  }
  sd_bus_message_unref(message);
  return 0;
}
