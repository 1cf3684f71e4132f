#include "store/MetricValidator.h"

#include <algorithm>
#include <atomic>
#include <charconv>
#include <cstring>
#include <iterator>
#include <memory>

#include "platform/DateFormat.h"
#include "platform/Format.h"
#include "platform/Log.h"
#include "store/BandwidthTable.h"
#include "store/Dispatch.h"

namespace store {

namespace {

constexpr std::string_view kTimestampPattern = "yyyy-MM-dd HH:mm:ss zzz";

std::atomic<MetricSession*> sharedSession{nullptr};

// "Metric ID in Hex = " and the ID as "%2X" writes it (upper-case digits of its 64 bits, at
// least two wide), without the general formatter and without allocating: the line is written
// for every metric.
class MetricIDLine {
 public:
  explicit MetricIDLine(std::int64_t metricID) {
    std::memcpy(text_, kPrefix.data(), kPrefix.size());
    char* const digits = text_ + kPrefix.size();
    char* last =
        std::to_chars(digits, std::end(text_), static_cast<std::uint64_t>(metricID), 16).ptr;
    if (last - digits < 2) {
      digits[1] = digits[0];
      digits[0] = ' ';
      last = digits + 2;
    }
    std::transform(digits, last, digits,
                   [](char c) { return c >= 'a' ? static_cast<char>(c - 'a' + 'A') : c; });
    length_ = static_cast<std::size_t>(last - text_);
  }

  std::string_view text() const { return {text_, length_}; }

 private:
  static constexpr std::string_view kPrefix = "Metric ID in Hex = ";

  char text_[kPrefix.size() + 16];
  std::size_t length_;
};

}  // namespace

void MetricValidator::setSharedSession(MetricSession* session) {
  sharedSession = session;
}

MetricValidator& MetricValidator::sharedInstance() {
  // Never released; the session holds it weakly as its delegate.
  static const std::shared_ptr<MetricValidator>* const shared = [] {
    MetricSession* session = sharedSession.load();
    auto* validator =
        new std::shared_ptr<MetricValidator>(std::make_shared<MetricValidator>(session));
    if (session != nullptr) session->setDelegate(*validator);
    return validator;
  }();
  return **shared;
}

MetricValidator::MetricValidator(MetricSession* session) : mySharedTarnInstance_(session) {
  if (mySharedTarnInstance_ != nullptr) mySharedTarnInstance_->listen();
}

const std::map<std::int32_t, float>& MetricValidator::dlbwlookup() const {
  return downlinkBandwidthMHz();
}

void MetricValidator::metricsDidUpdate(const platform::Dictionary& metric) {
  if (isMetricIDValidWithMetricdict(metric)) platform::log::plain("Received Valid Metric");
}

void MetricValidator::eventsDidUpdate(const platform::Dictionary&) {
  platform::log::plain("I dont care for events");
}

bool MetricValidator::isMetricIDValidWithMetricdict(const platform::Dictionary& metric) {
  const platform::Value* id = metric.find(metricIDKey);
  metricID_ = id != nullptr ? id->asInteger() : std::nullopt;
  if (!metricID_) {
    platform::log::plain("The metric record has no integer \"kKeyMetricID\"; nothing to do");
    return false;
  }
  platform::log::plain(MetricIDLine(*metricID_).text());

  const Handler* handler = handlerFor(*metricID_);
  if (handler == nullptr) {
    platform::log::plain("I dont care for this Metric");
    return false;
  }
  const platform::Value* payloadValue = metric.find(payloadKey);
  const platform::Bytes* payload = payloadValue != nullptr ? payloadValue->asBytes() : nullptr;
  DecodedObserver observeDecoded;
  if (!acceptedMetricObservers_.empty()) {
    observeDecoded = [this, payload](const platform::Dictionary& decoded) {
      for (const AcceptedMetricObserver& observe : acceptedMetricObservers_)
        observe(*metricID_, payload, decoded);
    };
  }
  if (!runHandler(
          *handler, payload, store_,
          [this](double milliseconds) { return formatTimestamp(milliseconds); }, observeDecoded)) {
    return false;
  }
  for (const StoreObserver& observer : storeObservers_)
    observer(handler->display, *this);
  return true;
}

std::optional<std::string> MetricValidator::formatTimestamp(double milliseconds) const {
  return platform::formatDate(milliseconds, kTimestampPattern);
}

}  // namespace store
