#include "tarn/mm/Selection.h"

#include <algorithm>
#include <charconv>
#include <vector>

#include "tarn/mm/Names.h"

namespace tarn::mm {
namespace {

std::optional<std::uint64_t> indexOf(std::string_view path) {
  if (!path.starts_with(kModemPathPrefix)) return std::nullopt;
  const std::string_view digits = path.substr(kModemPathPrefix.size());
  std::uint64_t index = 0;
  const auto [end, error] = std::from_chars(digits.data(), digits.data() + digits.size(), index);
  if (error != std::errc() || end != digits.data() + digits.size()) return std::nullopt;
  return index;
}

bool hasIdentifier(const std::map<std::string, Dict, std::less<>>& interfaces,
                   std::string_view interface, std::string_view property,
                   std::string_view identifier) {
  const auto found = interfaces.find(interface);
  if (found == interfaces.end()) return false;
  const auto value = found->second.find(property);
  if (value == found->second.end()) return false;
  const auto* text = std::get_if<std::string>(&value->second.content);
  return value->second.signature == "s" && text != nullptr && *text == identifier;
}

}  // namespace

std::string_view modemIndex(std::string_view path) {
  return indexOf(path) ? path.substr(kModemPathPrefix.size()) : path;
}

std::optional<std::string> chooseModem(const Objects& objects, std::string_view selector) {
  std::vector<std::pair<std::uint64_t, const std::string*>> modems;
  for (const auto& [path, interfaces] : objects) {
    const std::optional<std::uint64_t> index = indexOf(path);
    if (index && interfaces.contains(kModemInterface)) modems.emplace_back(*index, &path);
  }
  std::sort(modems.begin(), modems.end());
  for (const auto& [index, path] : modems) {
    const auto& interfaces = objects.find(*path)->second;
    if (selector.empty() || selector == *path || selector == modemIndex(*path) ||
        hasIdentifier(interfaces, kModemInterface, property::kEquipmentIdentifier, selector) ||
        hasIdentifier(interfaces, kModem3gppInterface, property::kImei, selector)) {
      return *path;
    }
  }
  return std::nullopt;
}

}  // namespace tarn::mm
