#include "events/Event.h"

#include <array>
#include <utility>

namespace events {

namespace {

constexpr std::array<std::pair<Severity, std::string_view>, 3> kSeverityNames = {{
    {Severity::Info, "info"},
    {Severity::Warning, "warning"},
    {Severity::Failure, "failure"},
}};

}  // namespace

std::string_view severityName(Severity severity) {
  for (const auto& [known, name] : kSeverityNames)
    if (known == severity) return name;
  return "info";
}

std::optional<Severity> severityNamed(std::string_view name) {
  for (const auto& [severity, known] : kSeverityNames)
    if (known == name) return severity;
  return std::nullopt;
}

std::optional<std::string_view> kindNamed(std::string_view name) {
  for (const std::string_view known : kind::kAll)
    if (known == name) return known;
  return std::nullopt;
}

}  // namespace events
