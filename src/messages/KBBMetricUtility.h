#pragma once

#include <array>
#include <cstdint>
#include <string_view>
#include <typeinfo>

namespace messages {

// The baseband's metric IDs, by tag number, with the message each names.
//
// Metric IDs double as field numbers: a field numbered like one of them is a
// metric-ID tag, consumed and logged by every record's decoder instead of
// being stored (see the records' readFrom).
class KBBMetricUtility {
 public:
  struct Entry {
    std::uint16_t metricId;
    std::string_view messageName;
  };

  // The 31 metric IDs in their stored order.
  static const std::array<Entry, 31>& metricIdTable();

  // True when `tag` is one of the metric IDs, whatever the record class;
  // logs "valid metricId tag" when it is. Runs on every decoded field.
  static bool isValidMetricIdTag(std::uint16_t tag, const std::type_info& recordClass) {
    (void)recordClass;
    if ((kTagBits[tag >> 6] >> (tag & 63) & 1) == 0) return false;
    logValidTag();
    return true;
  }

 private:
  static const std::array<std::uint64_t, 1024> kTagBits;
  static void logValidTag();
};

}  // namespace messages
