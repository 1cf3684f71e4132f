#pragma once

#include <span>
#include <string_view>

namespace messages {

// One field of a record class as its dictionary shows it (generated from the schemas into
// RecordFields.cc).
struct RecordField {
  enum class Shape {
    Value,       // a number, an enumeration's name, text or bytes
    Record,      // a nested record's dictionary
    RecordList,  // a list of records' dictionaries
    NumberList,  // a packed run: a list of numbers
  };
  std::string_view key;
  Shape shape;
  std::string_view recordClass;  // of a Record or RecordList; empty otherwise
};

// The fields of a record class in declaration order, the order of its dictionary; empty for a
// name that is no record class.
std::span<const RecordField> recordFields(std::string_view recordClass);

}  // namespace messages
