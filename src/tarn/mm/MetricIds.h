#pragma once

#include <cstdint>

#include "tarn/sim/MetricIds.h"

// The metrics this source fills: the one place that names their IDs.
namespace tarn::mm::metric {

inline constexpr std::uint32_t kLteServingCellInfo = sim::metric_id::kLteServingCellInfo;
inline constexpr std::uint32_t kLteServingCellMeas = sim::metric_id::kLteServingCellMeas;
inline constexpr std::uint32_t kLteRsrpRsrqSinr = sim::metric_id::kLteRsrpRsrqSinr;
inline constexpr std::uint32_t kLteNeighbourMeas = sim::metric_id::kLteNeighbourMeas;
inline constexpr std::uint32_t kLteInterRatMeas = sim::metric_id::kLteInterRatMeas;
inline constexpr std::uint32_t kUmtsServingCellInfo = sim::metric_id::kUmtsServingCellInfo;
inline constexpr std::uint32_t kUmtsServingCellMeas = sim::metric_id::kUmtsServingCellMeas;
inline constexpr std::uint32_t kUmtsNeighbourMeas = sim::metric_id::kUmtsNeighbourMeas;
inline constexpr std::uint32_t kGsmServingCellInfo = sim::metric_id::kGsmServingCellInfo;
inline constexpr std::uint32_t kGsmIdleServingMeas = sim::metric_id::kGsmIdleServingMeas;
inline constexpr std::uint32_t kGsmNeighbourMeas = sim::metric_id::kGsmNeighbourMeas;
inline constexpr std::uint32_t kMmContext = sim::metric_id::kMmContext;
inline constexpr std::uint32_t kGmmContext = sim::metric_id::kGmmContext;
inline constexpr std::uint32_t kEmmContext = sim::metric_id::kEmmContext;
inline constexpr std::uint32_t kActiveBearers = sim::metric_id::kActiveBearers;
inline constexpr std::uint32_t kMmCommonInfo = sim::metric_id::kMmCommonInfo;
inline constexpr std::uint32_t kSimFiles = sim::metric_id::kSimFiles;

}  // namespace tarn::mm::metric
