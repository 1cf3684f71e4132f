// One emitter per field kind: scalars (numbers, booleans and enums), text and
// byte buffers, nested records, lists of records and packed runs.
#include <stdexcept>

#include "FieldEmitter.h"
#include "Naming.h"

namespace recordgen {
namespace {

using google::protobuf::FieldDescriptor;

struct ScalarKind {
  const char* ctype;
  const char* decoded;  // the value read from the wire
  const char* writer;
  const char* widened;  // the value as 64 bits for the hash
};

ScalarKind scalarKind(const FieldDescriptor& field) {
  switch (field.type()) {
    case FieldDescriptor::TYPE_UINT64:
      return {"std::uint64_t", "cursor.readVarint()", "writeUint64", "$member$"};
    case FieldDescriptor::TYPE_UINT32:
      return {"std::uint32_t", "static_cast<std::uint32_t>(cursor.readVarint())", "writeUint32",
              "static_cast<std::uint64_t>($member$)"};
    case FieldDescriptor::TYPE_SINT32:
      return {"std::int32_t", "codec::decodeZigzag32(cursor.readVarint())", "writeSint32",
              "static_cast<std::uint64_t>(static_cast<std::int64_t>($member$))"};
    case FieldDescriptor::TYPE_BOOL:
      return {"bool", "cursor.readVarint() != 0", "writeBool",
              "static_cast<std::uint64_t>($member$)"};
    case FieldDescriptor::TYPE_ENUM:
      return {"std::int32_t",
              "static_cast<std::int32_t>(static_cast<std::uint32_t>(cursor.readVarint()))",
              "writeInt32", "static_cast<std::uint64_t>(static_cast<std::int64_t>($member$))"};
    default:
      throw std::runtime_error("field " + field.full_name() +
                               " has a scalar type records do not support");
  }
}

class ScalarEmitter : public FieldEmitter {
 public:
  explicit ScalarEmitter(const FieldDescriptor& field) : FieldEmitter(field) {
    const ScalarKind kind = scalarKind(field);
    vars_["ctype"] = kind.ctype;
    vars_["decoded"] = kind.decoded;
    vars_["writer"] = kind.writer;
    vars_["widened"] = kind.widened;
    vars_["widened"].replace(vars_["widened"].find("$member$"), 8, vars_["member"]);
    isEnum_ = field.type() == FieldDescriptor::TYPE_ENUM;
    if (isEnum_) {
      vars_["EnumType"] = enumTypeName(*field.enum_type());
      vars_["nameOf"] = enumNameFunction(*field.enum_type());
      vars_["default"] = std::to_string(field.default_value_enum()->number());
    }
  }

  bool isScalar() const override { return true; }

  void declareAccessors(Printer& p) const override {
    if (isEnum_) {
      // An enum reads as its default while absent.
      p.Print(vars_,
              "$EnumType$ $prop$() const {\n"
              "  return (presence_ & $bit$) != 0 ? static_cast<$EnumType$>($member$)\n"
              "                                  : static_cast<$EnumType$>($default$);\n"
              "}\n"
              "void set$Prop$($EnumType$ value) {\n");
    } else {
      p.Print(vars_,
              "$ctype$ $prop$() const { return $member$; }\n"
              "void set$Prop$($ctype$ value) {\n");
    }
    p.Print(vars_,
            "  $member$ = value;\n"
            "  presence_ |= $bit$;\n"
            "}\n"
            "bool has$Prop$() const { return (presence_ & $bit$) != 0; }\n"
            "void setHas$Prop$(bool value) { presence_ = value ? presence_ | $bit$ : presence_ & "
            "~$bit$; }\n");
  }
  void declareMember(Printer& p) const override {
    p.Print(vars_,
            "static constexpr std::uint64_t $bit$ = std::uint64_t{1} << $bitIndex$;\n"
            "$ctype$ $member${};\n");
  }
  void decode(Printer& p) const override {
    p.Print(vars_,
            "presence.add($bit$);\n"
            "$member$ = $decoded$;\n");
  }
  void encode(Printer& p) const override {
    p.Print(vars_, "if ((presence_ & $bit$) != 0) writer.$writer$($member$, $number$);\n");
  }
  void copyTo(Printer& p) const override {
    p.Print(vars_,
            "if ((presence_ & $bit$) != 0) {\n"
            "  other.$member$ = $member$;\n"
            "  other.presence_ |= $bit$;\n"
            "}\n");
  }
  void deepCopy(Printer& p) const override { p.Print(vars_, "copy->$member$ = $member$;\n"); }
  void merge(Printer& p) const override {
    p.Print(vars_,
            "if ((other.presence_ & $bit$) != 0) {\n"
            "  $member$ = other.$member$;\n"
            "  presence_ |= $bit$;\n"
            "}\n");
  }
  void equal(Printer& p) const override {
    p.Print(vars_,
            "((presence_ & $bit$) == (other.presence_ & $bit$) &&\n"
            " ((presence_ & $bit$) == 0 || $member$ == other.$member$))");
  }
  void hash(Printer& p) const override {
    p.Print(vars_, "if ((presence_ & $bit$) != 0) result ^= codec::hashScalar($widened$);\n");
  }
  void dictionary(Printer& p) const override {
    if (isEnum_) {
      p.Print(vars_,
              "if ((presence_ & $bit$) != 0) {\n"
              "  dictionary.append(\"$key$\", enumText($nameOf$($member$), $member$));\n"
              "}\n");
    } else {
      p.Print(vars_,
              "if ((presence_ & $bit$) != 0) dictionary.append(\"$key$\", "
              "platform::Value($member$));\n");
    }
  }

