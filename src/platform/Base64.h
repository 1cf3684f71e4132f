#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "platform/Value.h"

// Standard base64 (RFC 4648, section 4): the alphabet A-Z a-z 0-9 + / with "=" padding.
namespace platform {

std::string base64Encode(const Bytes& bytes);

// Empty when `text` is not standard base64: a character outside the alphabet (whitespace
// included), a length that is not a multiple of four, or padding anywhere but at the end.
std::optional<Bytes> base64Decode(std::string_view text);

}  // namespace platform
