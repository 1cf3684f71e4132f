#include "series/SeriesTable.h"

namespace series {

namespace {

using store::EntryRule;
using store::MetricValidator;
using D = store::DisplayDictionary;

template <auto record, auto field>
const platform::List& rowsOf(const MetricValidator& intake) {
  return (intake.*record)().*field;
}

constexpr RowsOf kLteSamples = &rowsOf<&MetricValidator::myLTE, &store::LTE::RsrpRsrqSinr>;
constexpr RowsOf kLteTxPower = &rowsOf<&MetricValidator::myLTE, &store::LTE::TxPower>;
constexpr RowsOf kLteCarriers =
    &rowsOf<&MetricValidator::myLTE, &store::LTE::SecondaryCellMeasList>;
constexpr RowsOf kUmtsServing = &rowsOf<&MetricValidator::myUMTS, &store::UMTS::rXInfo>;
constexpr RowsOf kUmtsTxPower = &rowsOf<&MetricValidator::myUMTS, &store::UMTS::TxPower>;

constexpr SeriesDefinition kSeries[] = {
    {"lte.rsrp", "LTE RSRP", "dBm", "level"},
    {"umts.rscp", "UMTS RSCP", "dBm", "level"},
    {"umts.rssi", "UMTS RSSI", "dBm", "level"},
    {"gsm.rxlev", "GSM RxLev", "dBm", "level"},
    {"lte.rsrq", "LTE RSRQ", "dB", "quality"},
    {"lte.sinr", "LTE SINR", "dB", "quality"},
    {"umts.ecno", "UMTS Ec/No", "dB", "quality"},
    {"lte.tx_power", "LTE", "dBm", "power"},
    {"umts.tx_power", "UMTS", "dBm", "power"},
    {"gsm.tx_power", "GSM", "dBm", "power"},
    {"lte.scc1.rsrp", "SCC 1 RSRP", "dBm", "carriers"},
    {"lte.scc2.rsrp", "SCC 2 RSRP", "dBm", "carriers"},
    {"lte.scc1.sinr", "SCC 1 SINR", "dB", "carrier-quality"},
    {"lte.scc2.sinr", "SCC 2 SINR", "dB", "carrier-quality"},
    {"neighbour.lte.rsrp", "LTE RSRP", "dBm", "neighbours"},
    {"neighbour.umts.rscp", "UMTS RSCP", "dBm", "neighbours"},
    {"neighbour.gsm.rxlev", "GSM RxLev", "dBm", "neighbours"},
};

// The serving LTE levels are those of the first instant sample, which the "Serving Cell Meas"
// screen shows; transmit power is the highest of a report's samples.
constexpr Feed kFeeds[] = {
    {"lte.rsrp", D::LTERsrpRsrqSinr, "rsrp0", kLteSamples, "inst_values"},
    {"lte.rsrq", D::LTERsrpRsrqSinr, "rsrq0", kLteSamples, "inst_values"},
    {"lte.sinr", D::LTERsrpRsrqSinr, "sinr0", kLteSamples, "inst_values"},
    {"lte.tx_power", D::LTETxPower, "pusch_tx_power", kLteTxPower, "tx_power_info",
     Pick::Strongest},

    {"umts.rscp", D::UMTSCellMeas, "rsrp_range", kUmtsServing, "rx_info", Pick::First, 0,
     EntryRule::RscpIndex},
    {"umts.ecno", D::UMTSCellMeas, "rsrq_range", kUmtsServing, "rx_info", Pick::First, 0,
     EntryRule::EcNoIndex},
    {"umts.rssi", D::UMTSCellMeas, "rssi", kUmtsServing, "rx_info"},
    {"umts.tx_power", D::UMTSTxPower, "pusch_tx_power", kUmtsTxPower, "tx_power_info",
     Pick::Strongest},

    {"gsm.rxlev", D::GSMIdleScellMeas, "idle_rxlev_dBm"},
    {"gsm.rxlev",
     D::GSMConnRfMeas,
     "cs_rxlev_sub",
     nullptr,
     {},
     Pick::First,
     0,
     EntryRule::RxLevIndex},
    {"gsm.tx_power", D::GSMConnRfMeas, "cs_tx_pwr", nullptr, {}, Pick::Strongest},

    {"lte.scc1.rsrp", D::LTESecondaryCellMeas, "rsrp", kLteCarriers, "scc_rx_measurement",
     Pick::Indexed, 1},
    {"lte.scc2.rsrp", D::LTESecondaryCellMeas, "rsrp", kLteCarriers, "scc_rx_measurement",
     Pick::Indexed, 2},
    {"lte.scc1.sinr", D::LTESecondaryCellMeas, "snr", kLteCarriers, "scc_rx_measurement",
     Pick::Indexed, 1, EntryRule::CentiDbFloat},
    {"lte.scc2.sinr", D::LTESecondaryCellMeas, "snr", kLteCarriers, "scc_rx_measurement",
     Pick::Indexed, 2, EntryRule::CentiDbFloat},

    // Neighbours of each technology, as measured from whichever one serves.
    {"neighbour.lte.rsrp", D::LTEIntraRatMeas, "nbr_rsrp",
     &rowsOf<&MetricValidator::myLTE, &store::LTE::EutraNbrsMeas>, "meas_nbr_eutra",
     Pick::Strongest},
    {"neighbour.lte.rsrp", D::UMTSNbrMeas, "rsrp",
     &rowsOf<&MetricValidator::myUMTS, &store::UMTS::eUtraNbrMeas>, "meas_lte_result",
     Pick::Strongest},
    {"neighbour.lte.rsrp", D::GSMNbrMeas, "rsrp",
     &rowsOf<&MetricValidator::myGSM, &store::GSM::eUtraNbrMeas>, "lte_ncell_meas",
     Pick::Strongest},
    {"neighbour.umts.rscp", D::LTEInterRatMeas, "rscp",
     &rowsOf<&MetricValidator::myLTE, &store::LTE::UtraNbrsMeas>, "meas_nbr_utra", Pick::Strongest},
    {"neighbour.umts.rscp", D::UMTSNbrMeas, "rscp",
     &rowsOf<&MetricValidator::myUMTS, &store::UMTS::utraNbrMeas>, "meas_utra_result",
     Pick::Strongest},
    {"neighbour.umts.rscp", D::GSMNbrMeas, "cpich_rscp",
     &rowsOf<&MetricValidator::myGSM, &store::GSM::utraNbrMeas>, "umts_ncell_meas",
     Pick::Strongest},
    {"neighbour.gsm.rxlev", D::LTEInterRatMeas, "rxlev",
     &rowsOf<&MetricValidator::myLTE, &store::LTE::GeraNbrsMeas>, "meas_nbr_geran",
     Pick::Strongest},
    {"neighbour.gsm.rxlev", D::UMTSNbrMeas, "rxlev",
     &rowsOf<&MetricValidator::myUMTS, &store::UMTS::geraNbrMeas>, "meas_gsm_result",
     Pick::Strongest},
    {"neighbour.gsm.rxlev", D::GSMNbrMeas, "rxlev",
     &rowsOf<&MetricValidator::myGSM, &store::GSM::geraNbrMeas>, "gsm_ncell_meas", Pick::Strongest},
};

}  // namespace

std::span<const SeriesDefinition> seriesDefinitions() {
  return kSeries;
}

std::span<const Feed> feeds() {
  return kFeeds;
}

}  // namespace series