 private:
  bool isEnum_ = false;
};

// Text and byte buffers: present when not absent.
class TextEmitter : public FieldEmitter {
 public:
  explicit TextEmitter(const FieldDescriptor& field) : FieldEmitter(field) {
    const bool isString = field.type() == FieldDescriptor::TYPE_STRING;
    vars_["ctype"] = isString ? "std::string" : "platform::Bytes";
    vars_["kind"] = isString ? "String" : "Bytes";
  }

  void declareAccessors(Printer& p) const override {
    p.Print(vars_,
            "const std::optional<$ctype$>& $prop$() const { return $member$; }\n"
            "void set$Prop$(std::optional<$ctype$> value) { $member$ = std::move(value); }\n"
            "bool has$Prop$() const { return $member$.has_value(); }\n");
  }
  void declareMember(Printer& p) const override {
    p.Print(vars_, "std::optional<$ctype$> $member$;\n");
  }
  void decode(Printer& p) const override {
    p.Print(vars_,
            "$member$ = cursor.read$kind$();\n"
            "if (cursor.hasError()) return cursor.finish(reader);\n");
  }
  void encode(Printer& p) const override {
    p.Print(vars_, "if ($member$) writer.write$kind$(*$member$, $number$);\n");
  }
  void copyTo(Printer& p) const override {
    p.Print(vars_, "if ($member$) other.$member$ = $member$;\n");
  }
  void deepCopy(Printer& p) const override { p.Print(vars_, "copy->$member$ = $member$;\n"); }
  void merge(Printer& p) const override {
    p.Print(vars_, "if (other.$member$) $member$ = other.$member$;\n");
  }
  void equal(Printer& p) const override { p.Print(vars_, "$member$ == other.$member$"); }
  void hash(Printer& p) const override { p.Print(vars_, "result ^= codec::hashOf($member$);\n"); }
  void dictionary(Printer& p) const override {
    p.Print(vars_, "if ($member$) dictionary.append(\"$key$\", platform::Value(*$member$));\n");
  }
};

// One nested record, shared by reference.
class MessageEmitter : public FieldEmitter {
 public:
  using FieldEmitter::FieldEmitter;

