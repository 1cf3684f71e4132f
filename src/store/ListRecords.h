#pragma once

#include "platform/Value.h"

// The four records of row lists that the store keeps per radio technology. They are values:
// copying one copies its lists. Field names are those the screens look them up by.
namespace store {

inline constexpr std::string_view kWaitingForUpdate = "Waiting for Update";

// {"Waiting for Update": "Waiting for Update"}: the one row of a list that has had no metric yet.
platform::Dictionary placeholderRow();
// A row list holding only the placeholder row.
platform::List placeholderList();

struct LTE {
  // The 20 reselection keys, each with the empty text until a reselection metric carries it.
  platform::Dictionary SelReselCellInfo = reselectionKeys();
  platform::List EutraNbrs = placeholderList();
  platform::List RsrpRsrqSinr = placeholderList();
  platform::List TxPower = placeholderList();
  platform::List EutraNbrsMeas = placeholderList();
  platform::List UtraNbrsMeas = placeholderList();
  platform::List GeraNbrsMeas = placeholderList();
  platform::List CAStatusList = placeholderList();
  platform::List SecondaryCellMeasList = placeholderList();
  platform::List MMCommonInfo = placeholderList();
  platform::Value IMSI = "Come Back Later";

  static platform::Dictionary reselectionKeys();
  bool operator==(const LTE&) const = default;
};

struct UMTS {
  platform::List rXInfo = placeholderList();
  platform::List TxPower = placeholderList();
  // The 14 reselection keys, each with the empty text until a reselection metric carries it.
  platform::Dictionary SelReselCellInfo = reselectionKeys();
  platform::List eUtraNbrs = placeholderList();
  platform::List utraNbrs = placeholderList();
  platform::List geraNbrs = placeholderList();
  platform::List eUtraNbrMeas = placeholderList();
  platform::List utraNbrMeas = placeholderList();
  platform::List geraNbrMeas = placeholderList();

  static platform::Dictionary reselectionKeys();
  bool operator==(const UMTS&) const = default;
};

struct GSM {
  platform::List eUtraNbrMeas = placeholderList();
  platform::List utraNbrMeas = placeholderList();
  platform::List geraNbrMeas = placeholderList();

  bool operator==(const GSM&) const = default;
};

struct Common {
  platform::List activeBearer = placeholderList();
  platform::List simContents = placeholderList();

  bool operator==(const Common&) const = default;
};

}  // namespace store
