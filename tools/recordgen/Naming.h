#pragma once

#include <google/protobuf/descriptor.h>

#include <string>

namespace recordgen {

// Keys are the dictionary keys; a record's property names derive from them:
// "rx_info" -> rxInfo, "QRxLevMin" -> qRxLevMin, "si_7_8_broadcast" -> si78Broadcast.
std::string camelCase(const std::string& key);
std::string capitalized(const std::string& name);

// The property of a field: camelCase of its key, plus "s" for a repeated
// field whose key is not already plural.
std::string propertyName(const google::protobuf::FieldDescriptor& field);
// The singular used by add...: and ...AtIndex: of a repeated field.
std::string elementName(const google::protobuf::FieldDescriptor& field);

// C++ names of record classes and enums as seen from namespace `messages`.
std::string className(const google::protobuf::Descriptor& message);
std::string enumTypeName(const google::protobuf::EnumDescriptor& enumType);
// The function that names an enum's values: Owner::nameOfState or nameOfSysBand.
std::string enumNameFunction(const google::protobuf::EnumDescriptor& enumType);

// "lte_rrc.proto" -> "lte_rrc"
std::string fileStem(const google::protobuf::FileDescriptor& file);

// Fails loudly when a property would collide with a C++ keyword or a record
// operation.
void checkPropertyName(const google::protobuf::FieldDescriptor& field);

}  // namespace recordgen
