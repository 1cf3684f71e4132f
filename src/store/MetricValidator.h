#pragma once

#include <cstdint>
#include <functional>
#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "client/TarnWrapperDelegate.h"
#include "messages/Metrics.h"
#include "platform/Value.h"
#include "store/DisplayDictionaries.h"
#include "store/DisplayStore.h"
#include "store/ListRecords.h"
#include "store/MetricSession.h"

namespace store {

// The one receiver of the metrics the baseband delivers. It checks each metric's ID, decodes
// the payload with the record class of that ID, converts it for display and keeps the latest
// result of each kind for the screens. Everything runs on the main queue, so the store has no
// lock.
class MetricValidator : public TarnWrapperDelegate {
 public:
  // Metric IDs, as the schemas declare them.
  static constexpr std::int64_t K_LTE_CDRX_CONFIG = messages::metric::KCellularLteCdrxConfig;
  static constexpr std::int64_t K_LTE_RRC_STATE = messages::metric::KCellularLteRrcState;
  static constexpr std::int64_t K_LTE_SCELL_INFO = messages::metric::KCellularLteScellInfo;
  static constexpr std::int64_t K_LTE_RLF = messages::metric::KCellularLteRadioLinkFailure;
  static constexpr std::int64_t K_LTE_SEL_RESEL_INFO =
      messages::metric::KCellularLteSelReselCellInfo;
  static constexpr std::int64_t K_LTE_SCELL_MEAS =
      messages::metric::KCellularLteServingCellMeasurement;
  static constexpr std::int64_t K_LTE_TX_POWER = messages::metric::KCellularLteTxPower;
  static constexpr std::int64_t K_LTE_RSRP_RSRQ_SINR = messages::metric::KCellularLteRsrpRsrqSinr;
  static constexpr std::int64_t K_LTE_COMPCARR_INFO =
      messages::metric::KCellularLteComponentCarrierInfo;
  static constexpr std::int64_t K_LTE_CA_STATUS =
      messages::metric::KCellularLteCarrierAggregationStatus;
  static constexpr std::int64_t K_LTE_INTERRAT_MEAS =
      messages::metric::KCellularLteNbrInterRatCellMeas;
  static constexpr std::int64_t K_LTE_INTRARAT_MEAS =
      messages::metric::KCellularLteNbrEutraCellMeas;
  static constexpr std::int64_t K_LTE_SECONDARYCELL_MEAS =
      messages::metric::KCellularLteSecondaryCellMeasurements;
  static constexpr std::int64_t K_CELLULAR_MM_INFO = messages::metric::KCellularMmCommonInfo;
  static constexpr std::int64_t K_CELLULAR_ACTIVE_BEARER =
      messages::metric::KCellularActivatedBearerContexts;
  static constexpr std::int64_t K_LTE_EMM_CTXT = messages::metric::KCellularEmmContext;
  static constexpr std::int64_t K_CELLULAR_MM_CTXT = messages::metric::KCellularMmContext;
  static constexpr std::int64_t K_CELLULAR_GMM_CTXT = messages::metric::KCellularGmmContext;
  static constexpr std::int64_t K_UMTS_RRC_STATE =
      messages::metric::KCellularWcdmaRrcConnectionState;
  static constexpr std::int64_t K_UMTS_RRC_CONFIG =
      messages::metric::KCellularWcdmaRrcConfiguration;
  static constexpr std::int64_t K_UMTS_SCELL_INFO = messages::metric::KCellularWcdmaCellInfo;
  static constexpr std::int64_t K_UMTS_SCELL_MEAS =
      messages::metric::KCellularWcdmaScellMeasurement;
  static constexpr std::int64_t K_UMTS_TX_POWER = messages::metric::KCellularWcdmaTxPower;
  static constexpr std::int64_t K_UMTS_SEL_RESEL_INFO =
      messages::metric::KCellularWcdmaSelReselCellInfo;
  static constexpr std::int64_t K_UMTS_NCELL_MEAS = messages::metric::KCellularWcdmaNbrCellMeas;
  static constexpr std::int64_t K_GSM_SCELL_INFO = messages::metric::KCellularGsmScellInfo;
  static constexpr std::int64_t K_GSM_IDLE_CONFIG = messages::metric::KCellularGsmIdleConfig;
  static constexpr std::int64_t K_GSM_IDLE_SCELL_MEAS =
      messages::metric::KCellularGsmIdleScellMeasurement;
  static constexpr std::int64_t K_GSM_CS_RF_MEAS = messages::metric::KCellularGsmCsRfMeasurement;
  static constexpr std::int64_t K_GSM_NCELL_MEAS = messages::metric::KCellularGsmGrrEventMeasCr;
  static constexpr std::int64_t K_GSM_GPRS_CONFIG = messages::metric::KCellularGsmGprsConfig;
  static constexpr std::int64_t K_SIM_FILE_INFO = messages::metric::KCellularSimCardFiles;

