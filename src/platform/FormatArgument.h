#pragma once

#include <concepts>
#include <cstdint>
#include <string>
#include <string_view>
#include <type_traits>
#include <variant>

#include "platform/Value.h"

namespace platform::format_detail {

// An integer argument as its two's complement bits, sign-extended to 64, with the width and
// signedness of its own C++ type.
struct Integer {
  std::uint64_t bits;
  unsigned width;
  bool isSigned;
};

// An object that prints through its description().
struct Described {
  const void* object;
  std::string (*describe)(const void* object);
};

// One argument of format(), without its C++ type. It refers to the caller's object, so it
// lives no longer than the call.
using Argument = std::variant<Integer, double, std::string_view, const Value*, Described>;

template <class T>
concept HasDescription = requires(const T& object) {
  { object.description() } -> std::convertible_to<std::string>;
};

template <class T>
inline constexpr bool kUnsupported = false;

template <class T>
Argument makeArgument(const T& argument) {
  if constexpr (std::is_same_v<T, Value>) {
    return &argument;
  } else if constexpr (std::is_same_v<T, bool>) {
    return Integer{argument ? 1u : 0u, 1, false};
  } else if constexpr (std::is_integral_v<T>) {
    return Integer{static_cast<std::uint64_t>(argument), sizeof(T) * 8, std::is_signed_v<T>};
  } else if constexpr (std::is_enum_v<T>) {
    return makeArgument(static_cast<std::underlying_type_t<T>>(argument));
  } else if constexpr (std::is_floating_point_v<T>) {
    return static_cast<double>(argument);
  } else if constexpr (std::is_convertible_v<const T&, const char*>) {
    const char* text = argument;
    return text != nullptr ? std::string_view(text) : std::string_view("(null)");
  } else if constexpr (std::is_convertible_v<const T&, std::string_view>) {
    return std::string_view(argument);
  } else if constexpr (std::is_same_v<T, List>) {
    return Described{&argument,
                     [](const void* list) { return description(*static_cast<const List*>(list)); }};
  } else if constexpr (HasDescription<T>) {
    return Described{&argument, [](const void* object) {
                       return std::string(static_cast<const T*>(object)->description());
                     }};
  } else {
    static_assert(kUnsupported<T>,
                  "format() takes integers, enumerations, floating values, text, Value, List "
                  "and objects with a description()");
  }
}

}  // namespace platform::format_detail
