// Feeds arbitrary bytes to one record's decoder, then encodes and converts whatever came out.
// The first byte picks the record class, so that each input exercises one decoder rather than
// all of them; the rest is the payload. A malformed payload must never crash, hang or read out
// of bounds, and whatever a record holds must survive its own encoding.
#include <cstdint>
#include <cstdio>
#include <cstdlib>

#include "codec/Reader.h"
#include "messages/RecordClass.h"
#include "messages/Records.h"
#include "platform/Json.h"
#include "platform/Log.h"

namespace {

[[noreturn]] void fail(std::string_view recordClass, const char* what) {
  std::fprintf(stderr, "%.*s: %s\n", static_cast<int>(recordClass.size()), recordClass.data(),
               what);
  std::abort();
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  // Decoders log every unknown field; writing those lines would cost more than the decoding.
  static const platform::log::Silence silence;
  if (size == 0) return 0;
  const auto classes = messages::recordClasses();
  const messages::RecordClass& recordClass = classes[data[0] % classes.size()];

  const auto record = recordClass.create();
  codec::Reader reader(data + 1, size - 1);
  (void)record->readFrom(reader);
  if (reader.position() > reader.length()) fail(recordClass.name, "read past the end");

  const platform::Bytes encoded = record->data();
  (void)platform::toJson(platform::Value(record->dictionaryRepresentation()));
  (void)record->description();

  const auto again = recordClass.create();
  codec::Reader rereader(encoded);
  if (!again->readFrom(rereader)) fail(recordClass.name, "its own encoding does not decode");
  if (!again->isEqual(*record))
    fail(recordClass.name, "its own encoding decodes to another record");
  if (again->hash() != record->hash()) fail(recordClass.name, "equal records hash differently");
  if (!recordClass.copyWithZone(*record)->isEqual(*record))
    fail(recordClass.name, "a deep copy differs");
  recordClass.mergeFrom(*again, *record);
  (void)again->data();
  return 0;
}
