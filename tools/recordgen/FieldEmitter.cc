#include "FieldEmitter.h"

#include "Naming.h"

namespace recordgen {

FieldEmitter::FieldEmitter(const google::protobuf::FieldDescriptor& field) : field_(field) {
  checkPropertyName(field);
  const std::string property = propertyName(field);
  const std::string element = elementName(field);
  vars_ = {
      {"key", field.name()},
      {"number", std::to_string(field.number())},
      {"prop", property},
      {"Prop", capitalized(property)},
      {"member", property + "_"},
      {"elem", element},
      {"Elem", capitalized(element)},
      {"bit", "kHas" + capitalized(property)},
  };
  if (field.message_type() != nullptr) vars_["Type"] = className(*field.message_type());
}

void FieldEmitter::setPresenceBit(int bit) {
  vars_["bitIndex"] = std::to_string(bit);
}

}  // namespace recordgen
