#include "dashboard/ServingCell.h"

#include <array>
#include <string>

#include "dashboard/Levels.h"
#include "dashboard/SimFiles.h"
#include "radio/CellIdentity.h"
#include "radio/GsmBands.h"
#include "radio/LteBands.h"
#include "radio/Plmn.h"
#include "radio/UmtsBands.h"

namespace dashboard {

namespace {

using platform::Dictionary;
using platform::List;
using platform::Value;
using D = store::DisplayDictionary;

// The band and frequencies of a channel number.
struct ChannelText {
  std::string band;
  std::string downlink;
  std::optional<std::string> uplink;
};

std::string mhz(std::uint32_t kHz) {
  return radio::megahertzText(kHz) + " MHz";
}

std::optional<ChannelText> lteChannel(std::uint32_t earfcn, const Dictionary&) {
  const auto channel = radio::decodeEarfcn(earfcn);
  if (!channel) return std::nullopt;
  return ChannelText{std::to_string(channel->band), mhz(channel->downlinkKHz),
                     channel->uplinkKHz ? std::optional(mhz(*channel->uplinkKHz)) : std::nullopt};
}

std::optional<ChannelText> umtsChannel(std::uint32_t uarfcn, const Dictionary&) {
  const auto channel = radio::decodeUarfcn(uarfcn);
  if (!channel) return std::nullopt;
  return ChannelText{std::string(channel->bandName), mhz(channel->downlinkKHz),
                     mhz(channel->uplinkKHz)};
}

// ARFCNs 512 to 810 are DCS 1800 or PCS 1900 by the band the cell reports.
std::optional<ChannelText> gsmChannel(std::uint32_t arfcn, const Dictionary& cell) {
  radio::GsmBandIndicator indicator = radio::GsmBandIndicator::none;
  if (const Value* band = cell.find("gsm_band"); band != nullptr && band->isString()) {
    if (*band->asString() == "SYS_BAND_GSM_DCS_1800") indicator = radio::GsmBandIndicator::dcs1800;
    if (*band->asString() == "SYS_BAND_GSM_PCS_1900") indicator = radio::GsmBandIndicator::pcs1900;
  }
  const auto channel = radio::decodeArfcn(arfcn, indicator);
  if (!channel) return std::nullopt;
  return ChannelText{std::string(channel->bandName), mhz(channel->downlinkKHz),
                     mhz(channel->uplinkKHz)};
}

using Row = std::pair<std::string_view, std::string>;

void lteCellRows(std::uint32_t cellId, std::vector<Row>& rows) {
  if (const auto cell = radio::splitEutranCellId(cellId)) {
    rows.emplace_back("eNB", std::to_string(cell->enbId));
    rows.emplace_back("Sector", std::to_string(cell->cellId));
  }
}

void umtsCellRows(std::uint32_t cellId, std::vector<Row>& rows) {
  if (const auto cell = radio::splitUtranCellId(cellId)) {
    rows.emplace_back("RNC", std::to_string(cell->rncId));
    rows.emplace_back("C-ID", std::to_string(cell->cellId));
  }
}

// Where the card of each technology finds its cell in the store.
struct Technology {
  std::string_view name;
  std::string_view levelSeries;
  D cellInfo;
  std::string_view mccKey, mncKey;
  std::string_view cellIdKey;
  void (*cellRows)(std::uint32_t cellId, std::vector<Row>& rows);
  std::string_view physicalIdKey, physicalIdLabel;
  std::string_view channelKey, channelLabel;
  std::optional<ChannelText> (*channel)(std::uint32_t number, const Dictionary& cell);
  std::string_view areaKey, areaLabel;
  D stateSource;
  std::string_view stateKey, statePrefix;
  std::array<std::string_view, 4> levels;
};

constexpr Technology kTechnologies[] = {
    {"LTE",
     "lte.rsrp",
     D::LTESCellInfo,
     "sel_plmn_mcc",
     "sel_plmn_mnc",
     "cell_id",
     &lteCellRows,
     "phy_cell_id",
     "PCI",
     "dl_freq",
     "EARFCN",
     &lteChannel,
     "tracking_area_code",
     "TAC",
     D::LTERRCState,
     "state",
     "KLTE_RRC_STATE_",
     {"lte.rsrp", "lte.rsrq", "lte.sinr", "lte.tx_power"}},
    {"UMTS",
     "umts.rscp",
     D::UMTSCellInfo,
     "mcc",
     "mnc",
     "cell_id",
     &umtsCellRows,
     "psc",
     "PSC",
     "dl_uarfcn",
     "UARFCN",
     &umtsChannel,
     "lac",
     "LAC",
     D::UMTSRRCState,
     "state",
     "KWCDMA_RRC_CONN_STATE_",
     {"umts.rscp", "umts.ecno", "umts.rssi", "umts.tx_power"}},
    {"GSM",
     "gsm.rxlev",
     D::GSMScellInfo,
     "mcc",
     "mnc",
     "cell_id",
     nullptr,
     "bsic",
     "BSIC",
     "arfcn",
     "ARFCN",
     &gsmChannel,
     "lac",
     "LAC",
     D::GSMScellInfo,
     "state",
     "",
     {"gsm.rxlev", "gsm.tx_power"}},
};

std::optional<std::uint32_t> numberIn(const Dictionary& dictionary, std::string_view key) {
  const Value* value = dictionary.find(key);
  if (value == nullptr) return std::nullopt;
  const auto number = value->asInteger();
  if (!number || *number < 0 || *number > UINT32_MAX) return std::nullopt;
  return static_cast<std::uint32_t>(*number);
}

std::optional<std::string> textIn(const Dictionary& dictionary, std::string_view key) {
  const Value* value = dictionary.find(key);
  if (value == nullptr) return std::nullopt;
  if (const std::string* text = value->asString()) return *text;
  return value->description();
}

void addNumberRow(std::vector<Row>& rows, std::string_view label, const Dictionary& cell,
                  std::string_view key) {
  if (const auto number = numberIn(cell, key)) rows.emplace_back(label, std::to_string(*number));
}

std::vector<Row> cellRows(const Technology& technology, const store::MetricValidator& intake) {
  std::vector<Row> rows;
  rows.emplace_back("Technology", std::string(technology.name));
  if (const auto& states = intake.displayDictionary(technology.stateSource)) {
    if (auto state = textIn(*states, technology.stateKey)) {
      if (state->starts_with(technology.statePrefix))
        state->erase(0, technology.statePrefix.size());
      rows.emplace_back("RRC state", std::move(*state));
    }
  }
  const auto& found = intake.displayDictionary(technology.cellInfo);
  if (!found) return rows;
  const Dictionary& cell = *found;

  const auto mcc = numberIn(cell, technology.mccKey);
  const auto mnc = numberIn(cell, technology.mncKey);
  const auto mncDigits = numberIn(cell, "num_mnc_digits");
  if (mcc && mnc) {
    if (const auto plmn = radio::plmnFromNumbers(*mcc, *mnc, mncDigits.value_or(2)))
      rows.emplace_back("Operator", radio::plmnText(*plmn));
  }
  if (const auto name = serviceProviderName(intake)) rows.emplace_back("Network", *name);
  if (const auto cellId = numberIn(cell, technology.cellIdKey)) {
    rows.emplace_back("Cell ID", std::to_string(*cellId));
    if (technology.cellRows != nullptr) technology.cellRows(*cellId, rows);
  }
  addNumberRow(rows, technology.physicalIdLabel, cell, technology.physicalIdKey);
  if (const auto number = numberIn(cell, technology.channelKey)) {
    rows.emplace_back(technology.channelLabel, std::to_string(*number));
    if (auto channel = technology.channel(*number, cell)) {
      rows.emplace_back("Band", std::move(channel->band));
      rows.emplace_back("Downlink", std::move(channel->downlink));
      if (channel->uplink) rows.emplace_back("Uplink", std::move(*channel->uplink));
    }
  }
  addNumberRow(rows, technology.areaLabel, cell, technology.areaKey);
  return rows;
}

List levelsOf(const Technology& technology, const series::SeriesStore& series) {
  List levels;
  for (const std::string_view name : technology.levels) {
    if (name.empty()) continue;
    const auto latest = series.latest(name);
    if (!latest) continue;
    const auto quality = qualityOf(name, latest->value);
    levels.emplace_back(Dictionary{
        {"name", name},
        {"label", levelLabel(name)},
        {"value", latest->value},
        {"unit", series.definition(name)->unit},
        {"quality", quality ? Value(*quality) : Value()},
    });
  }
  return levels;
}

// The secondary carriers of the latest carrier-aggregation status.
List carriersOf(const store::MetricValidator& intake) {
  List carriers;
  for (const Value& row : intake.myLTE().CAStatusList) {
    const Dictionary* carrier = row.asDictionary();
    if (carrier == nullptr || !carrier->contains("index")) continue;  // the placeholder row
    Dictionary shown;
    for (const std::string_view key : {"index", "pci", "rsrp", "rsrq"}) {
      const Value* value = carrier->find(key);
      shown.append(std::string(key), value != nullptr ? *value : Value());
    }
    constexpr std::string_view kStatePrefix = "SCC_STATE_";
    auto state = textIn(*carrier, "state");
    if (state && state->starts_with(kStatePrefix)) state->erase(0, kStatePrefix.size());
    shown.append("state", state ? Value(*state) : Value());
    const auto earfcn = numberIn(*carrier, "dl_earfcn");
    shown.append("earfcn", earfcn ? Value(*earfcn) : Value());
    const auto channel = earfcn ? lteChannel(*earfcn, *carrier) : std::nullopt;
    shown.append("band", channel ? Value(channel->band) : Value());
    shown.append("downlink", channel ? Value(channel->downlink) : Value());
    const Value* bandwidth = carrier->find("dl_bandwidth");
    shown.append("bandwidth", bandwidth != nullptr && bandwidth->isNumber()
                                  ? Value(bandwidth->description() + " MHz")
                                  : Value());
    carriers.emplace_back(std::move(shown));
  }
  return carriers;
}

}  // namespace

std::optional<ServingLevel> servingLevel(const series::SeriesStore& series) {
  std::optional<ServingLevel> latest;
  for (const Technology& technology : kTechnologies) {
    const auto sample = series.latest(technology.levelSeries);
    if (sample && (!latest || sample->timeMs > latest->sample.timeMs))
      latest = ServingLevel{technology.name, technology.levelSeries, *sample};
  }
  if (latest && series.now() - latest->sample.timeMs > kServingLevelStaleMs) return std::nullopt;
  return latest;
}

Dictionary dashboardCard(const store::MetricValidator& intake, const series::SeriesStore& series) {
  Dictionary card;
  const std::optional<ServingLevel> serving = servingLevel(series);
  const Technology* technology = nullptr;
  for (const Technology& candidate : kTechnologies)
    if (serving && candidate.name == serving->technology) technology = &candidate;
  card.append("technology", technology != nullptr ? Value(technology->name) : Value());
  List rows, levels;
  if (technology != nullptr) {
    for (auto& [label, value] : cellRows(*technology, intake))
      rows.emplace_back(Dictionary{{"label", label}, {"value", std::move(value)}});
    levels = levelsOf(*technology, series);
  }
  card.append("rows", std::move(rows));
  card.append("levels", std::move(levels));
  card.append("carriers", carriersOf(intake));
  const std::optional<Dictionary> subscriber = subscriberOf(intake);
  card.append("subscriber", subscriber ? Value(*subscriber) : Value());
  return card;
}

}  // namespace dashboard
