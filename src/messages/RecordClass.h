#pragma once

#include <memory>
#include <span>
#include <string_view>

#include "codec/Codable.h"

namespace messages {

// What the program knows of one record class without naming it in code.
struct RecordClass {
  std::string_view name;
  std::shared_ptr<codec::Codable> (*create)();
  // False for the records that decode field numbers in full and apply no
  // metric-ID tag rule.
  bool appliesMetricIdTagRule;
  // The class's own copy and merge operations. Every record passed must be of
  // this class; another throws std::invalid_argument.
  std::shared_ptr<codec::Codable> (*copyWithZone)(const codec::Codable& record);
  void (*copyTo)(const codec::Codable& record, codec::Codable& other);
  void (*mergeFrom)(codec::Codable& record, const codec::Codable& other);
};

// Every record class, in schema order.
std::span<const RecordClass> recordClasses();
const RecordClass* recordClassNamed(std::string_view name);

}  // namespace messages
