#pragma once

#include <google/protobuf/compiler/code_generator.h>
#include <google/protobuf/descriptor.h>

#include <vector>

namespace recordgen {

// Writes RecordFields.cc: every record class's fields (key, shape, nested record class) for
// code that walks a dictionary by its schema, such as the CSV export's columns.
void writeFieldTable(const std::vector<const google::protobuf::FileDescriptor*>& files,
                     google::protobuf::compiler::GeneratorContext& context);

}  // namespace recordgen
