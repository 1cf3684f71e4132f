// Feeds arbitrary text to the parsers of the configuration files Norvo reads: a metric
// configuration, which any client of the service may push, and an alerts file. The first byte
// picks the parser. A broken file is refused with its line named; nothing may crash or hang.
#include <cmath>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <string>
#include <string_view>

#include "alerts/AlertRules.h"
#include "tarn/service/Configuration.h"

namespace {

[[noreturn]] void fail(const char* what, std::string_view detail = {}) {
  std::fprintf(stderr, "%s %.*s\n", what, static_cast<int>(detail.size()), detail.data());
  std::abort();
}

void metricConfiguration(std::string_view text) {
  try {
    const auto configuration = tarn::service::Configuration::parse(text);
    if (configuration.size() == 0) fail("a configuration without a subscription was taken");
  } catch (const tarn::service::ConfigurationError& error) {
    if (std::string_view(error.what()).empty()) fail("a refusal without a reason");
  }
}

void alertsFile(std::string_view text) {
  constexpr std::string_view kFile = "alerts.toml";
  const alerts::LoadedRules loaded = alerts::parseRules(text, kFile);
  for (const std::string& error : loaded.errors) {
    if (!error.starts_with(std::string(kFile) + ':')) fail("a fault without its place:", error);
  }
  for (const alerts::AlertRule& rule : loaded.rules) {
    if (rule.name.empty()) fail("a rule without a name");
    if (rule.holdMs < 0 || rule.holdMs > 86'400'000) fail("a hold out of range:", rule.name);
    for (const auto& level : {rule.below, rule.above}) {
      if (level && !std::isfinite(*level)) fail("a level that is no number:", rule.name);
    }
    if (!rule.watchesSilence() && rule.below.has_value() == rule.above.has_value())
      fail("a rule on a series needs one level:", rule.name);
  }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  if (size == 0) return 0;
  const std::string_view text(reinterpret_cast<const char*>(data) + 1, size - 1);
  if (data[0] % 2 == 0) {
    metricConfiguration(text);
  } else {
    alertsFile(text);
  }
  return 0;
}
