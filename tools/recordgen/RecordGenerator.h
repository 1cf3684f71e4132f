#pragma once

#include <google/protobuf/compiler/code_generator.h>

namespace recordgen {

// A protoc plugin: for each schema file x.proto it writes x.records.h and
// x.records.cc, and for the whole run Records.h and Records.cc, which include
// every record and list every record class, RecordFields.cc, every class's
// fields, and Metrics.h, the table of metrics. With the parameter "wireshark"
// it writes only the Wireshark dissector's table of metrics, metrics.lua.
class RecordGenerator : public google::protobuf::compiler::CodeGenerator {
 public:
  bool Generate(const google::protobuf::FileDescriptor* file, const std::string& parameter,
                google::protobuf::compiler::GeneratorContext* context,
                std::string* error) const override;
  bool GenerateAll(const std::vector<const google::protobuf::FileDescriptor*>& files,
                   const std::string& parameter,
                   google::protobuf::compiler::GeneratorContext* context,
                   std::string* error) const override;
};

}  // namespace recordgen
