#pragma once

#include <memory>
#include <string_view>

#include "codec/Codable.h"

namespace oracle {

// The record operations that the registry's Codable does not offer, reached by class name.
struct RecordOperations {
  std::shared_ptr<codec::Codable> (*copyWithZone)(const codec::Codable& record);
  // A new record of the same class that `record.copyTo` has filled.
  std::shared_ptr<codec::Codable> (*copiedToNew)(const codec::Codable& record);
  void (*mergeFrom)(codec::Codable& record, const codec::Codable& other);
};

// Nothing for a class this table does not know.
const RecordOperations* recordOperationsNamed(std::string_view className);

}  // namespace oracle