  void declareAccessors(Printer& p) const override {
    p.Print(vars_,
            "const std::shared_ptr<$Type$>& $prop$() const { return $member$; }\n"
            "void set$Prop$(std::shared_ptr<$Type$> value) { $member$ = std::move(value); }\n"
            "bool has$Prop$() const { return $member$ != nullptr; }\n");
  }
  void declareMember(Printer& p) const override {
    p.Print(vars_, "std::shared_ptr<$Type$> $member$;\n");
  }
  void decode(Printer& p) const override {
    // The new record is stored before it is read, so a failed read keeps it.
    p.Print(vars_,
            "$member$ = std::make_shared<$Type$>();\n"
            "if (!cursor.readNested(reader, *$member$)) return false;\n");
  }
  void encode(Printer& p) const override {
    p.Print(vars_, "if ($member$) writer.writeMessage(*$member$, $number$);\n");
  }
  void copyTo(Printer& p) const override {
    p.Print(vars_, "if ($member$) other.$member$ = $member$;\n");
  }
  void deepCopy(Printer& p) const override {
    p.Print(vars_, "if ($member$) copy->$member$ = $member$->copyWithZone();\n");
  }
  void merge(Printer& p) const override {
    p.Print(vars_,
            "if (other.$member$) {\n"
            "  if ($member$) {\n"
            "    $member$->mergeFrom(*other.$member$);\n"
            "  } else {\n"
            "    $member$ = other.$member$;\n"
            "  }\n"
            "}\n");
  }
  void equal(Printer& p) const override {
    p.Print(vars_, "codec::sameRecord($member$, other.$member$)");
  }
  void hash(Printer& p) const override { p.Print(vars_, "result ^= codec::hashOf($member$);\n"); }
  void dictionary(Printer& p) const override {
    p.Print(vars_,
            "if ($member$) dictionary.append(\"$key$\", "
            "platform::Value($member$->dictionaryRepresentation()));\n");
  }
};

// A list of records; the elements are shared by reference.
class RepeatedMessageEmitter : public FieldEmitter {
 public:
  using FieldEmitter::FieldEmitter;

  void declareAccessors(Printer& p) const override {
    p.Print(vars_,
            "const std::vector<std::shared_ptr<$Type$>>& $prop$() const { return $member$; }\n"
            "void set$Prop$(std::vector<std::shared_ptr<$Type$>> value) {\n"
            "  std::erase(value, nullptr);\n"
            "  $member$ = std::move(value);\n"
            "}\n"
            "void clear$Prop$() { $member$.clear(); }\n"
            "void add$Elem$(std::shared_ptr<$Type$> value) {\n"
            "  if (value) $member$.push_back(std::move(value));\n"
            "}\n"
            "std::size_t $prop$Count() const { return $member$.size(); }\n"
            "const std::shared_ptr<$Type$>& $elem$AtIndex(std::size_t index) const { return "
            "$member$.at(index); }\n"
            "static const std::type_info& $elem$Type();\n");
  }
  void declareMember(Printer& p) const override {
    p.Print(vars_, "std::vector<std::shared_ptr<$Type$>> $member$;\n");
  }
  void defineAccessors(Printer& p) const override {
    p.Print(vars_, "const std::type_info& $Class$::$elem$Type() { return typeid($Type$); }\n");
  }
  void decode(Printer& p) const override {
    // The element joins the list before it is read, so a failed read keeps it.
    p.Print(vars_,
            "if ($member$.empty()) $member$.reserve(cursor.countAdjacent(key));\n"
            "auto& element = $member$.emplace_back(std::make_shared<$Type$>());\n"
            "if (!cursor.readNested(reader, *element)) return false;\n");
  }
  void encode(Printer& p) const override {
    p.Print(vars_,
            "for (const auto& element : $member$) writer.writeMessage(*element, $number$);\n");
  }
  void copyTo(Printer& p) const override {
    p.Print(vars_, "if (!$member$.empty()) other.$member$ = $member$;\n");
  }
  void deepCopy(Printer& p) const override {
    p.Print(vars_,
            "copy->$member$.reserve($member$.size());\n"
            "for (const auto& element : $member$) "
            "copy->$member$.push_back(element->copyWithZone());\n");
  }
  void merge(Printer& p) const override {
    p.Print(vars_,
            "$member$.insert($member$.end(), other.$member$.begin(), other.$member$.end());\n");
  }
  void equal(Printer& p) const override {
    p.Print(vars_, "codec::sameRecords($member$, other.$member$)");
  }
  void hash(Printer& p) const override { p.Print(vars_, "result ^= codec::hashOf($member$);\n"); }
  void dictionary(Printer& p) const override {
    p.Print(vars_,
            "if (!$member$.empty()) {\n"
            "  platform::List list;\n"
            "  list.reserve($member$.size());\n"
            "  for (const auto& element : $member$) "
            "list.emplace_back(element->dictionaryRepresentation());\n"
            "  dictionary.append(\"$key$\", platform::Value(std::move(list)));\n"
            "}\n");
  }

