#pragma once

#include <cstdint>

#include "tarn/service/MetricSource.h"
#include "tarn/sim/Identity.h"
#include "tarn/sim/Network.h"
#include "tarn/sim/Phone.h"
#include "tarn/sim/Radio.h"
#include "tarn/sim/Random.h"
#include "tarn/sim/Traffic.h"

namespace tarn::sim {

// What a report reads: the network, what the phone receives and does, and the moment.
struct ReportContext {
  const Network& network;
  const Subscriber& subscriber;
  const Radio& radio;
  const Phone& phone;
  const Traffic& traffic;
  Random& fading;  // per-sample variation of measured values
  std::uint64_t atMs;
};

// Builds one metric from the state it describes.
using ReportBuilder = service::Metric (*)(const ReportContext&);

template <class Record>
service::Metric metricOf(std::uint32_t metricId, const Record& record) {
  return {metricId, record.data()};
}

}  // namespace tarn::sim
