#include "tarn/mm/BusValues.h"

#include <sdbus-c++/Error.h>

#include <cstdint>
#include <vector>

namespace tarn::mm {
namespace {

// Dictionaries nested deeper than ModemManager's are not read.
constexpr int kMaxDepth = 4;

Dict dictAt(const RawDict& raw, int depth);

Value valueAt(const sdbus::Variant& variant, int depth) {
  Value value{variant.peekValueType(), {}};
  const std::string& type = value.signature;
  try {
    if (type == "b") {
      value.content = variant.get<bool>();
    } else if (type == "y") {
      value.content = std::uint64_t{variant.get<std::uint8_t>()};
    } else if (type == "q") {
      value.content = std::uint64_t{variant.get<std::uint16_t>()};
    } else if (type == "u") {
      value.content = std::uint64_t{variant.get<std::uint32_t>()};
    } else if (type == "t") {
      value.content = variant.get<std::uint64_t>();
    } else if (type == "n") {
      value.content = std::int64_t{variant.get<std::int16_t>()};
    } else if (type == "i") {
      value.content = std::int64_t{variant.get<std::int32_t>()};
    } else if (type == "x") {
      value.content = variant.get<std::int64_t>();
    } else if (type == "d") {
      value.content = variant.get<double>();
    } else if (type == "s") {
      value.content = variant.get<std::string>();
    } else if (type == "o") {
      value.content = std::string(variant.get<sdbus::ObjectPath>());
    } else if (type == "as") {
      value.content = variant.get<std::vector<std::string>>();
    } else if (type == "ao") {
      std::vector<std::string> paths;
      for (const sdbus::ObjectPath& path : variant.get<std::vector<sdbus::ObjectPath>>())
        paths.emplace_back(path);
      value.content = std::move(paths);
    } else if (type == "a{sv}" && depth < kMaxDepth) {
      value.content = std::make_shared<const Dict>(dictAt(variant.get<RawDict>(), depth + 1));
    }
  } catch (const sdbus::Error&) {
    value.content = std::monostate{};  // the reader reports it as a value it cannot use
  }
  return value;
}

Dict dictAt(const RawDict& raw, int depth) {
  Dict dict;
  for (const auto& [key, variant] : raw)
    dict.emplace(key, valueAt(variant, depth));
  return dict;
}

}  // namespace

Value valueOf(const sdbus::Variant& variant) {
  return valueAt(variant, 0);
}

Dict dictOf(const RawDict& raw) {
  return dictAt(raw, 0);
}

}  // namespace tarn::mm
