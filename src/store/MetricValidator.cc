#include "store/MetricValidator.h"

#include <memory>

#include "client/TarnWrapper.h"
#include "platform/DateFormat.h"
#include "platform/Format.h"
#include "platform/Log.h"
#include "store/BandwidthTable.h"
#include "store/Dispatch.h"

namespace store {

namespace {

constexpr std::string_view kTimestampPattern = "yyyy-MM-dd HH:mm:ss zzz";

}  // namespace

MetricValidator& MetricValidator::sharedInstance() {
  // Never released; the session holds it weakly as its delegate.
  static const std::shared_ptr<MetricValidator>* const shared = [] {
    TarnWrapper& session = TarnWrapper::sharedInstance();
    auto* validator =
        new std::shared_ptr<MetricValidator>(std::make_shared<MetricValidator>(&session));
    session.setDelegate(*validator);
    return validator;
  }();
  return **shared;
}

MetricValidator::MetricValidator(TarnWrapper* session) : mySharedTarnInstance_(session) {
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
  platform::log::plainf("Metric ID in Hex = %2X", *metricID_);

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
