#pragma once

#include <google/protobuf/descriptor.h>

#include <memory>
#include <vector>

#include "FieldEmitter.h"

namespace recordgen {

// Emits one record class: its declaration for the header and its operations
// for the source.
class RecordEmitter {
 public:
  explicit RecordEmitter(const google::protobuf::Descriptor& message);

  void declare(Printer& p) const;
  void define(Printer& p) const;
  bool appliesMetricIdTagRule() const { return !rawFieldNumbers_; }

 private:
  void declareEnum(Printer& p, const google::protobuf::EnumDescriptor& enumType) const;
  void defineReadFrom(Printer& p) const;
  void defineWriteTo(Printer& p) const;
  void defineCopies(Printer& p) const;
  void defineIsEqual(Printer& p) const;
  void defineHash(Printer& p) const;
  void defineDictionary(Printer& p) const;

  const google::protobuf::Descriptor& message_;
  bool rawFieldNumbers_;
  Variables vars_;
  std::vector<std::unique_ptr<FieldEmitter>> fields_;  // in declaration order
  std::vector<const FieldEmitter*> byNumber_;
};

// Emits the table of an enum's names, in the source.
void defineEnumNames(Printer& p, const google::protobuf::EnumDescriptor& enumType);
// Declares a file-level enum and its name function, in the header.
void declareTopLevelEnum(Printer& p, const google::protobuf::EnumDescriptor& enumType);

}  // namespace recordgen
