#include "tarn/service/Configuration.h"

#include <charconv>
#include <string>
#include <vector>

#include "platform/Format.h"

namespace tarn::service {

namespace {

constexpr std::string_view kByteOrderMark = "\xEF\xBB\xBF";
constexpr std::string_view kProfileDirective = "profile";
constexpr std::int64_t kLargestProfileId = 2147483647;

std::vector<std::string_view> wordsOf(std::string_view line) {
  constexpr std::string_view kBlanks = " \t\r\v\f";
  std::vector<std::string_view> words;
  std::size_t start = line.find_first_not_of(kBlanks);
  while (start != std::string_view::npos) {
    const std::size_t end = std::min(line.find_first_of(kBlanks, start), line.size());
    words.push_back(line.substr(start, end - start));
    start = line.find_first_not_of(kBlanks, end);
  }
  return words;
}

// A word of the input as a message shows it: unprintable bytes as '?', long words shortened.
std::string shown(std::string_view word) {
  constexpr std::size_t kLongest = 32;
  std::string text;
  for (const char c : word.substr(0, kLongest))
    text += c >= ' ' && c <= '~' ? c : '?';
  if (word.size() > kLongest) text += "...";
  return text;
}

[[noreturn]] void fail(std::size_t line, const std::string& what) {
  throw ConfigurationError(platform::format("line %zu: %s", line, what));
}

template <class Integer>
std::optional<Integer> parseWhole(std::string_view digits, int base) {
  Integer value{};
  const auto [end, error] =
      std::from_chars(digits.data(), digits.data() + digits.size(), value, base);
  if (digits.empty() || error != std::errc() || end != digits.data() + digits.size()) return {};
  return value;
}

std::uint32_t parseMetricId(std::string_view word, std::size_t line) {
  const bool prefixed = word.starts_with("0x") || word.starts_with("0X");
  const bool hexDigits = prefixed && word.size() > 2 &&
                         word.find_first_not_of("0123456789abcdefABCDEF", 2) == word.npos;
  if (!hexDigits) {
    fail(line, platform::format("'%s' is not a metric ID; write metric IDs in hex, like 0x3C4E04",
                                shown(word)));
  }
  const std::optional<std::uint64_t> value = parseWhole<std::uint64_t>(word.substr(2), 16);
  if (!value || *value == 0 || *value > 0xFFFFFFFF) {
    fail(line, platform::format("metric ID %s is out of range (0x1 to 0xFFFFFFFF)", shown(word)));
  }
  return static_cast<std::uint32_t>(*value);
}

std::int64_t parseProfileId(const std::vector<std::string_view>& words, std::size_t line) {
  const std::optional<std::int64_t> value =
      words.size() == 2 ? parseWhole<std::int64_t>(words[1], 10) : std::nullopt;
  if (!value || *value < 0 || *value > kLargestProfileId) {
    fail(line, platform::format("'profile' takes one number from 0 to %lld", kLargestProfileId));
  }
  return *value;
}

}  // namespace

Configuration Configuration::parse(std::string_view text) {
  if (text.empty()) throw ConfigurationError("the configuration is empty");
  if (text.size() > kLargestText) {
    throw ConfigurationError(platform::format(
        "the configuration is %zu bytes long; it may be at most %zu", text.size(), kLargestText));
  }
  if (text.starts_with(kByteOrderMark)) text.remove_prefix(kByteOrderMark.size());

  Configuration configuration;
  std::unordered_map<std::uint32_t, std::size_t> lineOfMetric;
  std::int64_t profileId = 0;
  std::size_t line = 0;
  while (!text.empty()) {
    ++line;
    const std::size_t end = std::min(text.find('\n'), text.size());
    const std::string_view whole = text.substr(0, end);
    const std::string_view content = whole.substr(0, whole.find('#'));
    text.remove_prefix(std::min(end + 1, text.size()));

    const std::vector<std::string_view> words = wordsOf(content);
    if (words.empty()) continue;
    if (words[0] == kProfileDirective) {
      profileId = parseProfileId(words, line);
      continue;
    }
    const std::uint32_t metricId = parseMetricId(words[0], line);
    if (words.size() > 1) {
      fail(line, platform::format("unexpected '%s' after the metric ID; write one metric per line",
                                  shown(words[1])));
    }
    const auto [first, isNew] = lineOfMetric.try_emplace(metricId, line);
    if (!isNew) {
      fail(line, platform::format("metric ID 0x%X is already subscribed on line %zu", metricId,
                                  first->second));
    }
    configuration.profiles_.emplace(metricId, profileId);
  }
  if (configuration.profiles_.empty()) {
    throw ConfigurationError("the configuration subscribes to no metric");
  }
  return configuration;
}

std::optional<std::int64_t> Configuration::profileOf(std::uint32_t metricId) const {
  const auto found = profiles_.find(metricId);
  if (found == profiles_.end()) return {};
  return found->second;
}

}  // namespace tarn::service
