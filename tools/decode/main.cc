// norvo-decode: decodes one metric payload with a record class and prints
// what the record holds, as the viewer would see it.
//
//   norvo-decode CLASS HEX     e.g. norvo-decode KCellularLteRrcState 10031804
//   norvo-decode CLASS -       reads the raw payload bytes from standard input
//   norvo-decode --list        lists the record classes
#include <cstdio>
#include <iostream>
#include <iterator>
#include <optional>
#include <string>

#include "codec/Reader.h"
#include "messages/Records.h"
#include "platform/Json.h"

namespace {

std::optional<platform::Bytes> fromHex(const std::string& text) {
  platform::Bytes bytes;
  int high = -1;
  for (const char c : text) {
    int digit = -1;
    if (c >= '0' && c <= '9') digit = c - '0';
    if (c >= 'a' && c <= 'f') digit = c - 'a' + 10;
    if (c >= 'A' && c <= 'F') digit = c - 'A' + 10;
    if (digit < 0) {
      if (c == ' ' || c == ':' || c == '\n') continue;
      return std::nullopt;
    }
    if (high < 0) {
      high = digit;
    } else {
      bytes.push_back(static_cast<std::uint8_t>(high * 16 + digit));
      high = -1;
    }
  }
  if (high >= 0) return std::nullopt;
  return bytes;
}

int usage() {
  std::fprintf(stderr,
               "usage: norvo-decode CLASS HEX | norvo-decode CLASS - | norvo-decode --list\n");
  return 2;
}

}  // namespace

int main(int argc, char* argv[]) {
  if (argc == 2 && std::string(argv[1]) == "--list") {
    for (const auto& recordClass : messages::recordClasses())
      std::printf("%.*s\n", static_cast<int>(recordClass.name.size()), recordClass.name.data());
    return 0;
  }
  if (argc != 3) return usage();
  const auto* recordClass = messages::recordClassNamed(argv[1]);
  if (recordClass == nullptr) {
    std::fprintf(stderr, "norvo-decode: no record class named %s (see --list)\n", argv[1]);
    return 2;
  }
  std::optional<platform::Bytes> payload;
  if (std::string(argv[2]) == "-") {
    payload = platform::Bytes(std::istreambuf_iterator<char>(std::cin), {});
  } else {
    payload = fromHex(argv[2]);
  }
  if (!payload) {
    std::fprintf(stderr, "norvo-decode: the payload is not hexadecimal bytes\n");
    return 2;
  }
  const auto record = recordClass->create();
  codec::Reader reader(*payload);
  const bool clean = record->readFrom(reader);
  std::printf("%s\n",
              platform::toJson(platform::Value(record->dictionaryRepresentation())).c_str());
  if (!clean) {
    std::fprintf(
        stderr, "norvo-decode: the payload is malformed; shown is what was read before byte %llu\n",
        static_cast<unsigned long long>(reader.position()));
    return 1;
  }
  return 0;
}
