#pragma once

#include <google/protobuf/compiler/code_generator.h>
#include <google/protobuf/descriptor.h>

#include <cstdint>
#include <string>
#include <vector>

namespace recordgen {

// One metric as the schemas declare it.
struct MetricRow {
  std::uint32_t id;
  std::string name;         // in the baseband's table of metric-ID tags
  std::string recordClass;  // empty when no record carries the metric
  std::string message;  // the record's protobuf message, e.g. "norvo.metrics.KCellularLteRrcState"
  bool tagListed;
};

// A metric ID as the generated tables write it, "0x3CD313".
std::string hex(std::uint32_t id);

// Every metric the schemas declare, in schema order; throws when two share an ID or an ID lacks
// 0x3C in bits 16 to 23.
std::vector<MetricRow> metricRows(
    const std::vector<const google::protobuf::FileDescriptor*>& files);

// Writes Metrics.h: the one table of the metrics a baseband delivers (ID, name, record class),
// read from the `metric_id` options of the schemas, and a constant per metric.
void writeMetricTable(const std::vector<const google::protobuf::FileDescriptor*>& files,
                      google::protobuf::compiler::GeneratorContext& context);

}  // namespace recordgen
