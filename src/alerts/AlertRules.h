#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

// Thresholds on series values, held for a time, and the file that sets them.
namespace alerts {

// A series below or above a level for at least `holdMs`; or, without a series, no metric at all
// for `holdMs`.
struct AlertRule {
  std::string name;    // what the banner calls it: "Weak LTE signal"
  std::string series;  // "lte.rsrp"; empty for silence
  std::optional<double> below;
  std::optional<double> above;
  std::int64_t holdMs = 0;

  bool watchesSilence() const { return series.empty(); }
};

// RSRP below -110 dBm for 5 s, SINR below 0 dB for 5 s, no metric for 10 s.
std::vector<AlertRule> defaultRules();

struct LoadedRules {
  std::vector<AlertRule> rules;
  // "FILE:LINE: what is wrong", one for each fault; the rules are the defaults when any.
  std::vector<std::string> errors;
};

// The rules of an alerts file:
//
//   [[alert]]
//   name = "Weak LTE signal"
//   series = "lte.rsrp"
//   below = -110          # or above = ...
//   hold_s = 5            # optional, 0 when absent
//
//   [[alert]]
//   name = "No metrics"
//   silent_s = 10
//
// Anything else, a file that is not TOML included, is an error named by its line.
LoadedRules parseRules(std::string_view text, std::string_view fileName);

// The rules of the file at `path`. A missing file gives the defaults, and an error only when
// `required` (a file named on the command line, rather than the one in the user's folder).
LoadedRules loadRules(const std::string& path, bool required);

// Where the user's own file lives: $XDG_CONFIG_HOME/norvo/alerts.toml, or
// ~/.config/norvo/alerts.toml; empty without either variable.
std::optional<std::string> userRulesPath();

}  // namespace alerts
