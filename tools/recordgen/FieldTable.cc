#include "FieldTable.h"

#include <google/protobuf/io/printer.h>
#include <google/protobuf/io/zero_copy_stream.h>

#include <memory>

#include "Naming.h"

namespace recordgen {
namespace {

using google::protobuf::Descriptor;
using google::protobuf::FieldDescriptor;

std::string shapeOf(const FieldDescriptor& field) {
  if (field.type() == FieldDescriptor::TYPE_MESSAGE)
    return field.is_repeated() ? "RecordList" : "Record";
  return field.is_repeated() ? "NumberList" : "Value";
}

}  // namespace

void writeFieldTable(const std::vector<const google::protobuf::FileDescriptor*>& files,
                     google::protobuf::compiler::GeneratorContext& context) {
  std::unique_ptr<google::protobuf::io::ZeroCopyOutputStream> out(context.Open("RecordFields.cc"));
  google::protobuf::io::Printer p(out.get(), '$');
  p.Print(
      "// GENERATED CODE from proto/*.proto by recordgen. DO NOT EDIT.\n"
      "// The schema in proto/ is the single source of truth.\n\n"
      "#include \"messages/RecordFields.h\"\n\n"
      "namespace messages {\n"
      "namespace {\n\n"
      "using Shape = RecordField::Shape;\n\n");
  std::vector<const Descriptor*> records;
  for (const auto* file : files) {
    for (int i = 0; i < file->message_type_count(); ++i)
      records.push_back(file->message_type(i));
  }
  for (const Descriptor* record : records) {
    p.Print("constexpr RecordField k$Class$Fields[] = {\n", "Class", className(*record));
    for (int f = 0; f < record->field_count(); ++f) {
      const FieldDescriptor& field = *record->field(f);
      p.Print("    {\"$key$\", Shape::$shape$, \"$Class$\"},\n", "key", field.name(), "shape",
              shapeOf(field), "Class",
              field.message_type() != nullptr ? className(*field.message_type()) : "");
    }
    p.Print("};\n");
  }
  p.Print(
      "\nstruct ClassFields {\n"
      "  std::string_view recordClass;\n"
      "  std::span<const RecordField> fields;\n"
      "};\n\n"
      "constexpr ClassFields kClasses[] = {\n");
  for (const Descriptor* record : records)
    p.Print("    {\"$Class$\", k$Class$Fields},\n", "Class", className(*record));
  p.Print(
      "};\n\n"
      "}  // namespace\n\n"
      "std::span<const RecordField> recordFields(std::string_view recordClass) {\n"
      "  for (const ClassFields& entry : kClasses) {\n"
      "    if (entry.recordClass == recordClass) return entry.fields;\n"
      "  }\n"
      "  return {};\n"
      "}\n\n"
      "}  // namespace messages\n");
}

}  // namespace recordgen
