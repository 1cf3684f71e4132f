#include "fleet/WireFields.h"

namespace fleet {

namespace {

enum WireType : std::uint64_t { kVarint = 0, kFixed64 = 1, kLengthDelimited = 2, kFixed32 = 5 };

bool readVarint(std::span<const std::uint8_t>& bytes, std::uint64_t& value) {
  value = 0;
  for (unsigned shift = 0; shift < 64 && !bytes.empty(); shift += 7) {
    const std::uint8_t byte = bytes.front();
    bytes = bytes.subspan(1);
    value |= std::uint64_t{byte & 0x7Fu} << shift;
    if ((byte & 0x80) == 0) return true;
  }
  return false;
}

bool skip(std::span<const std::uint8_t>& bytes, std::uint64_t count) {
  if (count > bytes.size()) return false;
  bytes = bytes.subspan(count);
  return true;
}

}  // namespace

bool forEachField(std::span<const std::uint8_t> record,
                  const std::function<void(const WireField&)>& visit) {
  while (!record.empty()) {
    std::uint64_t key = 0;
    if (!readVarint(record, key)) return false;
    WireField field{static_cast<std::uint32_t>(key >> 3), 0, {}};
    switch (key & 7) {
      case kVarint:
        if (!readVarint(record, field.varint)) return false;
        break;
      case kFixed64:
        if (!skip(record, 8)) return false;
        continue;
      case kFixed32:
        if (!skip(record, 4)) return false;
        continue;
      case kLengthDelimited: {
        std::uint64_t length = 0;
        if (!readVarint(record, length) || length > record.size()) return false;
        field.nested = record.first(length);
        record = record.subspan(length);
        break;
      }
      default:
        return false;
    }
    visit(field);
  }
  return true;
}

}  // namespace fleet
