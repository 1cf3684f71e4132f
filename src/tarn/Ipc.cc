#include "tarn/Ipc.h"

#include <algorithm>

namespace tarn::ipc {

Object Object::integer(std::int64_t value) {
  return Object(std::in_place_type<std::int64_t>, value);
}

Object Object::bytes(platform::Bytes value) {
  if (value.size() > kMaxBufferSize) return Object();
  return Object(std::in_place_type<platform::Bytes>, std::move(value));
}

Object Object::text(std::string value) {
  return Object(std::in_place_type<std::string>, std::move(value));
}

Object Object::array(Array elements) {
  return Object(std::in_place_type<Array>, std::move(elements));
}

Object Object::dictionary(Entries entries) {
  return Object(std::in_place_type<Entries>, std::move(entries));
}

const Object* Object::find(std::string_view key) const {
  const Entries* entries = asDictionary();
  if (entries == nullptr) return nullptr;
  const auto entry = std::find_if(entries->begin(), entries->end(),
                                  [key](const Entry& candidate) { return candidate.first == key; });
  return entry != entries->end() ? &entry->second : nullptr;
}

void Object::set(std::string_view key, Object value) {
  if (!isDictionary()) value_ = Entries();
  Entries& entries = std::get<Entries>(value_);
  for (Entry& entry : entries) {
    if (entry.first == key) {
      entry.second = std::move(value);
      return;
    }
  }
  entries.emplace_back(std::string(key), std::move(value));
}

namespace {

struct ToPlain {
  platform::Value operator()(std::monostate) const { return {}; }
  platform::Value operator()(std::int64_t value) const { return value; }
  platform::Value operator()(const platform::Bytes& value) const { return value; }
  platform::Value operator()(const std::string& value) const { return value; }

  platform::Value operator()(const Object::Array& elements) const {
    platform::List list;
    list.reserve(elements.size());
    for (const Object& element : elements)
      list.push_back(toPlainDictionary(element));
    return list;
  }

  platform::Value operator()(const Object::Entries& entries) const {
    platform::Dictionary dictionary;
    dictionary.reserve(entries.size());
    // The keys of an IPC dictionary are unique already.
    for (const auto& [key, value] : entries)
      dictionary.append(key, toPlainDictionary(value));
    return dictionary;
  }
};

}  // namespace

platform::Value toPlainDictionary(const Object& object) {
  return object.visit(ToPlain());
}

}  // namespace tarn::ipc
