#pragma once

#include <google/protobuf/descriptor.h>
#include <google/protobuf/io/printer.h>

#include <map>
#include <memory>
#include <string>

namespace recordgen {

using Printer = google::protobuf::io::Printer;
using Variables = std::map<std::string, std::string>;

// Emits the code of one field for every part of a record. Each field kind has
// its own emitter; the record emitter only strings the parts together.
class FieldEmitter {
 public:
  explicit FieldEmitter(const google::protobuf::FieldDescriptor& field);
  virtual ~FieldEmitter() = default;

  const google::protobuf::FieldDescriptor& field() const { return field_; }
  // Scalars take a presence bit; the rest are present when not absent.
  virtual bool isScalar() const { return false; }
  void setPresenceBit(int bit);

  virtual void declareAccessors(Printer& p) const = 0;  // public, in the class
  virtual void declareMember(Printer& p) const = 0;     // private, in the class
  virtual void defineAccessors(Printer&) const {}       // out of line, in the source
  virtual void decode(Printer& p) const = 0;            // body of `case <number>:`
  virtual void encode(Printer& p) const = 0;
  virtual void copyTo(Printer& p) const = 0;      // into `other`, sharing
  virtual void deepCopy(Printer& p) const = 0;    // into `copy`, copying
  virtual void merge(Printer& p) const = 0;       // from `other`
  virtual void equal(Printer& p) const = 0;       // a term of a conjunction
  virtual void hash(Printer& p) const = 0;        // xors into `result`
  virtual void dictionary(Printer& p) const = 0;  // appends to `dictionary`

 protected:
  const google::protobuf::FieldDescriptor& field_;
  Variables vars_;
};

// The emitter for the field's kind; throws on a kind records do not support.
std::unique_ptr<FieldEmitter> makeFieldEmitter(const google::protobuf::FieldDescriptor& field);

}  // namespace recordgen
