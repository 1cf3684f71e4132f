#pragma once

#include <cstddef>
#include <string_view>

namespace platform {

struct Utf8Sequence {
  std::size_t length;  // at least 1
  bool wellFormed;     // if not, the bytes are one maximal ill-formed subpart
};

// The sequence at the start of a non-empty text: either one well-formed UTF-8 character, or
// the longest run of bytes that began one but went wrong, to be replaced by a single U+FFFD.
Utf8Sequence nextUtf8Sequence(std::string_view text);

}  // namespace platform
