#pragma once

#include <cstdint>
#include <map>

// What the sessions of this process could not keep up with.
namespace tarn::client {

// The events that sessions dropped since the process started because they fell behind, by kind:
// metric ID, or 0 for events that are no metric.
std::map<std::uint64_t, std::uint64_t> droppedEvents();

// Counts one dropped event of `kind`. Any thread.
void countDroppedEvent(std::uint64_t kind);

}  // namespace tarn::client
