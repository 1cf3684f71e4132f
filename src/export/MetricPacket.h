#pragma once

#include <cstdint>
#include <string>
#include <string_view>

// The packet that carries one metric in a pcapng file, as docs/wireshark.md describes it:
//
//   exported-PDU tags (big-endian): 0x000C, 8, "norvo\0\0\0" (the dissector's name); 0, 0 (end)
//   Norvo header (big-endian):      version 1 (1 byte), 0 (1 byte), device length N (2 bytes),
//                                   metric ID (4 bytes), the device's name (N bytes, UTF-8)
//   the payload, to the end of the packet
//
// The link type is Wireshark's upper-PDU export: Wireshark hands the packet to the dissector
// named in its tags, so our dissector needs no link-type preference set by hand.
namespace exporting {

inline constexpr std::uint16_t kUpperPduLinkType = 252;  // LINKTYPE_WIRESHARK_UPPER_PDU
inline constexpr std::uint8_t kMetricHeaderVersion = 1;
inline constexpr std::string_view kDissectorName = "norvo";

// Replaces `out` with everything of the packet before the payload. A device name longer than
// 65535 bytes is cut there.
void writeMetricPacketHeader(std::string& out, std::uint32_t metricID, std::string_view device);

}  // namespace exporting
