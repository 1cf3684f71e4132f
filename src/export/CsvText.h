#pragma once

#include <string>
#include <string_view>

#include "platform/Value.h"

// The text of CSV files as RFC 4180 has it: records end in CR LF, and a field that holds a comma,
// a double quote, CR or LF is put in double quotes, with each double quote inside doubled.
namespace exporting::csv {

void appendField(std::string& out, std::string_view text);

// A value's cell text: numbers in decimal, true/false, text as it is, bytes in lowercase
// hexadecimal, a list of numbers as the numbers with one space between; nothing for Null. A
// list of other values, or a dictionary, as its JSON text.
std::string cellText(const platform::Value& value);

}  // namespace exporting::csv
