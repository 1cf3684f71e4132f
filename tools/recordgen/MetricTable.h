#pragma once

#include <google/protobuf/compiler/code_generator.h>
#include <google/protobuf/descriptor.h>

#include <vector>

namespace recordgen {

// Writes Metrics.h: the one table of the metrics a baseband delivers (ID, name, record class),
// read from the `metric_id` options of the schemas, and a constant per metric.
void writeMetricTable(const std::vector<const google::protobuf::FileDescriptor*>& files,
                      google::protobuf::compiler::GeneratorContext& context);

}  // namespace recordgen
