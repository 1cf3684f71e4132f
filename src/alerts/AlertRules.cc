#include "alerts/AlertRules.h"

#include <toml++/toml.h>

#include <algorithm>
#include <cmath>
#include <cstdlib>
#include <fstream>
#include <sstream>

#include "platform/Format.h"

namespace alerts {

namespace {

constexpr std::int64_t kMsPerSecond = 1000;
// More than a day of holding is no alert anyone waits for.
constexpr double kMaxHoldSeconds = 86400.0;

// Collects the faults of one file, each with its line.
class Faults {
 public:
  explicit Faults(std::string_view fileName) : fileName_(fileName) {}

  void add(const toml::source_region& where, std::string_view what) {
    errors.push_back(platform::format("%s:%u: %s", fileName_, where.begin.line, what));
  }

  std::vector<std::string> errors;

 private:
  std::string fileName_;
};

// TOML has nan and inf, which are no level and no time.
std::optional<double> numberOf(const toml::node& node) {
  if (const auto integer = node.value_exact<std::int64_t>()) return static_cast<double>(*integer);
  const std::optional<double> number = node.value_exact<double>();
  if (!number || !std::isfinite(*number)) return std::nullopt;
  return number;
}

// The seconds under `key` as milliseconds, when present and sensible.
std::optional<std::int64_t> readSeconds(const toml::table& table, std::string_view key,
                                        bool zeroAllowed, Faults& faults) {
  const toml::node* node = table.get(key);
  if (node == nullptr) return std::nullopt;
  const std::optional<double> seconds = numberOf(*node);
  if (!seconds || *seconds < 0.0 || (!zeroAllowed && *seconds == 0.0) ||
      *seconds > kMaxHoldSeconds) {
    faults.add(node->source(), platform::format("%s wants seconds from %s to 86400", key,
                                                zeroAllowed ? "0" : "above 0"));
    return std::nullopt;
  }
  return static_cast<std::int64_t>(*seconds * kMsPerSecond);
}

std::optional<AlertRule> readRule(const toml::table& table, Faults& faults) {
  static constexpr std::string_view kKeys[] = {"name",  "series", "below",
                                               "above", "hold_s", "silent_s"};
  const std::size_t before = faults.errors.size();
  for (const auto& [key, value] : table) {
    if (std::find(std::begin(kKeys), std::end(kKeys), key.str()) == std::end(kKeys))
      faults.add(value.source(), "unknown key \"" + std::string(key.str()) + '"');
  }
  AlertRule rule;
  if (const auto name = table["name"].value<std::string>(); name && !name->empty()) {
    rule.name = *name;
  } else {
    faults.add(table.source(), "an alert needs a name");
  }
  const toml::node* series = table.get("series");
  const toml::node* silent = table.get("silent_s");
  if (silent != nullptr) {
    if (series != nullptr || table.contains("below") || table.contains("above") ||
        table.contains("hold_s")) {
      faults.add(silent->source(), "silent_s goes alone, without series, below, above or hold_s");
    }
    if (const auto ms = readSeconds(table, "silent_s", false, faults)) rule.holdMs = *ms;
  } else {
    if (series == nullptr || !series->is_string() || series->as_string()->get().empty()) {
      faults.add(series != nullptr ? series->source() : table.source(),
                 "an alert needs a series name, or silent_s");
    } else {
      rule.series = series->as_string()->get();
    }
    for (const auto& [key, level] : {std::pair{"below", &rule.below}, {"above", &rule.above}}) {
      if (const toml::node* node = table.get(key)) {
        *level = numberOf(*node);
        if (!*level) faults.add(node->source(), std::string(key) + " wants a number");
      }
    }
    if (rule.below.has_value() == rule.above.has_value() && faults.errors.size() == before)
      faults.add(table.source(), "an alert needs one of below and above");
    if (const auto ms = readSeconds(table, "hold_s", true, faults)) rule.holdMs = *ms;
  }
  if (faults.errors.size() != before) return std::nullopt;
  return rule;
}

}  // namespace

std::vector<AlertRule> defaultRules() {
  return {
      {"Weak LTE signal", "lte.rsrp", -110.0, std::nullopt, 5 * kMsPerSecond},
      {"Poor LTE SINR", "lte.sinr", 0.0, std::nullopt, 5 * kMsPerSecond},
      {"No metrics", "", std::nullopt, std::nullopt, 10 * kMsPerSecond},
  };
}

LoadedRules parseRules(std::string_view text, std::string_view fileName) {
  Faults faults(fileName);
  std::vector<AlertRule> rules;
  try {
    const toml::table document = toml::parse(text, fileName);
    for (const auto& [key, value] : document) {
      const toml::array* alerts = key.str() == "alert" ? value.as_array() : nullptr;
      if (alerts == nullptr || !alerts->is_array_of_tables()) {
        faults.add(value.source(),
                   "only [[alert]] tables belong here, not \"" + std::string(key.str()) + '"');
        continue;
      }
      for (const toml::node& alert : *alerts) {
        if (auto rule = readRule(*alert.as_table(), faults)) rules.push_back(std::move(*rule));
      }
    }
  } catch (const toml::parse_error& error) {
    faults.add(error.source(), std::string(error.description()));
  }
  if (!faults.errors.empty()) return {defaultRules(), std::move(faults.errors)};
  return {std::move(rules), {}};
}

LoadedRules loadRules(const std::string& path, bool required) {
  std::ifstream file(path, std::ios::binary);
  if (!file) {
    if (!required) return {defaultRules(), {}};
    return {defaultRules(), {path + ": cannot read the file"}};
  }
  std::ostringstream text;
  text << file.rdbuf();
  return parseRules(text.str(), path);
}

std::optional<std::string> userRulesPath() {
  if (const char* config = std::getenv("XDG_CONFIG_HOME"); config != nullptr && *config != '\0')
    return std::string(config) + "/norvo/alerts.toml";
  if (const char* home = std::getenv("HOME"); home != nullptr && *home != '\0')
    return std::string(home) + "/.config/norvo/alerts.toml";
  return std::nullopt;
}

}  // namespace alerts
