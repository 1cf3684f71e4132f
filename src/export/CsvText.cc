#include "export/CsvText.h"

#include <type_traits>

#include "platform/Json.h"

namespace exporting::csv {

namespace {

bool isNumberList(const platform::List& list) {
  for (const platform::Value& value : list) {
    if (!value.isNumber()) return false;
  }
  return true;
}

}  // namespace

void appendField(std::string& out, std::string_view text) {
  if (text.find_first_of(",\"\r\n") == std::string_view::npos) {
    out.append(text);
    return;
  }
  out.push_back('"');
  for (const char c : text) {
    if (c == '"') out.push_back('"');
    out.push_back(c);
  }
  out.push_back('"');
}

std::string cellText(const platform::Value& value) {
  if (value.isNull()) return {};
  if (const std::string* text = value.asString()) return *text;
  if (const platform::List* list = value.asList(); list != nullptr && isNumberList(*list)) {
    std::string cell;
    for (const platform::Value& number : *list) {
      if (!cell.empty()) cell.push_back(' ');
      cell += platform::toJson(number);
    }
    return cell;
  }
  std::string json = platform::toJson(value);
  // Bytes come out of JSON as quoted hexadecimal text; the cell wants the digits alone.
  if (value.isBytes()) return json.substr(1, json.size() - 2);
  return json;
}

}  // namespace exporting::csv
