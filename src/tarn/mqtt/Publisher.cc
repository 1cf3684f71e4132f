#include "tarn/mqtt/Publisher.h"

#include <mosquitto.h>

#include <algorithm>
#include <chrono>

#include "platform/Json.h"
#include "platform/Log.h"
#include "platform/Value.h"

namespace tarn::mqtt {

namespace {

// Metrics handed to the library at once: enough to keep a link to a distant broker busy, few
// enough that the library's own queue, which has no bound, stays small.
constexpr std::size_t kWindow = 100;
// How long a clean stop waits for the broker to take the "offline" status.
constexpr auto kGoodbyeWait = std::chrono::seconds(2);
// The version of the message format, raised when a consumer would have to change.
constexpr int kMessageFormat = 1;

std::string libraryVersion() {
  int major = 0, minor = 0, revision = 0;
  mosquitto_lib_version(&major, &minor, &revision);
  return std::to_string(major) + "." + std::to_string(minor) + "." + std::to_string(revision);
}

}  // namespace

Publisher::Publisher(PublisherOptions options)
    : options_(std::move(options)),
      metricsTopic_(metricsTopic(options_.broker.path, options_.device)),
      statusTopic_(statusTopic(options_.broker.path, options_.device)) {
  LinkOptions link{
      .broker = options_.broker,
      .caFile = options_.caFile,
      .clientId = options_.name + "-" + options_.device,
      .will = std::pair(statusTopic_, statusMessage("offline", false)),
      .subscriptions = {},
      .maxInflight = kWindow,
      .name = options_.name,
  };
  link_ = std::make_unique<Link>(std::move(link),
                                 Link::Handlers{
                                     .connected = [this] { connected(); },
                                     .disconnected = [this] { disconnected(); },
                                     .published = [this](int messageId) { published(messageId); },
                                     .message = {},
                                     .subscribed = {},
                                 });
  link_->start();
}

Publisher::~Publisher() {
  std::unique_lock lock(mutex_);
  if (connected_) {
    if (const auto goodbye = link_->publish(statusTopic_, statusMessage("offline"), 1, true)) {
      retainedIds_.push_back(*goodbye);
      statusSent_.wait_for(lock, kGoodbyeWait,
                           [&] { return !std::ranges::count(retainedIds_, *goodbye); });
    }
  }
  const std::size_t unsent = waiting_.size() + inflight_;
  lock.unlock();
  link_.reset();
  if (unsent > 0)
    platform::log::plain(options_.name + ": " + std::to_string(unsent) +
                         " metric(s) not yet taken by the broker were not sent");
}

std::string Publisher::statusMessage(std::string_view state, bool withDrops) const {
  platform::Dictionary versions{
      {"norvo", std::string(NORVO_VERSION)},
      {"libmosquitto", libraryVersion()},
      {"format", std::int64_t{kMessageFormat}},
  };
  platform::Dictionary status{
      {"status", std::string(state)},
      {"device", options_.device},
      {"source", options_.source},
      {"versions", std::move(versions)},
  };
  if (withDrops) status.append("dropped", static_cast<std::int64_t>(counts_.dropped));
  return platform::toJson(status);
}

void Publisher::publish(std::string line) {
  const std::lock_guard lock(mutex_);
  ++counts_.accepted;
  if (connected_ && waiting_.empty() && inflight_ < kWindow && send(line)) return;
  if (waiting_.size() >= options_.queueLimit) {
    if (waiting_.empty()) {
      ++counts_.dropped;
      ++droppedSinceLink_;
      return;
    }
    waiting_.pop_front();
    ++counts_.dropped;
    ++droppedSinceLink_;
  }
  waiting_.push_back(std::move(line));
}

Publisher::Counts Publisher::counts() const {
  const std::lock_guard lock(mutex_);
  Counts counts = counts_;
  counts.queued = waiting_.size() + inflight_;
  counts.linked = connected_;
  return counts;
}

void Publisher::connected() {
  const std::lock_guard lock(mutex_);
  connected_ = true;
  sendRetained(statusTopic_, statusMessage("online"));
  for (const auto& [topic, line] : retained_)
    sendRetained(topic, line);
  if (droppedSinceLink_ > 0) {
    platform::log::plain(
        options_.name + ": the broker is back; " + std::to_string(droppedSinceLink_) +
        " metric(s) dropped while it was away (" + std::to_string(counts_.dropped) + " in all)");
    droppedSinceLink_ = 0;
  }
  sendWaiting();
}

void Publisher::disconnected() {
  const std::lock_guard lock(mutex_);
  connected_ = false;
}

void Publisher::published(int messageId) {
  const std::lock_guard lock(mutex_);
  if (std::erase(retainedIds_, messageId) > 0) {
    statusSent_.notify_all();
    return;
  }
  if (inflight_ > 0) --inflight_;
  ++counts_.sent;
  if (connected_) sendWaiting();
}

void Publisher::sendWaiting() {
  while (!waiting_.empty() && inflight_ < kWindow && send(waiting_.front()))
    waiting_.pop_front();
}

void Publisher::retain(const std::string& topic, std::string line) {
  const std::lock_guard lock(mutex_);
  if (connected_) sendRetained(topic, line);
  retained_.insert_or_assign(topic, std::move(line));
}

void Publisher::sendRetained(const std::string& topic, const std::string& message) {
  if (const auto id = link_->publish(topic, message, 1, true)) retainedIds_.push_back(*id);
}

bool Publisher::send(const std::string& line) {
  if (!link_->publish(metricsTopic_, line, options_.qos, false)) return false;
  ++inflight_;
  return true;
}

}  // namespace tarn::mqtt
