#include "RecordEmitter.h"

#include <algorithm>
#include <stdexcept>
#include <tuple>

#include "Naming.h"
#include "options.pb.h"

namespace recordgen {
namespace {

using google::protobuf::Descriptor;
using google::protobuf::EnumDescriptor;
using google::protobuf::FieldDescriptor;

// Presence flags: 64-bit fields first, then 32-bit ones, then booleans, each
// group alphabetical by property.
int presenceGroup(const FieldDescriptor& field) {
  switch (field.type()) {
    case FieldDescriptor::TYPE_UINT64:
      return 0;
    case FieldDescriptor::TYPE_BOOL:
      return 2;
    default:
      return 1;
  }
}

void printEnumValues(Printer& p, const EnumDescriptor& enumType) {
  p.Indent();
  for (int i = 0; i < enumType.value_count(); ++i) {
    const auto* value = enumType.value(i);
    p.Print("$name$ = $number$,\n", "name", value->name(), "number",
            std::to_string(value->number()));
  }
  p.Outdent();
}

std::string enumTableName(const EnumDescriptor& enumType) {
  const auto* owner = enumType.containing_type();
  return "k" + (owner == nullptr ? std::string() : className(*owner)) + enumType.name() + "Names";
}

}  // namespace

RecordEmitter::RecordEmitter(const Descriptor& message)
    : message_(message),
      rawFieldNumbers_(message.options().GetExtension(norvo::raw_field_numbers)) {
  vars_["Class"] = className(message);
  std::vector<FieldEmitter*> scalars;
  for (int i = 0; i < message.field_count(); ++i) {
    fields_.push_back(makeFieldEmitter(*message.field(i)));
    if (fields_.back()->isScalar()) scalars.push_back(fields_.back().get());
    byNumber_.push_back(fields_.back().get());
  }
  if (scalars.size() > 64)
    throw std::runtime_error(message.full_name() + " has more than 64 scalar fields");
  std::sort(scalars.begin(), scalars.end(), [](const FieldEmitter* a, const FieldEmitter* b) {
    return std::make_tuple(presenceGroup(a->field()), propertyName(a->field())) <
           std::make_tuple(presenceGroup(b->field()), propertyName(b->field()));
  });
  for (std::size_t bit = 0; bit < scalars.size(); ++bit)
    scalars[bit]->setPresenceBit(static_cast<int>(bit));
  std::sort(byNumber_.begin(), byNumber_.end(), [](const FieldEmitter* a, const FieldEmitter* b) {
    return a->field().number() < b->field().number();
  });
  vars_["hasScalars"] = scalars.empty() ? "" : "yes";
}

void RecordEmitter::declareEnum(Printer& p, const EnumDescriptor& enumType) const {
  p.Print("enum $Enum$ : std::int32_t {\n", "Enum", enumType.name());
  printEnumValues(p, enumType);
  p.Print("};\n");
  p.Print("static std::optional<std::string_view> nameOf$Enum$(std::int32_t value);\n\n", "Enum",
          enumType.name());
}

void RecordEmitter::declare(Printer& p) const {
  p.Print(vars_,
          "class $Class$ final : public codec::Codable {\n"
          " public:\n");
  p.Indent();
  for (int i = 0; i < message_.enum_type_count(); ++i)
    declareEnum(p, *message_.enum_type(i));
  p.Print(vars_,
          "// Absent when `data` does not decode cleanly.\n"
          "static std::shared_ptr<$Class$> initWithData(const platform::Bytes* data);\n\n");
  for (const auto& field : fields_) {
    field->declareAccessors(p);
    p.Print("\n");
  }
  p.Print(vars_,
          "[[nodiscard]] bool readFrom(codec::Reader& reader) override;\n"
          "void writeTo(codec::Writer& writer) const override;\n"
          "void copyTo($Class$& other) const;\n"
          "std::shared_ptr<$Class$> copyWithZone() const;\n"
          "void mergeFrom(const $Class$& other);\n"
          "bool isEqual(const codec::Codable& object) const override;\n"
          "std::uint64_t hash() const override;\n"
          "platform::Dictionary dictionaryRepresentation() const override;\n"
          "std::string_view className() const override { return \"$Class$\"; }\n");
  p.Outdent();
  p.Print("\n private:\n");
  p.Indent();
  if (!vars_.at("hasScalars").empty()) p.Print("std::uint64_t presence_ = 0;\n");
  for (const auto& field : fields_)
    field->declareMember(p);
  p.Outdent();
  p.Print("};\n\n");
}

void RecordEmitter::define(Printer& p) const {
  for (int i = 0; i < message_.enum_type_count(); ++i) {
    const auto& enumType = *message_.enum_type(i);
    p.Print(
        "std::optional<std::string_view> $Class$::nameOf$Enum$(std::int32_t value) {\n"
        "  return enumName($table$, value);\n"
        "}\n\n",
        "Class", vars_.at("Class"), "Enum", enumType.name(), "table", enumTableName(enumType));
  }
  p.Print(vars_,
          "std::shared_ptr<$Class$> $Class$::initWithData(const platform::Bytes* data) {\n"
          "  return codec::initWithData<$Class$>(data);\n"
          "}\n\n");
  for (const auto& field : fields_)
    field->defineAccessors(p);
  defineReadFrom(p);
  defineWriteTo(p);
  defineCopies(p);
  defineIsEqual(p);
  defineHash(p);
  defineDictionary(p);
}

void RecordEmitter::defineReadFrom(Printer& p) const {
  // The position and the presence bits live in locals while the fields are read (see
  // codec::Cursor); the reader is brought up to date around anything that reads through it.
  p.Print(vars_,
          "bool $Class$::readFrom(codec::Reader& reader) {\n"
          "  if (reader.hasError()) return false;\n"
          "  codec::Cursor cursor(reader);\n");
  if (!vars_.at("hasScalars").empty()) p.Print("  codec::PresenceBits presence(presence_);\n");
  p.Print(
      "  while (cursor.hasMore()) {\n"
      "    const std::uint64_t key = cursor.readKey();\n"
      "    const auto wireType = static_cast<std::uint32_t>(key & 7);\n"
      "    if (wireType == codec::kWireEndGroup) break;\n");
  if (rawFieldNumbers_) {
    p.Print("    const std::uint32_t field = static_cast<std::uint32_t>(key) >> 3;\n");
  } else {
    // Metric IDs double as field numbers: such a field is consumed and logged,
    // never stored. Field numbers wrap at 16 bits.
    p.Print(vars_,
            "    const auto field = static_cast<std::uint16_t>(key >> 3);\n"
            "    if (KBBMetricUtility::isValidMetricIdTag(field, typeid($Class$))) {\n"
            "      cursor.storeTo(reader);\n"
            "      consumeMetricIdTag(reader, field);\n"
            "      cursor.loadFrom(reader);\n"
            "      continue;\n"
            "    }\n");
  }
  p.Print("    switch (field) {\n");
  p.Indent();
  p.Indent();
  p.Indent();
  for (const FieldEmitter* field : byNumber_) {
    p.Print("case $number$: {\n", "number", std::to_string(field->field().number()));
    p.Indent();
    field->decode(p);
    p.Print("break;\n");
    p.Outdent();
    p.Print("}\n");
  }
  p.Print(
      "default:\n"
      "  cursor.storeTo(reader);\n"
      "  if (!reader.skip(field, wireType)) return false;\n"
      "  cursor.loadFrom(reader);\n");
  p.Outdent();
  p.Outdent();
  p.Outdent();
  p.Print(
      "    }\n"
      "  }\n"
      "  return cursor.finish(reader);\n"
      "}\n\n");
}

void RecordEmitter::defineWriteTo(Printer& p) const {
  p.Print(vars_, "void $Class$::writeTo(codec::Writer& writer) const {\n");
  p.Indent();
  if (byNumber_.empty()) p.Print("(void)writer;\n");
  for (const FieldEmitter* field : byNumber_)
    field->encode(p);
  p.Outdent();
  p.Print("}\n\n");
}

void RecordEmitter::defineCopies(Printer& p) const {
  p.Print(vars_, "void $Class$::copyTo($Class$& other) const {\n");
  p.Indent();
  for (const auto& field : fields_)
    field->copyTo(p);
  p.Outdent();
  p.Print(vars_,
          "}\n\n"
          "std::shared_ptr<$Class$> $Class$::copyWithZone() const {\n"
          "  auto copy = std::make_shared<$Class$>();\n");
  p.Indent();
  if (!vars_.at("hasScalars").empty()) p.Print("copy->presence_ = presence_;\n");
  for (const auto& field : fields_)
    field->deepCopy(p);
  p.Outdent();
  p.Print(vars_,
          "  return copy;\n"
          "}\n\n"
          "void $Class$::mergeFrom(const $Class$& other) {\n");
  p.Indent();
  for (const auto& field : fields_)
    field->merge(p);
  p.Outdent();
  p.Print("}\n\n");
}

void RecordEmitter::defineIsEqual(Printer& p) const {
  p.Print(vars_,
          "bool $Class$::isEqual(const codec::Codable& object) const {\n"
          "  if (typeid(object) != typeid(*this)) return false;\n"
          "  [[maybe_unused]] const auto& other = static_cast<const $Class$&>(object);\n"
          "  return ");
  p.Indent();
  p.Indent();
  for (std::size_t i = 0; i < fields_.size(); ++i) {
    if (i > 0) p.Print(" &&\n");
    fields_[i]->equal(p);
  }
  if (fields_.empty()) p.Print("true");
  p.Print(";\n");
  p.Outdent();
  p.Outdent();
  p.Print("}\n\n");
}

void RecordEmitter::defineHash(Printer& p) const {
  p.Print(vars_,
          "std::uint64_t $Class$::hash() const {\n"
          "  std::uint64_t result = 0;\n");
  p.Indent();
  for (const auto& field : fields_)
    field->hash(p);
  p.Outdent();
  p.Print(
      "  return result;\n"
      "}\n\n");
}

void RecordEmitter::defineDictionary(Printer& p) const {
  Variables vars = vars_;
  vars["count"] = std::to_string(fields_.size());
  p.Print(vars,
          "platform::Dictionary $Class$::dictionaryRepresentation() const {\n"
          "  platform::Dictionary dictionary;\n"
          "  dictionary.reserve($count$);\n");
  p.Indent();
  for (const auto& field : fields_)
    field->dictionary(p);
  p.Outdent();
  p.Print(
      "  return dictionary;\n"
      "}\n\n");
}

void defineEnumNames(Printer& p, const EnumDescriptor& enumType) {
  p.Print("constexpr EnumName $table$[] = {\n", "table", enumTableName(enumType));
  std::vector<std::pair<int, std::string>> rows;
  for (int i = 0; i < enumType.value_count(); ++i) {
    rows.emplace_back(enumType.value(i)->number(), enumType.value(i)->name());
  }
  std::sort(rows.begin(), rows.end());
  for (const auto& [number, name] : rows) {
    p.Print("    {$number$, \"$name$\"},\n", "number", std::to_string(number), "name", name);
  }
  p.Print("};\n");
}

void declareTopLevelEnum(Printer& p, const EnumDescriptor& enumType) {
  p.Print("enum $Enum$ : std::int32_t {\n", "Enum", enumType.name());
  printEnumValues(p, enumType);
  p.Print(
      "};\n"
      "std::optional<std::string_view> nameOf$Enum$(std::int32_t value);\n\n",
      "Enum", enumType.name());
}

}  // namespace recordgen
