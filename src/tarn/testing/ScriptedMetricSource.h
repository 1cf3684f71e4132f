#pragma once

#include <future>
#include <map>
#include <mutex>

#include "platform/SerialQueue.h"
#include "tarn/service/MetricSource.h"

namespace tarn::testing {

// A metric source for tests: delivers the metrics a test emits, in order, on a thread of its
// own, and answers queries from the metrics a test leaves for them.
class ScriptedMetricSource final : public service::MetricSource {
 public:
  // A source that `waitsForFirstListener` plays a recorded drive.
  explicit ScriptedMetricSource(bool waitsForFirstListener = false)
      : waitsForFirstListener_(waitsForFirstListener) {}

  void start(std::function<void(service::Metric)> deliver) override {
    const std::lock_guard lock(mutex_);
    deliver_ = std::move(deliver);
    started_ = true;
  }

  bool startsWithFirstListener() const override { return waitsForFirstListener_; }

  bool started() {
    const std::lock_guard lock(mutex_);
    return started_;
  }

  // Deliveries hold the lock, so none runs once this has taken it.
  void stop() override {
    const std::lock_guard lock(mutex_);
    deliver_ = nullptr;
  }

  std::optional<service::Metric> query(std::uint32_t metricId) override {
    const std::lock_guard lock(mutex_);
    const auto found = answers_.find(metricId);
    if (found == answers_.end()) return {};
    return found->second;
  }

  void emit(service::Metric metric) {
    thread_.async([this, metric = std::move(metric)] {
      const std::lock_guard lock(mutex_);
      if (deliver_) deliver_(metric);
    });
  }

  // Waits until every metric emitted so far has been delivered.
  void flush() {
    std::promise<void> done;
    thread_.async([&done] { done.set_value(); });
    done.get_future().wait();
  }

  void answerQueriesWith(service::Metric metric) {
    const std::lock_guard lock(mutex_);
    answers_.insert_or_assign(metric.metricId, std::move(metric));
  }

 private:
  const bool waitsForFirstListener_;
  std::mutex mutex_;
  std::function<void(service::Metric)> deliver_;
  bool started_ = false;
  std::map<std::uint32_t, service::Metric> answers_;
  platform::SerialQueue thread_{"org.norvo.test.source"};
};

}  // namespace tarn::testing
