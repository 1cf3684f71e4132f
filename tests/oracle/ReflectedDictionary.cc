#include "oracle/ReflectedDictionary.h"

#include <stdexcept>
#include <string>

namespace oracle {
namespace {

using google::protobuf::FieldDescriptor;
using google::protobuf::Message;
using platform::Value;

Value singleValue(const Message& message, const FieldDescriptor& field) {
  const auto& reflection = *message.GetReflection();
  switch (field.type()) {
    case FieldDescriptor::TYPE_UINT64:
      return Value(reflection.GetUInt64(message, &field));
    case FieldDescriptor::TYPE_UINT32:
      return Value(reflection.GetUInt32(message, &field));
    case FieldDescriptor::TYPE_SINT32:
      return Value(reflection.GetInt32(message, &field));
    case FieldDescriptor::TYPE_BOOL:
      return Value(reflection.GetBool(message, &field));
    case FieldDescriptor::TYPE_ENUM:
      return Value(reflection.GetEnum(message, &field)->name());
    case FieldDescriptor::TYPE_STRING:
      return Value(reflection.GetString(message, &field));
    case FieldDescriptor::TYPE_BYTES: {
      const std::string bytes = reflection.GetString(message, &field);
      return Value(platform::Bytes(bytes.begin(), bytes.end()));
    }
    case FieldDescriptor::TYPE_MESSAGE:
      return Value(reflectedDictionary(reflection.GetMessage(message, &field)));
    default:
      throw std::logic_error("no record field has the kind of " + field.full_name());
  }
}

Value element(const Message& message, const FieldDescriptor& field, int index) {
  const auto& reflection = *message.GetReflection();
  switch (field.type()) {
    case FieldDescriptor::TYPE_MESSAGE:
      return Value(reflectedDictionary(reflection.GetRepeatedMessage(message, &field, index)));
    case FieldDescriptor::TYPE_UINT32:
      return Value(reflection.GetRepeatedUInt32(message, &field, index));
    case FieldDescriptor::TYPE_SINT32:
      return Value(reflection.GetRepeatedInt32(message, &field, index));
    default:
      throw std::logic_error("no record list has the kind of " + field.full_name());
  }
}

}  // namespace

platform::Dictionary reflectedDictionary(const Message& message) {
  const auto& type = *message.GetDescriptor();
  const auto& reflection = *message.GetReflection();
  platform::Dictionary dictionary;
  for (int index = 0; index < type.field_count(); ++index) {
    const FieldDescriptor& field = *type.field(index);
    if (!field.is_repeated()) {
      if (reflection.HasField(message, &field))
        dictionary.append(field.name(), singleValue(message, field));
      continue;
    }
    const int count = reflection.FieldSize(message, &field);
    // A list of messages shows only when it has elements; a packed run always shows.
    if (count == 0 && field.type() == FieldDescriptor::TYPE_MESSAGE) continue;
    platform::List list;
    for (int i = 0; i < count; ++i)
      list.push_back(element(message, field, i));
    dictionary.append(field.name(), Value(std::move(list)));
  }
  return dictionary;
}

}  // namespace oracle