  // Keys of a metric record.
  static constexpr std::string_view metricIDKey = "kKeyMetricID";
  static constexpr std::string_view payloadKey = "kKeyPayload";
  static constexpr std::string_view profileIDKey = "kKeyProfileID";

  // The shared intake, created on first use: it listens on the shared session (when the app has
  // handed one over) and is its delegate from then on.
  static MetricValidator& sharedInstance();
  // The session of the shared intake, which must outlive it; for the app to hand over before
  // the first sharedInstance(). Afterwards it changes nothing.
  static void setSharedSession(MetricSession* session);

  // An empty store. With a session it calls the session's listen(); making it the session's
  // delegate is the owner's part, since the session holds its delegate weakly.
  explicit MetricValidator(MetricSession* session);

  MetricSession* mySharedTarnInstance() const { return mySharedTarnInstance_; }

  // The metric ID of the latest metric record handled; empty before the first and after one
  // without an integer ID.
  std::optional<std::int64_t> metricID() const { return metricID_; }
  void setMetricID(std::optional<std::int64_t> metricID) { metricID_ = metricID; }

  // The row list records. Assigning what a reader returns takes a snapshot.
  const LTE& myLTE() const { return store_.myLTE; }
  void setMyLTE(LTE lte) { store_.myLTE = std::move(lte); }
  const UMTS& myUMTS() const { return store_.myUMTS; }
  void setMyUMTS(UMTS umts) { store_.myUMTS = std::move(umts); }
  const GSM& myGSM() const { return store_.myGSM; }
  void setMyGSM(GSM gsm) { store_.myGSM = std::move(gsm); }
  const Common& myCommon() const { return store_.myCommon; }
  void setMyCommon(Common common) { store_.myCommon = std::move(common); }

  // The 31 display dictionaries, e.g. myLTECAStatusDict() and setMyLTECAStatusDict(...); empty
  // until the first metric of their kind.
#define NORVO_DISPLAY_ACCESSORS(name)                                      \
  const std::optional<platform::Dictionary>& my##name##Dict() const {      \
    return store_[DisplayDictionary::name];                                \
  }                                                                        \
  void setMy##name##Dict(std::optional<platform::Dictionary> dictionary) { \
    store_.replace(DisplayDictionary::name, std::move(dictionary));        \
  }
  NORVO_DISPLAY_DICTIONARIES(NORVO_DISPLAY_ACCESSORS)
#undef NORVO_DISPLAY_ACCESSORS

  const std::optional<platform::Dictionary>& displayDictionary(DisplayDictionary which) const {
    return store_[which];
  }

  // Back to the store of a new intake: no metric ID, no display dictionaries, placeholder rows.
  // Observers stay.
  void clearStore() {
    metricID_.reset();
    store_ = DisplayStore();
  }

  // LTE downlink bandwidth index to MHz.
  const std::map<std::int32_t, float>& dlbwlookup() const;

  // Validates, converts and stores one metric record; writes "Received Valid Metric" when it
  // was.
  void metricsDidUpdate(const platform::Dictionary& metric) override;
  // Events are acknowledged and otherwise ignored.
  void eventsDidUpdate(const platform::Dictionary& event) override;

  // Reads the metric ID, and for one of the 30 IDs that have a handler decodes the payload,
  // converts it and stores the result. False for any other ID, or when the payload does not
  // decode; the store then keeps what it had.
  virtual bool isMetricIDValidWithMetricdict(const platform::Dictionary& metric);

  // Sees each metric the intake accepts, on the main queue, once its payload has decoded and
  // before the conversions rewrite its display dictionary: the metric ID, the payload (none
  // when the record has none) and the dictionary as decoded. Observers must not keep the
  // references, nor hand the intake another metric meanwhile.
  using AcceptedMetricObserver = std::function<void(
      std::int64_t metricID, const platform::Bytes* payload, const platform::Dictionary& decoded)>;
  void addAcceptedMetricObserver(AcceptedMetricObserver observer) {
    acceptedMetricObservers_.push_back(std::move(observer));
  }

  // Told after each metric that changed the store, in the order added, which display dictionary
  // the metric replaced; the store is converted by then. What keeps data derived from the store
  // (the graphs' series) is added by the app, so the store knows nothing of it.
  using StoreObserver =
      std::function<void(DisplayDictionary replaced, const MetricValidator& store)>;
  void addStoreObserver(StoreObserver observer) {
    storeObservers_.push_back(std::move(observer));
  }

  // "yyyy-MM-dd HH:mm:ss zzz" in the current time zone and locale; fractions of a second are
  // dropped. Empty when the time cannot be shown as a date.
  virtual std::optional<std::string> formatTimestamp(double milliseconds) const;

 private:
  MetricSession* const mySharedTarnInstance_;
  std::optional<std::int64_t> metricID_;
  DisplayStore store_;
  std::vector<AcceptedMetricObserver> acceptedMetricObservers_;
  std::vector<StoreObserver> storeObservers_;
};

}  // namespace store
