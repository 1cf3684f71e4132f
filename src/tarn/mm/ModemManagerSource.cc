#include "tarn/mm/ModemManagerSource.h"

#include <sdbus-c++/Error.h>

#include "messages/Metrics.h"
#include "tarn/dbus/Bus.h"
#include "tarn/mm/Follower.h"

namespace tarn::mm {
namespace {

std::uint64_t systemNowMs() {
  return static_cast<std::uint64_t>(std::chrono::duration_cast<std::chrono::milliseconds>(
                                        std::chrono::system_clock::now().time_since_epoch())
                                        .count());
}

}  // namespace

ModemManagerSource::ModemManagerSource(ModemManagerOptions options, StatusSink status,
                                       WallClock clock)
    : options_(std::move(options)),
      status_(std::move(status)),
      clock_(clock ? std::move(clock) : WallClock(&systemNowMs)) {}

ModemManagerSource::~ModemManagerSource() {
  stop();
}

void ModemManagerSource::start(std::function<void(service::Metric)> deliver) {
  std::lock_guard lock(mutex_);
  if (worker_.joinable()) return;
  worker_ = std::jthread([this, deliver = std::move(deliver)](std::stop_token stop) {
    run(std::move(stop), deliver);
  });
}

void ModemManagerSource::stop() {
  std::jthread worker;
  {
    std::lock_guard lock(mutex_);
    worker = std::move(worker_);
  }
  // Leaving this scope asks the worker to stop and joins it; the worker ends its follower, whose
  // thread delivers, before it returns.
}

std::optional<service::Metric> ModemManagerSource::query(std::uint32_t metricId) {
  if (metricId != messages::metric::KCellularSimCardFiles) return std::nullopt;
  std::lock_guard lock(mutex_);
  return simFiles_;
}

// Connects, and reconnects after the bus goes away, then asks the follower for a refresh every
// `refresh` until stopped.
void ModemManagerSource::run(std::stop_token stop,
                             const std::function<void(service::Metric)>& deliver) {
  std::unique_ptr<Follower> follower;
  std::string lastFailure;
  // Whether the bus was lost or could not be reached since it last was.
  bool away = false;
  Follower::Hooks hooks{
      .deliver = deliver,
      .simFiles =
          [this, deliver](service::Metric files) {
            {
              std::lock_guard lock(mutex_);
              simFiles_ = files;
            }
            deliver(std::move(files));
          },
      .status = status_,
      .clock = clock_,
  };
  std::mutex sleeping;
  std::unique_lock lock(sleeping);
  do {
    if (follower && follower->lost()) {
      follower.reset();
      away = true;
    }
    if (!follower) {
      try {
        follower =
            std::make_unique<Follower>(tarn::dbus::connectToBus(options_.bus), options_, hooks);
        if (away) status_("reached the " + options_.bus + " bus again");
        away = false;
        lastFailure.clear();
      } catch (const sdbus::Error& error) {
        away = true;
        const std::string failure =
            "cannot reach the " + options_.bus + " bus: " + error.getMessage() + "; trying again";
        if (failure != lastFailure) status_(failure);
        lastFailure = failure;
      }
    } else {
      follower->refresh();
    }
  } while (
      !wake_.wait_for(lock, stop, options_.refresh, [&stop] { return stop.stop_requested(); }));
}

}  // namespace tarn::mm
