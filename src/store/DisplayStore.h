#pragma once

#include <array>
#include <optional>

#include "platform/Value.h"
#include "store/DisplayDictionaries.h"
#include "store/ListRecords.h"

namespace store {

// What the screens read: the latest display dictionary of each kind of metric (absent until the
// first one arrives) and the four records of row lists.
struct DisplayStore {
  LTE myLTE;
  UMTS myUMTS;
  GSM myGSM;
  Common myCommon;
  std::array<std::optional<platform::Dictionary>, kDisplayDictionaryCount> dictionaries;

  std::optional<platform::Dictionary>& operator[](DisplayDictionary which) {
    return dictionaries[static_cast<std::size_t>(which)];
  }
  const std::optional<platform::Dictionary>& operator[](DisplayDictionary which) const {
    return dictionaries[static_cast<std::size_t>(which)];
  }
};

}  // namespace store
