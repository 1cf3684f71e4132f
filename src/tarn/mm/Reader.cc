#include "tarn/mm/Reader.h"

#include <charconv>
#include <cmath>

#include "platform/Format.h"

namespace tarn::mm {

const Value* Reader::typed(std::string_view key, std::string_view signature) const {
  const auto found = dict_.find(key);
  if (found == dict_.end()) return nullptr;
  if (found->second.signature != signature) {
    drop(key,
         platform::format("wanted %s, got %s", signature,
                          found->second.signature.empty() ? "nothing" : found->second.signature));
    return nullptr;
  }
  return &found->second;
}

void Reader::drop(std::string_view key, std::string_view why) const {
  problems_.push_back(platform::format("%s \"%s\": %s; dropped", where_, key, why));
}

std::optional<double> Reader::real(std::string_view key, double low, double high) const {
  const Value* value = typed(key, "d");
  if (value == nullptr) return std::nullopt;
  const double* number = std::get_if<double>(&value->content);
  if (number == nullptr) return std::nullopt;
  if (!std::isfinite(*number)) {
    drop(key, "not a number");
    return std::nullopt;
  }
  if (*number < low || *number > high) {
    drop(key, platform::format("%g is outside %g to %g", *number, low, high));
    return std::nullopt;
  }
  return *number;
}

std::optional<std::uint32_t> Reader::unsignedInt(std::string_view key, std::uint32_t high) const {
  const Value* value = typed(key, "u");
  if (value == nullptr) return std::nullopt;
  const std::uint64_t* number = std::get_if<std::uint64_t>(&value->content);
  if (number == nullptr) return std::nullopt;
  if (*number > high) {
    drop(key, platform::format("%u is above %u", *number, high));
    return std::nullopt;
  }
  return static_cast<std::uint32_t>(*number);
}

std::optional<std::int32_t> Reader::signedInt(std::string_view key) const {
  const Value* value = typed(key, "i");
  if (value == nullptr) return std::nullopt;
  const std::int64_t* number = std::get_if<std::int64_t>(&value->content);
  if (number == nullptr || *number < INT32_MIN || *number > INT32_MAX) return std::nullopt;
  return static_cast<std::int32_t>(*number);
}

std::optional<bool> Reader::boolean(std::string_view key) const {
  const Value* value = typed(key, "b");
  if (value == nullptr) return std::nullopt;
  const bool* flag = std::get_if<bool>(&value->content);
  return flag != nullptr ? std::optional<bool>(*flag) : std::nullopt;
}

std::optional<std::string> Reader::text(std::string_view key) const {
  const Value* value = typed(key, "s");
  if (value == nullptr) return std::nullopt;
  const std::string* text = std::get_if<std::string>(&value->content);
  if (text == nullptr || text->empty()) return std::nullopt;
  return *text;
}

std::optional<std::uint32_t> Reader::hex(std::string_view key, std::uint32_t high) const {
  const std::optional<std::string> digits = text(key);
  if (!digits) return std::nullopt;
  std::uint64_t number = 0;
  const char* end = digits->data() + digits->size();
  const auto [stop, error] = std::from_chars(digits->data(), end, number, 16);
  if (error != std::errc() || stop != end || digits->size() > 8) {
    drop(key, "\"" + *digits + "\" is not hexadecimal");
    return std::nullopt;
  }
  if (number > high) {
    drop(key, platform::format("%s is above %X", *digits, high));
    return std::nullopt;
  }
  return static_cast<std::uint32_t>(number);
}

std::optional<std::string> Reader::path(std::string_view key) const {
  const Value* value = typed(key, "o");
  if (value == nullptr) return std::nullopt;
  const std::string* text = std::get_if<std::string>(&value->content);
  return text != nullptr ? std::optional<std::string>(*text) : std::nullopt;
}

std::optional<std::vector<std::string>> Reader::paths(std::string_view key) const {
  const Value* value = typed(key, "ao");
  if (value == nullptr) return std::nullopt;
  const auto* list = std::get_if<std::vector<std::string>>(&value->content);
  return list != nullptr ? std::optional<std::vector<std::string>>(*list) : std::nullopt;
}

const Dict* Reader::dictionary(std::string_view key) const {
  const Value* value = typed(key, "a{sv}");
  if (value == nullptr) return nullptr;
  const auto* dict = std::get_if<std::shared_ptr<const Dict>>(&value->content);
  return dict != nullptr ? dict->get() : nullptr;
}

}  // namespace tarn::mm
