#include "tarn/sim/Simulator.h"

#include <algorithm>
#include <optional>

#include "tarn/sim/Drive.h"
#include "tarn/sim/Identity.h"
#include "tarn/sim/Network.h"
#include "tarn/sim/Phone.h"
#include "tarn/sim/Radio.h"
#include "tarn/sim/Random.h"
#include "tarn/sim/Schedule.h"
#include "tarn/sim/SimFiles.h"
#include "tarn/sim/Traffic.h"

namespace tarn::sim {
namespace {

constexpr std::uint64_t kFadingSeedSalt = 0x5DEECE66D;
constexpr std::int64_t kPeriodJitterMs = 20;

}  // namespace

struct Simulator::World {
  World(std::uint64_t seed, std::uint64_t startMs)
      : random(seed),
        fading(seed ^ kFadingSeedSalt),
        network(buildNetwork(random)),
        subscriber(makeSubscriber(network.plmn, random)),
        radio(network),
        traffic(random),
        phone(network),
        startEpochMs(startMs),
        nextDueMs(schedule::periodicReports().size()) {}

  ReportContext contextAt(std::uint64_t atMs) {
    return {network, subscriber, radio, phone, traffic, fading, atMs};
  }
  void step(std::vector<TimedMetric>& delivered);
  void sendPeriodicReports(std::uint64_t nowMs, std::vector<TimedMetric>& batch);

  Random random;  // everything that shapes the drive
  Random fading;  // per-report measurement noise, kept apart so it cannot change the drive
  Network network;
  Subscriber subscriber;
  Radio radio;
  Drive drive;
  Traffic traffic;
  Phone phone;
  std::uint64_t startEpochMs;
  std::uint64_t elapsedMs = 0;
  std::uint64_t carriedMs = 0;
  // When each periodic report is next due; absent while it does not apply.
  std::vector<std::optional<std::uint64_t>> nextDueMs;
};

void Simulator::World::step(std::vector<TimedMetric>& delivered) {
  elapsedMs += kStepMs;
  const std::uint64_t nowMs = startEpochMs + elapsedMs;
  constexpr double kStepS = static_cast<double>(kStepMs) / 1000.0;
  drive.step(kStepS, random);
  radio.update(drive.positionM(), random);
  traffic.step(kStepS, random);

  std::vector<TimedMetric> batch;
  const ChangeSink report = [&](Change change) {
    for (const ReportBuilder build : schedule::reportsOf(change)) {
      batch.push_back({nowMs, build(contextAt(nowMs))});
    }
  };
  phone.step({nowMs, static_cast<double>(kStepMs), radio, random, report}, traffic);
  sendPeriodicReports(nowMs, batch);
  std::stable_sort(batch.begin(), batch.end(),
                   [](const TimedMetric& a, const TimedMetric& b) { return a.atMs < b.atMs; });
  std::move(batch.begin(), batch.end(), std::back_inserter(delivered));
}

void Simulator::World::sendPeriodicReports(std::uint64_t nowMs, std::vector<TimedMetric>& batch) {
  const auto periodic = schedule::periodicReports();
  for (std::size_t i = 0; i < periodic.size(); ++i) {
    std::optional<std::uint64_t>& due = nextDueMs[i];
    if (!periodic[i].applies(contextAt(nowMs))) {
      due.reset();
      continue;
    }
    // A report that starts to apply goes out within the next step, staggered so that a
    // change of RAT does not send every measurement in the same millisecond.
    if (!due) due = nowMs + 10 + (i * 17) % 90;
    while (*due <= nowMs) {
      batch.push_back({*due, periodic[i].build(contextAt(*due))});
      const std::int64_t jitter = fading.between(-kPeriodJitterMs, kPeriodJitterMs);
      *due += static_cast<std::uint64_t>(periodic[i].periodMs + jitter);
    }
  }
}

Simulator::Simulator(std::uint64_t seed, std::uint64_t startEpochMs)
    : world_(std::make_unique<World>(seed, startEpochMs)) {}

Simulator::~Simulator() = default;

std::vector<TimedMetric> Simulator::advance(std::uint64_t elapsedMs) {
  std::vector<TimedMetric> delivered;
  world_->carriedMs += elapsedMs;
  while (world_->carriedMs >= kStepMs) {
    world_->carriedMs -= kStepMs;
    world_->step(delivered);
  }
  return delivered;
}

service::Metric Simulator::simFiles() const {
  return sim::simFiles(world_->network, world_->subscriber, world_->phone.nas(), nowMs());
}

std::uint64_t Simulator::nowMs() const {
  return world_->startEpochMs + world_->elapsedMs;
}

}  // namespace tarn::sim