  void setClass(const std::string& name) { vars_["Class"] = name; }
};

// A packed run of 32-bit values; always shown, as an empty list when empty.
class PackedEmitter : public FieldEmitter {
 public:
  explicit PackedEmitter(const FieldDescriptor& field) : FieldEmitter(field) {
    const bool isSigned = field.type() == FieldDescriptor::TYPE_SINT32;
    if (!isSigned && field.type() != FieldDescriptor::TYPE_UINT32) {
      throw std::runtime_error("packed field " + field.full_name() + " must be uint32 or sint32");
    }
    vars_["ctype"] = isSigned ? "std::int32_t" : "std::uint32_t";
    vars_["decode"] = isSigned
                          ? "codec::decodeZigzag32"
                          : "[](std::uint64_t value) { return static_cast<std::uint32_t>(value); }";
    vars_["writer"] = isSigned ? "writeSint32" : "writeUint32";
  }

  void declareAccessors(Printer& p) const override {
    p.Print(vars_,
            "const $ctype$* $prop$() const { return $member$.values(); }\n"
            "std::size_t $prop$Count() const { return $member$.count(); }\n"
            "void clear$Prop$() { $member$.clear(); }\n"
            "void add$Elem$($ctype$ value) { $member$.add(value); }\n"
            "// Throws std::out_of_range when `index` is not below the count.\n"
            "$ctype$ $elem$AtIndex(std::size_t index) const { return $member$.at(index); }\n"
            "void set$Prop$(const $ctype$* values, std::size_t count) { $member$.set(values, "
            "count); }\n");
  }
  void declareMember(Printer& p) const override {
    p.Print(vars_, "codec::PackedRun<$ctype$> $member$;\n");
  }
  void decode(Printer& p) const override {
    p.Print(
        vars_,
        "if (!cursor.readPacked(wireType, $member$, $decode$)) return cursor.finish(reader);\n");
  }
  void encode(Printer& p) const override {
    p.Print(vars_,
            "if ($member$.count() > 0) {\n"
            "  const auto mark = writer.openLengthDelimited($number$);\n"
            "  for (const $ctype$ value : $member$) writer.$writer$(value, codec::Writer::kBare);\n"
            "  writer.closeLengthDelimited(mark);\n"
            "}\n");
  }
  void copyTo(Printer& p) const override {
    p.Print(vars_, "if ($member$.count() > 0) other.$member$ = $member$;\n");
  }
  void deepCopy(Printer& p) const override { p.Print(vars_, "copy->$member$ = $member$;\n"); }
  void merge(Printer& p) const override {
    p.Print(vars_, "for (const $ctype$ value : other.$member$) $member$.add(value);\n");
  }
  void equal(Printer& p) const override { p.Print(vars_, "$member$ == other.$member$"); }
  void hash(Printer& p) const override { p.Print(vars_, "result ^= $member$.hash();\n"); }
  void dictionary(Printer& p) const override {
    p.Print(vars_, "dictionary.append(\"$key$\", platform::Value($member$.toList()));\n");
  }
};

}  // namespace

std::unique_ptr<FieldEmitter> makeFieldEmitter(const FieldDescriptor& field) {
  if (field.is_repeated()) {
    if (field.type() == FieldDescriptor::TYPE_MESSAGE) {
      auto emitter = std::make_unique<RepeatedMessageEmitter>(field);
      emitter->setClass(className(*field.containing_type()));
      return emitter;
    }
    if (!field.is_packed()) {
      throw std::runtime_error("repeated scalar field " + field.full_name() + " must be packed");
    }
    return std::make_unique<PackedEmitter>(field);
  }
  switch (field.type()) {
    case FieldDescriptor::TYPE_MESSAGE:
      return std::make_unique<MessageEmitter>(field);
    case FieldDescriptor::TYPE_STRING:
    case FieldDescriptor::TYPE_BYTES:
      return std::make_unique<TextEmitter>(field);
    default:
      return std::make_unique<ScalarEmitter>(field);
  }
}

}  // namespace recordgen
