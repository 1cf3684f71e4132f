#include "MetricTable.h"

#include <google/protobuf/io/printer.h>
#include <google/protobuf/io/zero_copy_stream.h>

#include <cstdio>
#include <memory>
#include <set>
#include <stdexcept>
#include <string>

#include "Naming.h"
#include "options.pb.h"

namespace recordgen {

using google::protobuf::FileDescriptor;

std::string hex(std::uint32_t id) {
  char text[16];
  std::snprintf(text, sizeof text, "0x%06X", id);
  return text;
}

std::vector<MetricRow> metricRows(const std::vector<const FileDescriptor*>& files) {
  std::vector<MetricRow> rows;
  for (const auto* file : files) {
    for (const auto& metric : file->options().GetRepeatedExtension(norvo::recordless_metric))
      rows.push_back({metric.id(), metric.name(), "", "", true});
    for (int i = 0; i < file->message_type_count(); ++i) {
      const auto& options = file->message_type(i)->options();
      if (!options.HasExtension(norvo::metric_id)) continue;
      const std::string recordClass = className(*file->message_type(i));
      rows.push_back({options.GetExtension(norvo::metric_id),
                      options.HasExtension(norvo::metric_name)
                          ? options.GetExtension(norvo::metric_name)
                          : recordClass,
                      recordClass, file->message_type(i)->full_name(),
                      options.GetExtension(norvo::metric_id_tag)});
    }
  }
  std::set<std::uint32_t> ids;
  for (const MetricRow& row : rows) {
    if ((row.id >> 16) != 0x3C)
      throw std::runtime_error(row.name + ": a metric ID has 0x3C in bits 16 to 23");
    if (!ids.insert(row.id).second)
      throw std::runtime_error(row.name + ": metric ID declared twice");
  }
  return rows;
}

void writeMetricTable(const std::vector<const FileDescriptor*>& files,
                      google::protobuf::compiler::GeneratorContext& context) {
  const std::vector<MetricRow> rows = metricRows(files);
  std::unique_ptr<google::protobuf::io::ZeroCopyOutputStream> out(context.Open("Metrics.h"));
  google::protobuf::io::Printer p(out.get(), '$');
  p.Print(
      "// GENERATED CODE from proto/*.proto by recordgen. DO NOT EDIT.\n"
      "// The schema in proto/ is the single source of truth.\n\n"
      "#pragma once\n\n"
      "#include <array>\n"
      "#include <cstdint>\n\n"
      "#include \"messages/MetricKind.h\"\n\n"
      "namespace messages {\n\n");
  for (const MetricRow& row : rows) {
    if (!row.recordClass.empty()) p.Print("class $Class$;\n", "Class", row.recordClass);
  }
  p.Print(
      "\n// Every metric, in schema order.\ninline constexpr std::array<MetricKind, $n$> "
      "kMetricKinds{{\n",
      "n", std::to_string(rows.size()));
  for (const MetricRow& row : rows) {
    p.Print("    {$id$, \"$name$\", \"$Class$\", $tag$},\n", "id", hex(row.id), "name", row.name,
            "Class", row.recordClass, "tag", row.tagListed ? "true" : "false");
  }
  p.Print(
      "}};\n\n"
      "// Each metric's ID, named by its record class (or, with no record, by its own name).\n"
      "namespace metric {\n");
  for (const MetricRow& row : rows) {
    p.Print("inline constexpr std::uint32_t $Name$ = $id$;\n", "Name",
            row.recordClass.empty() ? row.name : row.recordClass, "id", hex(row.id));
  }
  p.Print(
      "}  // namespace metric\n\n"
      "// The metric ID of the metric a record class carries.\n"
      "template <class Record>\n"
      "struct MetricOf;\n");
  for (const MetricRow& row : rows) {
    if (row.recordClass.empty()) continue;
    p.Print(
        "template <>\n"
        "struct MetricOf<$Class$> {\n"
        "  static constexpr std::uint32_t id = $id$;\n"
        "};\n",
        "Class", row.recordClass, "id", hex(row.id));
  }
  p.Print("\n}  // namespace messages\n");
}

}  // namespace recordgen
