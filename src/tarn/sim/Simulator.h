#pragma once

#include <cstdint>
#include <memory>
#include <vector>

#include "tarn/service/MetricSource.h"

namespace tarn::sim {

// A metric and the simulated wall-clock time it was delivered at, in milliseconds since
// 1970 (the same time as the record's timestamp).
struct TimedMetric {
  std::uint64_t atMs;
  service::Metric metric;
};

// A phone driving through an operator's network, and what its baseband reports on the way.
// Pure and deterministic: no threads, no clocks; the same seed gives the same metrics.
class Simulator {
 public:
  Simulator(std::uint64_t seed, std::uint64_t startEpochMs);
  ~Simulator();
  Simulator(const Simulator&) = delete;
  Simulator& operator=(const Simulator&) = delete;

  // Runs the simulation on by `elapsedMs` and returns the metrics delivered meanwhile, in
  // delivery order. Time advances in steps of kStepMs; a remainder carries over.
  std::vector<TimedMetric> advance(std::uint64_t elapsedMs);

  // The SIM's files as they read now: the answer to a query of metric 0x3C0013.
  service::Metric simFiles() const;

  // Simulated wall-clock time, in milliseconds since 1970.
  std::uint64_t nowMs() const;

  static constexpr std::uint64_t kStepMs = 100;

 private:
  struct World;
  std::unique_ptr<World> world_;
};

}  // namespace tarn::sim
