#include "export/MetricPacket.h"

namespace exporting {

namespace {

constexpr std::uint16_t kTagDissectorName = 12;
constexpr std::uint16_t kTagEnd = 0;

void putBigEndian(std::string& out, std::uint64_t value, int bytes) {
  for (int shift = 8 * (bytes - 1); shift >= 0; shift -= 8)
    out.push_back(static_cast<char>(value >> shift));
}

}  // namespace

void writeMetricPacketHeader(std::string& out, std::uint32_t metricID, std::string_view device) {
  device = device.substr(0, 0xFFFF);
  out.clear();
  // A tag's value is padded with zeros to a multiple of 4, and its length counts the padding.
  const std::size_t paddedName = (kDissectorName.size() + 3) / 4 * 4;
  putBigEndian(out, kTagDissectorName, 2);
  putBigEndian(out, paddedName, 2);
  out.append(kDissectorName);
  out.append(paddedName - kDissectorName.size(), '\0');
  putBigEndian(out, kTagEnd, 2);
  putBigEndian(out, 0, 2);

  out.push_back(static_cast<char>(kMetricHeaderVersion));
  out.push_back('\0');
  putBigEndian(out, device.size(), 2);
  putBigEndian(out, metricID, 4);
  out.append(device);
}

}  // namespace exporting
