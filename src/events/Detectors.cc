#include "events/Detectors.h"

#include <algorithm>
#include <map>
#include <utility>

#include "store/MetricValidator.h"

namespace events {

namespace {

using platform::Dictionary;
using platform::List;
using platform::Value;
using store::MetricValidator;

// Stands for the state before the first one a detector sees, in StateRule::from.
constexpr std::string_view kNoState = "(none)";

const std::string* textAt(const List& value, std::size_t index) {
  return index < value.size() ? value[index].asString() : nullptr;
}

std::string_view textOf(const Dictionary& dictionary, std::string_view key) {
  const Value* value = dictionary.find(key);
  const std::string* text = value != nullptr ? value->asString() : nullptr;
  return text != nullptr ? std::string_view(*text) : std::string_view();
}

// "KLTE_RRC_STATE_CONNECTED" reads as CONNECTED; names without a state prefix stay whole.
std::string_view shortState(std::string_view name) {
  constexpr std::string_view kMarker = "_STATE_";
  const std::size_t at = name.find(kMarker);
  return at == std::string_view::npos ? name : name.substr(at + kMarker.size());
}

// The labelled fields of a watched value: "PCI 101 EARFCN 1300".
std::string fieldsText(const Detector& detector, const List& value) {
  std::string text;
  for (std::size_t i = 0; i < detector.fields.size(); ++i) {
    if (detector.fields[i].label.empty()) continue;
    if (!text.empty()) text += ' ';
    text += detector.fields[i].label;
    text += ' ';
    text += i + 1 < value.size() ? value[i + 1].description() : std::string("?");
  }
  return text;
}

// --- State changes: RRC of LTE and UMTS, RR of GSM ---

constexpr StateRule kLteRrcRules[] = {
    {"", "KLTE_RRC_STATE_ATMPT_CONNECTION", "cause", "KLTE_RRC_CAUSE_REEST", kind::kRadioLink,
     Severity::Failure, "radio link failure, re-establishing"},
    {"", "KLTE_RRC_STATE_CONNECTED", "cause", "KLTE_RRC_CAUSE_REEST", kind::kRadioLink,
     Severity::Warning, "re-established"},
    {"", "", "cause", "KLTE_RRC_CAUSE_REL_CONN_FAIL", kind::kRadioLink, Severity::Failure,
     "connection lost"},
    {"", "", "cause", "KLTE_RRC_CAUSE_REL_T310_EXP", kind::kRadioLink, Severity::Failure,
     "connection lost"},
    {"", "", "cause", "KLTE_RRC_CAUSE_REL_RND_ACC", kind::kRadioLink, Severity::Failure,
     "connection lost"},
    {"", "", "cause", "KLTE_RRC_CAUSE_REL_MAX_RLC_RETRANS", kind::kRadioLink, Severity::Failure,
     "connection lost"},
    {"", "", "cause", "KLTE_RRC_CAUSE_EST_FAIL", kind::kRrc, Severity::Failure,
     "connection set-up failed"},
    {"", "", "cause", "KLTE_RRC_CAUSE_NO_SERVICE", kind::kRrc, Severity::Warning, "no service"},
    {"", "", "cause", "", kind::kRrc, Severity::Info, ""},
};

// A UMTS record carries both causes whatever its state; each is shown where it applies.
constexpr StateRule kUmtsRrcRules[] = {
    {kNoState, "", "", "", kind::kRrc, Severity::Info, ""},
    {"", "KWCDMA_RRC_CONN_STATE_RADIO_LINK_FAILURE", "", "", kind::kRadioLink, Severity::Failure,
     "radio link failure"},
    {"", "KWCDMA_RRC_CONN_STATE_IDLE", "release_cause", "KRRC_REL_CONN_REL_LOWER_LAYER_FAILURE",
     kind::kRadioLink, Severity::Failure, "connection lost"},
    {"", "KWCDMA_RRC_CONN_STATE_IDLE", "release_cause", "KRRC_REL_RELEASE_OOSA", kind::kRadioLink,
     Severity::Failure, "out of service area"},
    {"", "KWCDMA_RRC_CONN_STATE_IDLE", "release_cause", "KRRC_REL_CONN_REJECT", kind::kRrc,
     Severity::Failure, "connection rejected"},
    {"", "KWCDMA_RRC_CONN_STATE_IDLE", "release_cause", "KRRC_REL_RRC_CONN_ESTABLISHMENT_FAILURE",
     kind::kRrc, Severity::Failure, "connection set-up failed"},
    {"", "KWCDMA_RRC_CONN_STATE_IDLE", "release_cause", "", kind::kRrc, Severity::Info, ""},
    {"", "KWCDMA_RRC_CONN_STATE_ESTABLISH", "establishment_cause", "", kind::kRrc, Severity::Info,
     ""},
    {"", "", "", "", kind::kRrc, Severity::Info, ""},
};

constexpr StateRule kGsmRrRules[] = {
    {"", "", "", "", kind::kRrc, Severity::Info, ""},
};

bool ruleMatches(const StateRule& rule, std::string_view from, std::string_view to,
                 std::string_view cause) {
  return (rule.from.empty() || rule.from == from) && (rule.to.empty() || rule.to == to) &&
         cause.starts_with(rule.causePrefix);
}

void describeStateChange(const Change& change, std::vector<Draft>& drafts) {
  const std::string* to = textAt(change.after, 1);
  if (to == nullptr) return;
  const std::string* before = change.before ? textAt(*change.before, 1) : nullptr;
  const std::string_view from = before != nullptr ? std::string_view(*before) : kNoState;
  for (const StateRule& rule : change.detector.rules) {
    const std::string_view cause =
        rule.causeKey.empty() ? std::string_view() : textOf(change.decoded, rule.causeKey);
    if (!ruleMatches(rule, from, *to, cause)) continue;
    std::string text(change.detector.label);
    text += ' ';
    if (before != nullptr) {
      text += shortState(*before);
      text += " → ";
    }
    text += shortState(*to);
    if (!rule.meaning.empty()) {
      text += ": ";
      text += rule.meaning;
    }
    if (!cause.empty()) {
      text += " (";
      text += cause;
      text += ')';
    }
    drafts.push_back({rule.kind, rule.severity, std::move(text)});
    return;
  }
}

// --- The serving cell: handovers, reselections and changes of technology ---

struct Technology {
  std::string_view label;  // as the serving-cell detectors name it
  Subject rrc;
};
constexpr Technology kTechnologies[] = {
    {"LTE", Subject::LteRrc},
    {"UMTS", Subject::UmtsRrc},
    {"GSM", Subject::GsmRr},
};

// States in which a cell change is the network's handover rather than the phone's reselection.
constexpr std::string_view kConnectedStates[] = {
    "KLTE_RRC_STATE_CONNECTED",
    "KLTE_RRC_STATE_ATMPT_OUTBND_MOBILITY",
    "KLTE_RRC_STATE_ATMPT_INBND_MOBILITY",
    "KWCDMA_RRC_CONN_STATE_CELL_DCH",
    "KWCDMA_RRC_CONN_STATE_CELL_FACH",
    "DEDICATED_STATE",
};

bool connected(const Memory& memory, std::string_view technology) {
  for (const Technology& known : kTechnologies) {
    if (known.label != technology) continue;
    const auto& state = memory[static_cast<std::size_t>(known.rrc)];
    const std::string* name = state ? textAt(*state, 1) : nullptr;
    return name != nullptr && std::find(std::begin(kConnectedStates), std::end(kConnectedStates),
                                        *name) != std::end(kConnectedStates);
  }
  return false;
}

void describeServingCell(const Change& change, std::vector<Draft>& drafts) {
  const std::string_view technology = change.detector.label;
  const std::string cell = fieldsText(change.detector, change.after);
  const std::string* previous = change.before ? textAt(*change.before, 0) : nullptr;
  if (previous == nullptr) {
    drafts.push_back(
        {kind::kTechnology, Severity::Info, std::string(technology) + ": camped on " + cell});
  } else if (*previous != technology) {
    drafts.push_back({kind::kTechnology, Severity::Info,
                      *previous + " → " + std::string(technology) + ": " + cell});
  } else {
    // Same technology, so the watched fields line up.
    const bool handover = connected(change.memory, technology);
    drafts.push_back({handover ? kind::kHandover : kind::kReselection, Severity::Info,
                      std::string(technology) + (handover ? " handover " : " reselection ") +
                          fieldsText(change.detector, *change.before) + " → " + cell});
  }
}

void describeArea(const Change& change, std::vector<Draft>& drafts) {
  if (change.before == nullptr) return;
  drafts.push_back({kind::kArea, Severity::Info,
                    std::string(change.detector.label) + ' ' +
                        fieldsText(change.detector, *change.before) + " → " +
                        fieldsText(change.detector, change.after)});
}

// --- NAS: registrations and rejects of EMM, MM and GMM ---

constexpr std::string_view kNoRejectCauses[] = {"EMM_CAUSE_NO_CAUSE", "KNAS_MM_REJ_CAUSE_NONE"};
constexpr std::string_view kNoProcedureFailure = "KNAS_MM_PROC_FAILURE_CAUSE_NONE";
// Registration states in which the phone has the service it registered for.
constexpr std::string_view kServedStates[] = {
    "KREG_STATUS_NORMAL_SERVICE",
    "KREG_STATUS_SERVICE_ACTIVATED",
    "KREG_STATUS_REGISTERED_SMS_ONLY",
    "KREG_STATUS_REGISTRATION_IN_PROGRESS",
};

void describeRegistration(const Change& change, std::vector<Draft>& drafts) {
  const Dictionary& decoded = change.decoded;
  const std::string_view reject = textOf(decoded, "reject_cause");
  const std::string_view failure = textOf(decoded, "proc_failure_cause");
  const std::string_view procedure = textOf(decoded, "reg_proc");
  const std::string_view status = textOf(decoded, "reg_status");
  std::string text(change.detector.label);
  if (!reject.empty() && std::find(std::begin(kNoRejectCauses), std::end(kNoRejectCauses),
                                   reject) == std::end(kNoRejectCauses)) {
    text += " reject ";
    text += reject;
    if (!procedure.empty()) text += " (" + std::string(procedure) + ')';
    drafts.push_back({kind::kReject, Severity::Failure, std::move(text)});
    return;
  }
  if (!failure.empty() && failure != kNoProcedureFailure) {
    text += " procedure failed: ";
    text += failure;
    drafts.push_back({kind::kRegistration, Severity::Failure, std::move(text)});
    return;
  }
  if (!procedure.empty()) text += ' ' + std::string(procedure);
  text += ": ";
  text += status;
  const bool served = std::find(std::begin(kServedStates), std::end(kServedStates), status) !=
                      std::end(kServedStates);
  drafts.push_back(
      {kind::kRegistration, served ? Severity::Info : Severity::Warning, std::move(text)});
}

// --- Lists: bearers and secondary carriers ---

const List* listAt(const List* value, std::size_t index) {
  return value != nullptr && index < value->size() ? (*value)[index].asList() : nullptr;
}

// The dictionaries of a watched list, by a key each one makes for itself.
template <class Key>
std::map<Key, const Dictionary*> byKey(const List* list, Key (*keyOf)(const Dictionary&)) {
  std::map<Key, const Dictionary*> found;
  if (list == nullptr) return found;
  for (const Value& element : *list) {
    if (const Dictionary* dictionary = element.asDictionary())
      found.emplace(keyOf(*dictionary), dictionary);
  }
  return found;
}

std::string numberText(const Dictionary& dictionary, std::string_view key) {
  const Value* value = dictionary.find(key);
  return value != nullptr ? value->description() : std::string("?");
}

using BearerKey = std::pair<std::string, std::string>;  // cid, APN

BearerKey bearerKey(const Dictionary& bearer) {
  return {numberText(bearer, "cid"), std::string(textOf(bearer, "apn"))};
}

std::string bearerText(std::string_view what, const Dictionary& bearer) {
  const std::string_view apn = textOf(bearer, "apn");
  std::string text = "Bearer " + std::string(what) + ": APN ";
  text += apn.empty() ? "(none)" : apn;
  text += " (cid " + numberText(bearer, "cid");
  if (const std::string_view type = textOf(bearer, "pdp_type"); !type.empty()) {
    text += ", ";
    text += type;
  }
  return text + ')';
}

void describeBearers(const Change& change, std::vector<Draft>& drafts) {
  const auto before = byKey(listAt(change.before, 1), &bearerKey);
  const auto after = byKey(listAt(&change.after, 1), &bearerKey);
  for (const auto& [key, bearer] : before) {
    if (!after.contains(key))
      drafts.push_back({kind::kBearer, Severity::Info, bearerText("torn down", *bearer)});
  }
  for (const auto& [key, bearer] : after) {
    if (!before.contains(key))
      drafts.push_back({kind::kBearer, Severity::Info, bearerText("set up", *bearer)});
  }
}

// How a secondary carrier's state changes read; an empty state is a carrier not in the list.
struct CarrierTransition {
  std::string_view from;
  std::string_view to;
  std::string_view meaning;
};
constexpr CarrierTransition kCarrierTransitions[] = {
    {"", "SCC_STATE_CONFIGURED_DEACTIVATED", "added"},
    {"", "SCC_STATE_ACTIVATED", "added and activated"},
    {"SCC_STATE_DECONFIGURED", "SCC_STATE_CONFIGURED_DEACTIVATED", "added"},
    {"SCC_STATE_DECONFIGURED", "SCC_STATE_ACTIVATED", "added and activated"},
    {"SCC_STATE_CONFIGURED_DEACTIVATED", "SCC_STATE_ACTIVATED", "activated"},
    {"SCC_STATE_ACTIVATED", "SCC_STATE_CONFIGURED_DEACTIVATED", "deactivated"},
    {"SCC_STATE_CONFIGURED_DEACTIVATED", "SCC_STATE_DECONFIGURED", "removed"},
    {"SCC_STATE_ACTIVATED", "SCC_STATE_DECONFIGURED", "removed"},
    {"SCC_STATE_CONFIGURED_DEACTIVATED", "", "removed"},
    {"SCC_STATE_ACTIVATED", "", "removed"},
};

std::string carrierIndex(const Dictionary& carrier) {
  return numberText(carrier, "index");
}

bool sameCarrier(const Dictionary& one, const Dictionary& other) {
  const auto same = [&](std::string_view key) {
    const Value* a = one.find(key);
    const Value* b = other.find(key);
    return a == nullptr ? b == nullptr : b != nullptr && *a == *b;
  };
  return same("pci") && same("dl_earfcn");
}

void describeCarrier(std::string_view from, const Dictionary* before, std::string_view to,
                     const Dictionary* after, std::vector<Draft>& drafts) {
  for (const CarrierTransition& transition : kCarrierTransitions) {
    if (transition.from != from || transition.to != to) continue;
    const Dictionary& carrier = after != nullptr ? *after : *before;
    drafts.push_back({kind::kCarrier, Severity::Info,
                      "SCC " + carrierIndex(carrier) + ' ' + std::string(transition.meaning) +
                          ": PCI " + numberText(carrier, "pci") + " EARFCN " +
                          numberText(carrier, "dl_earfcn")});
    return;
  }
}

void describeCarriers(const Change& change, std::vector<Draft>& drafts) {
  const auto before = byKey(listAt(change.before, 1), &carrierIndex);
  const auto after = byKey(listAt(&change.after, 1), &carrierIndex);
  for (const auto& [index, carrier] : before) {
    const auto now = after.find(index);
    if (now == after.end() || !sameCarrier(*carrier, *now->second))
      describeCarrier(textOf(*carrier, "state"), carrier, "", nullptr, drafts);
  }
  for (const auto& [index, carrier] : after) {
    const auto then = before.find(index);
    const bool same = then != before.end() && sameCarrier(*then->second, *carrier);
    describeCarrier(same ? textOf(*then->second, "state") : "", same ? then->second : nullptr,
                    textOf(*carrier, "state"), carrier, drafts);
  }
}

void describeSimRead(const Change& change, std::vector<Draft>& drafts) {
  const Value* files = change.decoded.find("ef_list");
  const std::size_t count = files != nullptr && files->isList() ? files->asList()->size() : 0;
  drafts.push_back({kind::kSim, Severity::Info,
                    "SIM read: " + std::to_string(count) + (count == 1 ? " file" : " files")});
}

// --- The table ---

constexpr Field kLteRrcFields[] = {{"state", ""}, {"cause", ""}};
constexpr Field kStateField[] = {{"state", ""}};
constexpr Field kLteCellFields[] = {{"phy_cell_id", "PCI"}, {"dl_freq", "EARFCN"}};
constexpr Field kUmtsCellFields[] = {{"psc", "PSC"}, {"dl_uarfcn", "UARFCN"}};
constexpr Field kGsmCellFields[] = {{"bsic", "BSIC"}, {"arfcn", "ARFCN"}};
constexpr Field kTrackingAreaFields[] = {{"tracking_area_code", "TAC"}};
constexpr Field kLocationAreaFields[] = {{"lac", "LAC"}};
constexpr Field kEmmFields[] = {{"reg_status", ""},
                                {"reg_proc", ""},
                                {"reject_cause", ""},
                                {"update_status", ""},
                                {"tai_list", ""}};
constexpr Field kMmFields[] = {{"reg_status", ""},
                               {"update_status", ""},
                               {"lai", ""},
                               {"proc_failure_cause", ""},
                               {"reject_cause", ""}};
constexpr Field kGmmFields[] = {{"reg_status", ""},   {"update_status", ""},
                                {"rai", ""},          {"proc_failure_cause", ""},
                                {"reject_cause", ""}, {"reg_proc", ""}};
constexpr std::string_view kBearerKeys[] = {"cid", "apn", "pdp_type"};
constexpr Field kBearerFields[] = {{"bearer_contexts", "", kBearerKeys}};
constexpr std::string_view kCarrierKeys[] = {"index", "state", "pci", "dl_earfcn"};
constexpr Field kCarrierFields[] = {{"scc_list", "", kCarrierKeys}};

// The RRC detectors run before the serving cell's, so that a cell change is judged by the state
// that came with it.
constexpr Detector kDetectors[] = {
    {MetricValidator::K_LTE_RRC_STATE, Subject::LteRrc, "LTE RRC", kLteRrcFields,
     When::FirstOrChanged, &describeStateChange, kLteRrcRules},
    {MetricValidator::K_UMTS_RRC_STATE, Subject::UmtsRrc, "UMTS RRC", kStateField,
     When::FirstOrChanged, &describeStateChange, kUmtsRrcRules},
    {MetricValidator::K_GSM_SCELL_INFO, Subject::GsmRr, "GSM RR", kStateField, When::Changed,
     &describeStateChange, kGsmRrRules},
    {MetricValidator::K_LTE_SCELL_INFO, Subject::ServingCell, "LTE", kLteCellFields,
     When::FirstOrChanged, &describeServingCell},
    {MetricValidator::K_UMTS_SCELL_INFO, Subject::ServingCell, "UMTS", kUmtsCellFields,
     When::FirstOrChanged, &describeServingCell},
    {MetricValidator::K_GSM_SCELL_INFO, Subject::ServingCell, "GSM", kGsmCellFields,
     When::FirstOrChanged, &describeServingCell},
    {MetricValidator::K_LTE_SCELL_INFO, Subject::TrackingArea, "Tracking area", kTrackingAreaFields,
     When::Changed, &describeArea},
    {MetricValidator::K_UMTS_SCELL_INFO, Subject::LocationArea, "Location area",
     kLocationAreaFields, When::Changed, &describeArea},
    {MetricValidator::K_GSM_SCELL_INFO, Subject::LocationArea, "Location area", kLocationAreaFields,
     When::Changed, &describeArea},
    {MetricValidator::K_LTE_EMM_CTXT, Subject::Emm, "EMM", kEmmFields, When::FirstOrChanged,
     &describeRegistration},
    {MetricValidator::K_CELLULAR_MM_CTXT, Subject::Mm, "MM", kMmFields, When::FirstOrChanged,
     &describeRegistration},
    {MetricValidator::K_CELLULAR_GMM_CTXT, Subject::Gmm, "GMM", kGmmFields, When::FirstOrChanged,
     &describeRegistration},
    {MetricValidator::K_CELLULAR_ACTIVE_BEARER, Subject::Bearers, "Bearer", kBearerFields,
     When::FirstOrChanged, &describeBearers},
    {MetricValidator::K_LTE_CA_STATUS, Subject::Carriers, "SCC", kCarrierFields,
     When::FirstOrChanged, &describeCarriers},
    {MetricValidator::K_SIM_FILE_INFO, Subject::Sim, "SIM", {}, When::Every, &describeSimRead},
};

}  // namespace

std::span<const Detector> detectors() {
  return kDetectors;
}

}  // namespace events
