#pragma once

#include <array>
#include <atomic>
#include <memory>
#include <optional>

#include "platform/Value.h"
#include "store/DisplayDictionaries.h"
#include "store/ListRecords.h"

namespace store {

// A display dictionary as the store keeps it: shared, so that a log line made on another thread
// can still read it after the store has moved on. Once shared it is never changed; whoever would
// change it makes its own copy (see mutableDictionary).
using StoredDictionary = std::shared_ptr<std::optional<platform::Dictionary>>;

// What the screens read: the latest display dictionary of each kind of metric (absent until the
// first one arrives) and the four records of row lists.
struct DisplayStore {
  LTE myLTE;
  UMTS myUMTS;
  GSM myGSM;
  Common myCommon;
  // Never null: an absent dictionary is an empty optional.
  std::array<StoredDictionary, kDisplayDictionaryCount> dictionaries = absentDictionaries();

  StoredDictionary& slot(DisplayDictionary which) {
    return dictionaries[static_cast<std::size_t>(which)];
  }
  const std::optional<platform::Dictionary>& operator[](DisplayDictionary which) const {
    return *dictionaries[static_cast<std::size_t>(which)];
  }
  void replace(DisplayDictionary which, std::optional<platform::Dictionary> dictionary) {
    slot(which) = std::make_shared<std::optional<platform::Dictionary>>(std::move(dictionary));
  }

 private:
  static std::array<StoredDictionary, kDisplayDictionaryCount> absentDictionaries() {
    static const StoredDictionary absent = std::make_shared<std::optional<platform::Dictionary>>();
    std::array<StoredDictionary, kDisplayDictionaryCount> all;
    all.fill(absent);
    return all;
  }
};

// The stored dictionary, ready to be changed: copied first when anyone else holds it.
inline platform::Dictionary& mutableDictionary(StoredDictionary& stored) {
  if (stored.use_count() > 1) {
    stored = std::make_shared<std::optional<platform::Dictionary>>(*stored);
  } else {
    // The last other holder let go after reading it: its reads come before our writes.
    std::atomic_thread_fence(std::memory_order_acquire);
  }
  return **stored;
}

}  // namespace store
