#pragma once

#include <array>
#include <span>
#include <string>
#include <string_view>

#include "platform/FormatArgument.h"

namespace platform {

namespace format_detail {
std::string formatArguments(std::string_view pattern, std::span<const Argument> arguments);
}

// printf-style formatting that checks argument types at run time.
//
// Conversions: d i u x X o c (any integer, enumeration, or Value holding an integer or a
// boolean), f F e E g G (float, double, or Value holding one), s @ (text, Value, List, or
// any object with a description()) and %%. Flags - 0 space + #, a width and a precision are
// honoured; the length modifiers h hh l ll z t j L are accepted and ignored, since each
// argument's own type decides its width. %u, %x and %o print a negative argument as the two's
// complement of its own width: int32_t -1 as %x gives ffffffff.
//
// Mistakes never crash: a missing argument prints as %!d(missing), an argument of the wrong
// type as %!d(string=abc), an unknown conversion as %!k(unknown), and a format that ends in
// the middle of a conversion as %!(incomplete). Arguments beyond those the format uses are
// ignored, as printf does.
template <class... Args>
std::string format(std::string_view pattern, const Args&... arguments) {
  const std::array<format_detail::Argument, sizeof...(Args)> erased{
      format_detail::makeArgument(arguments)...};
  return format_detail::formatArguments(pattern, erased);
}

}  // namespace platform
