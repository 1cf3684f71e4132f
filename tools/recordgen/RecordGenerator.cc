#include "RecordGenerator.h"

#include <google/protobuf/io/printer.h>
#include <google/protobuf/io/zero_copy_stream.h>

#include <memory>
#include <stdexcept>

#include "FieldTable.h"
#include "MetricTable.h"
#include "Naming.h"
#include "RecordEmitter.h"
#include "WiresharkTable.h"

namespace recordgen {
namespace {

using google::protobuf::Descriptor;
using google::protobuf::FileDescriptor;
using google::protobuf::compiler::GeneratorContext;

constexpr const char* kBanner =
    "// GENERATED CODE from $source$ by recordgen. DO NOT EDIT.\n"
    "// The schema in proto/ is the single source of truth.\n\n";

// options.proto declares the generator's options and the messages they take; it holds no records.
bool declaresOptions(const FileDescriptor& file) {
  return file.extension_count() > 0;
}

// A record must follow every record whose enums its accessors name.
std::vector<const Descriptor*> definitionOrder(const FileDescriptor& file) {
  std::vector<const Descriptor*> ordered;
  std::vector<const Descriptor*> pending;
  for (int i = 0; i < file.message_type_count(); ++i)
    pending.push_back(file.message_type(i));
  auto isPlaced = [&](const Descriptor* message) {
    return message->file() != &file ||
           std::find(ordered.begin(), ordered.end(), message) != ordered.end();
  };
  while (!pending.empty()) {
    const auto ready = std::find_if(pending.begin(), pending.end(), [&](const Descriptor* message) {
      for (int f = 0; f < message->field_count(); ++f) {
        const auto* enumType = message->field(f)->enum_type();
        if (enumType == nullptr || enumType->containing_type() == nullptr) continue;
        if (enumType->containing_type() != message && !isPlaced(enumType->containing_type()))
          return false;
      }
      return true;
    });
    if (ready == pending.end())
      throw std::runtime_error(file.name() + ": records name each other's enums");
    ordered.push_back(*ready);
    pending.erase(ready);
  }
  return ordered;
}

void writeHeader(const FileDescriptor& file, const std::vector<const Descriptor*>& records,
                 GeneratorContext& context) {
  std::unique_ptr<google::protobuf::io::ZeroCopyOutputStream> out(
      context.Open(fileStem(file) + ".records.h"));
  Printer p(out.get(), '$');
  p.Print(kBanner, "source", file.name());
  p.Print(
      "#pragma once\n\n"
      "#include <cstddef>\n"
      "#include <cstdint>\n"
      "#include <memory>\n"
      "#include <optional>\n"
      "#include <string>\n"
      "#include <string_view>\n"
      "#include <typeinfo>\n"
      "#include <vector>\n\n"
      "#include \"codec/Codable.h\"\n"
      "#include \"codec/PackedRun.h\"\n"
      "#include \"platform/Value.h\"\n");
  for (int i = 0; i < file.dependency_count(); ++i) {
    const auto* dependency = file.dependency(i);
    if (declaresOptions(*dependency)) continue;
    p.Print("#include \"messages/$stem$.records.h\"\n", "stem", fileStem(*dependency));
  }
  p.Print("\nnamespace messages {\n\n");
  for (const auto* record : records)
    p.Print("class $Class$;\n", "Class", className(*record));
  p.Print("\n");
  for (int i = 0; i < file.enum_type_count(); ++i)
    declareTopLevelEnum(p, *file.enum_type(i));
  for (const auto* record : records)
    RecordEmitter(*record).declare(p);
  p.Print("}  // namespace messages\n");
}

void writeSource(const FileDescriptor& file, const std::vector<const Descriptor*>& records,
                 GeneratorContext& context) {
  std::unique_ptr<google::protobuf::io::ZeroCopyOutputStream> out(
      context.Open(fileStem(file) + ".records.cc"));
  Printer p(out.get(), '$');
  p.Print(kBanner, "source", file.name());
  p.Print(
      "#include \"messages/$stem$.records.h\"\n\n"
      "#include <typeinfo>\n\n"
      "#include \"codec/Cursor.h\"\n"
      "#include \"codec/Hash.h\"\n"
      "#include \"codec/PresenceBits.h\"\n"
      "#include \"messages/EnumNames.h\"\n"
      "#include \"messages/KBBMetricUtility.h\"\n"
      "#include \"messages/MetricIdTag.h\"\n\n"
      "namespace messages {\n"
      "namespace {\n\n",
      "stem", fileStem(file));
  for (int i = 0; i < file.enum_type_count(); ++i)
    defineEnumNames(p, *file.enum_type(i));
  for (const auto* record : records) {
    for (int i = 0; i < record->enum_type_count(); ++i)
      defineEnumNames(p, *record->enum_type(i));
  }
  p.Print("\n}  // namespace\n\n");
  for (int i = 0; i < file.enum_type_count(); ++i) {
    p.Print(
        "std::optional<std::string_view> nameOf$Enum$(std::int32_t value) {\n"
        "  return enumName(k$Enum$Names, value);\n"
        "}\n\n",
        "Enum", file.enum_type(i)->name());
  }
  for (const auto* record : records)
    RecordEmitter(*record).define(p);
  p.Print("}  // namespace messages\n");
}

void writeRegistry(const std::vector<const FileDescriptor*>& files, GeneratorContext& context) {
  {
    std::unique_ptr<google::protobuf::io::ZeroCopyOutputStream> out(context.Open("Records.h"));
    Printer p(out.get(), '$');
    p.Print(kBanner, "source", "proto/*.proto");
    p.Print("#pragma once\n\n#include \"messages/RecordClass.h\"\n");
    for (const auto* file : files) {
      p.Print("#include \"messages/$stem$.records.h\"\n", "stem", fileStem(*file));
    }
  }
  std::unique_ptr<google::protobuf::io::ZeroCopyOutputStream> out(context.Open("Records.cc"));
  Printer p(out.get(), '$');
  p.Print(kBanner, "source", "proto/*.proto");
  // Each class's operations behind function pointers, so that tools and tests
  // reach every record without naming its class.
  p.Print(
      "#include \"messages/Records.h\"\n\n"
      "#include <stdexcept>\n"
      "#include <typeinfo>\n\n"
      "namespace messages {\n"
      "namespace {\n\n"
      "template <class Record>\n"
      "Record& as(const codec::Codable& record) {\n"
      "  if (typeid(record) != typeid(Record)) throw std::invalid_argument(\"a record of another "
      "class\");\n"
      "  return const_cast<Record&>(static_cast<const Record&>(record));\n"
      "}\n\n"
      "template <class Record>\n"
      "constexpr RecordClass recordClass(std::string_view name, bool appliesMetricIdTagRule) {\n"
      "  return {name,\n"
      "          []() -> std::shared_ptr<codec::Codable> { return std::make_shared<Record>(); },\n"
      "          appliesMetricIdTagRule,\n"
      "          [](const codec::Codable& record) -> std::shared_ptr<codec::Codable> {\n"
      "            return as<Record>(record).copyWithZone();\n"
      "          },\n"
      "          [](const codec::Codable& record, codec::Codable& other) { "
      "as<Record>(record).copyTo(as<Record>(other)); },\n"
      "          [](codec::Codable& record, const codec::Codable& other) { "
      "as<Record>(record).mergeFrom(as<Record>(other)); }};\n"
      "}\n\n"
      "constexpr RecordClass kRecordClasses[] = {\n");
  for (const auto* file : files) {
    for (int i = 0; i < file->message_type_count(); ++i) {
      const auto& record = *file->message_type(i);
      p.Print("    recordClass<$Class$>(\"$Class$\", $rule$),\n", "Class", className(record),
              "rule", RecordEmitter(record).appliesMetricIdTagRule() ? "true" : "false");
    }
  }
  p.Print(
      "};\n\n"
      "}  // namespace\n\n"
      "std::span<const RecordClass> recordClasses() { return kRecordClasses; }\n\n"
      "const RecordClass* recordClassNamed(std::string_view name) {\n"
      "  for (const auto& recordClass : kRecordClasses) {\n"
      "    if (recordClass.name == name) return &recordClass;\n"
      "  }\n"
      "  return nullptr;\n"
      "}\n\n"
      "}  // namespace messages\n");
}

}  // namespace

bool RecordGenerator::Generate(const FileDescriptor* file, const std::string&,
                               GeneratorContext* context, std::string* error) const {
  try {
    const auto records = definitionOrder(*file);
    writeHeader(*file, records, *context);
    writeSource(*file, records, *context);
    return true;
  } catch (const std::exception& failure) {
    *error = failure.what();
    return false;
  }
}

bool RecordGenerator::GenerateAll(const std::vector<const FileDescriptor*>& files,
                                  const std::string& parameter, GeneratorContext* context,
                                  std::string* error) const {
  std::vector<const FileDescriptor*> schemas;
  for (const auto* file : files) {
    if (!declaresOptions(*file)) schemas.push_back(file);
  }
  try {
    if (parameter == "wireshark") {
      writeWiresharkTable(schemas, *context);
      return true;
    }
    for (const auto* file : schemas) {
      if (!Generate(file, parameter, context, error)) return false;
    }
    writeRegistry(schemas, *context);
    writeFieldTable(schemas, *context);
    writeMetricTable(schemas, *context);
    return true;
  } catch (const std::exception& failure) {
    *error = failure.what();
    return false;
  }
}

}  // namespace recordgen
