#include "export/PcapngWriter.h"

#include <cstring>

namespace exporting::pcapng {

namespace {

constexpr std::uint32_t kSectionHeaderType = 0x0A0D0D0A;
constexpr std::uint32_t kInterfaceDescriptionType = 0x00000001;
constexpr std::uint32_t kEnhancedPacketType = 0x00000006;
constexpr std::uint32_t kByteOrderMagic = 0x1A2B3C4D;
constexpr std::uint16_t kOptionEnd = 0;
constexpr std::uint16_t kShbUserAppl = 4;
constexpr std::uint16_t kIfName = 2;

template <class Number>
void put(std::string& out, Number value) {
  char bytes[sizeof value];
  std::memcpy(bytes, &value, sizeof value);
  out.append(bytes, sizeof value);
}

// Pads to the next multiple of 4 with zeros, as every block body and option value is.
void pad(std::string& out, std::size_t length) {
  out.append((4 - length % 4) % 4, '\0');
}

void putOption(std::string& out, std::uint16_t code, std::string_view value) {
  put(out, code);
  put(out, static_cast<std::uint16_t>(value.size()));
  out.append(value);
  pad(out, value.size());
}

void putEndOfOptions(std::string& out) {
  put(out, kOptionEnd);
  put(out, std::uint16_t{0});
}

// Opens a block: its type and a length to be filled in by closeBlock. Answers where it starts.
std::size_t openBlock(std::string& out, std::uint32_t type) {
  const std::size_t start = out.size();
  put(out, type);
  put(out, std::uint32_t{0});
  return start;
}

// Writes the block's total length at both of its ends.
void closeBlock(std::string& out, std::size_t start) {
  const auto length = static_cast<std::uint32_t>(out.size() - start + sizeof(std::uint32_t));
  std::memcpy(out.data() + start + sizeof(std::uint32_t), &length, sizeof length);
  put(out, length);
}

// Option values are at most 65535 bytes long.
std::string_view optionValue(std::string_view text) {
  return text.substr(0, 0xFFFF);
}

}  // namespace

void appendSectionHeader(std::string& out, std::string_view application) {
  const std::size_t start = openBlock(out, kSectionHeaderType);
  put(out, kByteOrderMagic);
  put(out, std::uint16_t{1});  // major version
  put(out, std::uint16_t{0});  // minor version
  put(out, std::int64_t{-1});  // section length: not given
  putOption(out, kShbUserAppl, optionValue(application));
  putEndOfOptions(out);
  closeBlock(out, start);
}

void appendInterfaceDescription(std::string& out, std::uint16_t linkType, std::string_view name) {
  const std::size_t start = openBlock(out, kInterfaceDescriptionType);
  put(out, linkType);
  put(out, std::uint16_t{0});  // reserved
  put(out, std::uint32_t{0});  // snapshot length: no limit
  putOption(out, kIfName, optionValue(name));
  putEndOfOptions(out);
  closeBlock(out, start);
}

void appendEnhancedPacket(std::string& out, std::uint64_t microseconds,
                          std::span<const std::string_view> parts) {
  std::size_t length = 0;
  for (const std::string_view part : parts)
    length += part.size();
  const std::size_t start = openBlock(out, kEnhancedPacketType);
  put(out, std::uint32_t{0});  // interface
  put(out, static_cast<std::uint32_t>(microseconds >> 32));
  put(out, static_cast<std::uint32_t>(microseconds));
  put(out, static_cast<std::uint32_t>(length));  // captured
  put(out, static_cast<std::uint32_t>(length));  // original
  for (const std::string_view part : parts)
    out.append(part);
  pad(out, length);
  closeBlock(out, start);
}

}  // namespace exporting::pcapng
