#pragma once

#include <google/protobuf/compiler/code_generator.h>
#include <google/protobuf/descriptor.h>

#include <vector>

namespace recordgen {

// Writes metrics.lua: the Wireshark dissector's table from metric ID to the metric's name, its
// record class and the record's protobuf message, read from the same `metric_id` options of
// the schemas as Metrics.h. recordgen writes it, and nothing else, when its parameter is
// "wireshark".
void writeWiresharkTable(const std::vector<const google::protobuf::FileDescriptor*>& files,
                         google::protobuf::compiler::GeneratorContext& context);

}  // namespace recordgen
