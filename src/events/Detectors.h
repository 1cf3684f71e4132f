#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "events/Event.h"
#include "platform/Value.h"

// Event detectors are data: which metric they read, which fields they watch, and what a change
// of those fields means. One loop (EventDetector.h) runs them all.
namespace events {

// What the detectors remember between metrics, one value per subject. Detectors of several
// metrics may share a subject: the serving cell of every technology is one.
enum class Subject : std::size_t {
  LteRrc,
  UmtsRrc,
  GsmRr,
  ServingCell,
  TrackingArea,
  LocationArea,
  Emm,
  Mm,
  Gmm,
  Bearers,
  Carriers,
  Sim,
};
inline constexpr std::size_t kSubjectCount = static_cast<std::size_t>(Subject::Sim) + 1;

// A watched field and what the event text calls it ("PCI"); no label leaves it out of the text.
// Of a list of dictionaries, only the entries under `elementKeys` are watched, when it names
// any: a carrier's state matters, its level of the moment does not.
struct Field {
  std::string_view key;
  std::string_view label;
  std::span<const std::string_view> elementKeys = {};
};

// A state change and what it means: the first rule whose states and cause match wins. Empty
// members match anything; causePrefix matches the start of the cause's enum name.
struct StateRule {
  std::string_view from;
  std::string_view to;
  std::string_view causeKey;  // the field that holds the cause; empty when none is shown
  std::string_view causePrefix;
  std::string_view kind;
  Severity severity;
  std::string_view meaning;  // follows the states in the text; may be empty
};

// When a detector describes what it watches.
enum class When {
  Changed,         // when the watched value differs from the last one of its subject
  FirstOrChanged,  // and also for the first value
  Every,           // for every metric
};

// One event a detector found, before it has a time, an id and its metric.
struct Draft {
  std::string_view kind;
  Severity severity;
  std::string text;
};

struct Detector;

// The last watched value of each subject.
using Memory = std::array<std::optional<platform::List>, kSubjectCount>;

// What a detector sees: its last and its new watched value (its label, then its fields' values,
// Null for a missing one, lists cut to their element keys), the decoded metric, and what every
// subject holds.
struct Change {
  const Detector& detector;
  const platform::List* before;  // null the first time
  const platform::List& after;
  const platform::Dictionary& decoded;
  const Memory& memory;
};

using Describe = void (*)(const Change& change, std::vector<Draft>& drafts);

struct Detector {
  std::int64_t metricID;
  Subject subject;
  std::string_view label;  // the technology or subject, first in the watched value and the text
  std::span<const Field> fields;
  When when;
  Describe describe;
  std::span<const StateRule> rules = {};  // for state changes
};

// Every detector, in the order they run for one metric.
std::span<const Detector> detectors();

}  // namespace events
