#pragma once

#include <cstdint>
#include <optional>
#include <vector>

#include "tarn/mm/Reader.h"
#include "tarn/mm/Snapshot.h"
#include "tarn/service/MetricSource.h"

// From what ModemManager reports to the metrics a baseband delivers, encoded with the metric
// records in the baseband's own units, so that the intake's conversions show ModemManager's dBm
// and dB again. A field that ModemManager did not report stays absent, and a record with no field
// besides its timestamp is not made at all. docs/modemmanager.md has the table.
namespace tarn::mm {

// The radio technology the modem is on: its serving cell's, or else its access technology's.
std::optional<Rat> currentRat(const Snapshot& snapshot);

// The radio metrics of one refresh, stamped `atMs`: serving cell, measurements, neighbours and
// mobility management state of the current technology. A value the baseband's units cannot carry
// is left out, with a line in `problems`.
std::vector<service::Metric> radioMetrics(const Snapshot& snapshot, std::uint64_t atMs,
                                          Problems& problems);

// The active bearers: their count and one context per connected bearer.
service::Metric bearerMetric(const std::vector<Bearer>& connected, std::uint64_t atMs);

}  // namespace tarn::mm
