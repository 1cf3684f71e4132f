#include "store/ListRecords.h"

#include <initializer_list>
#include <string_view>

namespace store {

namespace {

platform::Dictionary withEmptyTexts(std::initializer_list<std::string_view> keys) {
  platform::Dictionary dictionary;
  dictionary.reserve(keys.size());
  for (const std::string_view key : keys)
    dictionary.append(std::string(key), "");
  return dictionary;
}

}  // namespace

platform::Dictionary placeholderRow() {
  return {{std::string(kWaitingForUpdate), kWaitingForUpdate}};
}

platform::List placeholderList() {
  return {placeholderRow()};
}

platform::Dictionary LTE::reselectionKeys() {
  return withEmptyTexts({"timestamp",
                         "ims_emergency_support",
                         "ac_barring_for_emergency",
                         "mo_signalling_ac_barring_factor",
                         "mo_signalling_ac_barring_time",
                         "mo_signalling_ac_barring_for_special_ac",
                         "mo_data_ac_barring_factor",
                         "mo_data_ac_barring_time",
                         "mo_data_ac_barring_for_special_ac",
                         "QRxLevMin",
                         "QQualMin",
                         "Q_hyst",
                         "S_non_intra_search_P",
                         "S_non_intra_search_Q",
                         "S_intra_search_P",
                         "S_intra_search_Q",
                         "Thresh_serving_lowP",
                         "Thresh_serving_lowQ",
                         "priority_operating_freq",
                         "multi_band_info"});
}

platform::Dictionary UMTS::reselectionKeys() {
  return withEmptyTexts({"timestamp", "ims_emergency_support", "hsdpa_capable", "edch_capable",
                         "duplex_mode", "cell_barred", "fach_meas_occ_info_present", "s_rxlev",
                         "s_qual", "s_intrasearch", "s_intersearch", "s_search_rat", "s_cell_prio",
                         "multi_band_info"});
}

}  // namespace store
