#include "WiresharkTable.h"

#include <google/protobuf/io/printer.h>
#include <google/protobuf/io/zero_copy_stream.h>

#include <memory>

#include "MetricTable.h"

namespace recordgen {

void writeWiresharkTable(const std::vector<const google::protobuf::FileDescriptor*>& files,
                         google::protobuf::compiler::GeneratorContext& context) {
  std::unique_ptr<google::protobuf::io::ZeroCopyOutputStream> out(context.Open("metrics.lua"));
  google::protobuf::io::Printer p(out.get(), '$');
  p.Print(
      "-- GENERATED from proto/*.proto by recordgen. DO NOT EDIT.\n"
      "-- The schema in proto/ is the single source of truth.\n\n"
      "-- Each metric by its ID: its name in the baseband's table, and the record that carries\n"
      "-- it with that record's protobuf message (none for a metric no record carries).\n"
      "local metrics = {\n");
  for (const MetricRow& row : metricRows(files)) {
    const std::string id = hex(row.id);
    if (row.recordClass.empty()) {
      p.Print("  [$id$] = { name = \"$name$\" },\n", "id", id, "name", row.name);
    } else {
      p.Print("  [$id$] = { name = \"$name$\", record = \"$Class$\", message = \"$message$\" },\n",
              "id", id, "name", row.name, "Class", row.recordClass, "message", row.message);
    }
  }
  p.Print("}\n\n");
}

}  // namespace recordgen
