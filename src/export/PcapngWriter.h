#pragma once

#include <cstdint>
#include <span>
#include <string>
#include <string_view>

// Blocks of a pcapng file (IETF draft-ietf-opsawg-pcapng), appended to a byte buffer in the
// machine's byte order, which the Section Header Block's magic announces to readers.
namespace exporting::pcapng {

// Appends a Section Header Block (version 1.0, section length unknown) whose shb_userappl option
// names the writing application.
void appendSectionHeader(std::string& out, std::string_view application);

// Appends an Interface Description Block: its link type, no snapshot limit, timestamps in
// microseconds (the default if_tsresol), and an if_name option.
void appendInterfaceDescription(std::string& out, std::uint16_t linkType, std::string_view name);

// Appends an Enhanced Packet Block of interface 0, captured whole, stamped with microseconds
// since 1970-01-01 UTC. `parts` are concatenated into the packet data.
void appendEnhancedPacket(std::string& out, std::uint64_t microseconds,
                          std::span<const std::string_view> parts);

}  // namespace exporting::pcapng
