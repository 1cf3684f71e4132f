#pragma once

#include <chrono>
#include <condition_variable>
#include <cstdint>
#include <functional>
#include <memory>
#include <mutex>
#include <optional>
#include <stop_token>
#include <string>
#include <thread>

#include "tarn/service/MetricSource.h"

namespace tarn::mm {

struct ModemManagerOptions {
  // Where ModemManager runs, as tarn::dbus::connectToBus takes it: "system" by default, which
  // DBUS_SYSTEM_BUS_ADDRESS may point elsewhere.
  std::string bus = "system";
  // The modem to follow: a D-Bus path, an index or an equipment identifier; empty for the first.
  std::string modem;
  // How often the source refreshes the signal and the cells; Signal.Setup gets it in whole
  // seconds, at least 1.
  std::chrono::milliseconds refresh = std::chrono::seconds(2);
};

// Says one line about what the source does or cannot do ("following modem 0 ...").
using StatusSink = std::function<void(const std::string& line)>;
// Milliseconds since 1970, the metrics' timestamps.
using WallClock = std::function<std::uint64_t()>;

// The metrics of a real modem, through ModemManager on D-Bus: follows one modem (the first, or
// the chosen one), refreshes its signal and cells every `refresh`, and delivers them as the
// records a baseband does (Metrics.h). Waits for ModemManager and for the modem when they are
// not there, and picks them up again when they return.
class ModemManagerSource final : public service::MetricSource {
 public:
  ModemManagerSource(ModemManagerOptions options, StatusSink status, WallClock clock = {});
  ~ModemManagerSource() override;
  ModemManagerSource(const ModemManagerSource&) = delete;
  ModemManagerSource& operator=(const ModemManagerSource&) = delete;

  // `deliver` runs on the thread of the source's D-Bus connection (a new one after the bus
  // comes back), one call at a time. Does nothing while running.
  void start(std::function<void(service::Metric)> deliver) override;
  // Must not be called from `deliver`.
  void stop() override;
  // The SIM files (0x3C0013), once ModemManager has reported the SIM.
  std::optional<service::Metric> query(std::uint32_t metricId) override;

 private:
  void run(std::stop_token stop, const std::function<void(service::Metric)>& deliver);

  const ModemManagerOptions options_;
  const StatusSink status_;
  const WallClock clock_;
  std::mutex mutex_;  // guards the worker and simFiles_
  std::condition_variable_any wake_;
  std::optional<service::Metric> simFiles_;
  std::jthread worker_;
};

}  // namespace tarn::mm
