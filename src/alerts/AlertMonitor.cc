#include "alerts/AlertMonitor.h"

#include "platform/Format.h"

namespace alerts {

namespace {

std::string levelText(double value) {
  return platform::format("%.1f", value);
}

std::string seconds(std::int64_t ms) {
  return platform::format("%g s", static_cast<double>(ms) / 1000.0);
}

// "lte.rsrp below -110 for 5 s"
std::string conditionText(const AlertRule& rule) {
  std::string text = rule.series;
  text += rule.below ? " below " + levelText(*rule.below) : " above " + levelText(*rule.above);
  if (rule.holdMs > 0) text += " for " + seconds(rule.holdMs);
  return text;
}

}  // namespace

AlertMonitor::AlertMonitor(std::vector<AlertRule> rules, SeriesReader read, events::EventRing& ring)
    : rules_(std::move(rules)), read_(std::move(read)), ring_(ring), watches_(rules_.size()) {}

void AlertMonitor::start(std::size_t rule, std::int64_t atMs, std::string text) {
  Watch& watch = watches_[rule];
  watch.activeSinceMs = atMs;
  watch.text = text;
  events::Event event;
  event.timeMs = atMs;
  event.kind = events::kind::kAlert;
  event.severity = events::Severity::Warning;
  event.text = std::move(text);
  ring_.add(std::move(event));
}

void AlertMonitor::clear(std::size_t rule, std::int64_t atMs, std::string text) {
  watches_[rule].activeSinceMs.reset();
  watches_[rule].text.clear();
  events::Event event;
  event.timeMs = atMs;
  event.kind = events::kind::kAlert;
  event.severity = events::Severity::Info;
  event.text = std::move(text);
  ring_.add(std::move(event));
}

void AlertMonitor::watchSeries(std::size_t index, std::int64_t nowMs) {
  const AlertRule& rule = rules_[index];
  Watch& watch = watches_[index];
  std::optional<Reading> reading = read_ ? read_(rule.series) : std::nullopt;
  if (reading && nowMs - reading->timeMs > kStaleMs) reading.reset();
  const bool holds =
      reading && (rule.below ? reading->value < *rule.below : reading->value > *rule.above);
  if (!holds) {
    watch.heldSinceMs.reset();
    if (watch.activeSinceMs) {
      clear(index, reading ? reading->timeMs : nowMs,
            rule.name + " cleared: " + rule.series +
                (reading ? ' ' + levelText(reading->value) : std::string(" has no level")));
    }
    return;
  }
  if (!watch.heldSinceMs) watch.heldSinceMs = reading->timeMs;
  if (!watch.activeSinceMs && reading->timeMs - *watch.heldSinceMs >= rule.holdMs) {
    start(index, reading->timeMs,
          rule.name + ": " + conditionText(rule) + " (" + levelText(reading->value) + ')');
  }
}

void AlertMonitor::metricArrived(std::int64_t timeMs) {
  for (std::size_t i = 0; i < rules_.size(); ++i) {
    if (!rules_[i].watchesSilence()) {
      watchSeries(i, timeMs);
      continue;
    }
    // A gap as long as the hold was a silence, whether or not a clock saw it meanwhile.
    if (lastMetricMs_ && timeMs - *lastMetricMs_ >= rules_[i].holdMs) {
      if (!watches_[i].activeSinceMs) {
        start(i, *lastMetricMs_ + rules_[i].holdMs,
              rules_[i].name + ": none for " + seconds(rules_[i].holdMs));
      }
      clear(i, timeMs, rules_[i].name + " cleared: metrics again");
    }
  }
  lastMetricMs_ = timeMs;
}

void AlertMonitor::tick(std::int64_t nowMs) {
  if (!lastMetricMs_) return;
  for (std::size_t i = 0; i < rules_.size(); ++i) {
    if (rules_[i].watchesSilence() && !watches_[i].activeSinceMs &&
        nowMs - *lastMetricMs_ >= rules_[i].holdMs) {
      start(i, *lastMetricMs_ + rules_[i].holdMs,
            rules_[i].name + ": none for " + seconds(rules_[i].holdMs));
    }
  }
}

void AlertMonitor::reset() {
  watches_.assign(rules_.size(), Watch{});
  lastMetricMs_.reset();
}

platform::List AlertMonitor::active() const {
  platform::List found;
  for (std::size_t i = 0; i < rules_.size(); ++i) {
    if (!watches_[i].activeSinceMs) continue;
    found.emplace_back(platform::Dictionary{{"name", rules_[i].name},
                                            {"text", watches_[i].text},
                                            {"since_ms", *watches_[i].activeSinceMs}});
  }
  return found;
}

}  // namespace alerts
