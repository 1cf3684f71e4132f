#include "tarn/client/Drops.h"

#include <mutex>

namespace tarn::client {

namespace {

struct Tally {
  std::mutex mutex;
  std::map<std::uint64_t, std::uint64_t> byKind;

  static Tally& instance() {
    static Tally* const tally = new Tally;  // sessions may drop events while the process exits
    return *tally;
  }
};

}  // namespace

std::map<std::uint64_t, std::uint64_t> droppedEvents() {
  Tally& tally = Tally::instance();
  const std::lock_guard lock(tally.mutex);
  return tally.byKind;
}

void countDroppedEvent(std::uint64_t kind) {
  Tally& tally = Tally::instance();
  const std::lock_guard lock(tally.mutex);
  ++tally.byKind[kind];
}

}  // namespace tarn::client
