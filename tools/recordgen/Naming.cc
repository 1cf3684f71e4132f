#include "Naming.h"

#include <cctype>
#include <set>
#include <stdexcept>

#include "options.pb.h"

namespace recordgen {

std::string camelCase(const std::string& key) {
  std::string name;
  bool upperNext = false;
  for (const char c : key) {
    if (c == '_') {
      upperNext = true;
    } else if (name.empty()) {
      name += static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
      upperNext = false;
    } else {
      name += upperNext ? static_cast<char>(std::toupper(static_cast<unsigned char>(c))) : c;
      upperNext = false;
    }
  }
  return name;
}

std::string capitalized(const std::string& name) {
  std::string result = name;
  if (!result.empty())
    result[0] = static_cast<char>(std::toupper(static_cast<unsigned char>(result[0])));
  return result;
}

std::string propertyName(const google::protobuf::FieldDescriptor& field) {
  const std::string base = camelCase(field.name());
  const bool addPlural = field.is_repeated() && !field.options().GetExtension(norvo::plural);
  return addPlural ? base + "s" : base;
}

std::string elementName(const google::protobuf::FieldDescriptor& field) {
  return camelCase(field.name());
}

std::string className(const google::protobuf::Descriptor& message) {
  if (message.containing_type() != nullptr) {
    throw std::runtime_error("nested message " + message.full_name() + " is not supported");
  }
  return message.name();
}

std::string enumTypeName(const google::protobuf::EnumDescriptor& enumType) {
  const auto* owner = enumType.containing_type();
  return owner == nullptr ? enumType.name() : className(*owner) + "::" + enumType.name();
}

std::string enumNameFunction(const google::protobuf::EnumDescriptor& enumType) {
  const auto* owner = enumType.containing_type();
  const std::string function = "nameOf" + enumType.name();
  return owner == nullptr ? function : className(*owner) + "::" + function;
}

std::string fileStem(const google::protobuf::FileDescriptor& file) {
  std::string stem = file.name();
  if (const auto slash = stem.rfind('/'); slash != std::string::npos) stem.erase(0, slash + 1);
  if (const auto dot = stem.rfind(".proto"); dot != std::string::npos) stem.erase(dot);
  return stem;
}

void checkPropertyName(const google::protobuf::FieldDescriptor& field) {
  static const std::set<std::string> reserved = {
      // C++ keywords a key could plausibly spell
      "auto", "bool", "break", "case", "catch", "char", "class", "const", "default", "delete", "do",
      "double", "else", "enum", "explicit", "export", "extern", "false", "float", "for", "friend",
      "goto", "if", "inline", "int", "long", "mutable", "namespace", "new", "operator", "private",
      "protected", "public", "register", "return", "short", "signed", "sizeof", "static", "struct",
      "switch", "template", "this", "throw", "true", "try", "typedef", "typename", "union",
      "unsigned", "using", "virtual", "void", "volatile", "while",
      // operations every record has
      "readFrom", "writeTo", "copyTo", "copyWithZone", "mergeFrom", "isEqual", "hash",
      "dictionaryRepresentation", "description", "className", "data", "initWithData", "presence"};
  const std::string property = propertyName(field);
  if (reserved.count(property) != 0 || reserved.count(elementName(field)) != 0) {
    throw std::runtime_error("field " + field.full_name() + " would be named '" + property +
                             "', which a record cannot use");
  }
}

}  // namespace recordgen
