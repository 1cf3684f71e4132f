#include "tarn/mm/SourceOption.h"

#include "platform/ParseNumber.h"

namespace tarn::mm {

std::optional<std::string> parseModemManagerSource(std::string_view source) {
  if (source == kSourceName) return std::string();
  if (!source.starts_with(kSourceName) || source.size() < kSourceName.size() + 2 ||
      source[kSourceName.size()] != ':')
    return std::nullopt;
  return std::string(source.substr(kSourceName.size() + 1));
}

std::optional<std::chrono::seconds> parseRefresh(std::string_view text) {
  constexpr std::uint32_t kFastest = 1, kSlowest = 5;
  const std::optional<std::uint32_t> seconds = platform::parseNumber<std::uint32_t>(text);
  if (!seconds || *seconds < kFastest || *seconds > kSlowest) return std::nullopt;
  return std::chrono::seconds(*seconds);
}

}  // namespace tarn::mm
