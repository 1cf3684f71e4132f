#include "codec/Codable.h"

#include "platform/Format.h"

namespace codec {

std::string Codable::description() const {
  const platform::Value dictionary(dictionaryRepresentation());
  return platform::format("<%s: 0x%x> %@", className(), reinterpret_cast<std::uintptr_t>(this),
                          dictionary);
}

platform::Bytes Codable::data() const {
  Writer writer;
  writeTo(writer);
  return writer.take();
}

}  // namespace codec
