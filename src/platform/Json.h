#pragma once

#include <string>

#include "platform/Value.h"

namespace platform {

// Compact JSON: integers exact over the full 64-bit ranges, floating values always with a
// fraction or an exponent (non-finite ones as null), byte buffers as lowercase hexadecimal
// text, dictionaries as objects in insertion order, Null as null. Text is escaped as RFC 8259
// requires; bytes that are not well-formed UTF-8 become U+FFFD.
std::string toJson(const Value& value);
std::string toJson(const List& list);
std::string toJson(const Dictionary& dictionary);
// The same text, appended to `out`.
void appendJson(std::string& out, const Value& value);
void appendJson(std::string& out, const Dictionary& dictionary);

}  // namespace platform
