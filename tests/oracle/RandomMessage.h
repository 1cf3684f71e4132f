#pragma once

#include <google/protobuf/message.h>

#include <cstdint>
#include <memory>
#include <string_view>

namespace oracle {

// How much of a message, and which values, the maker draws.
enum class Fill {
  // Each field present by chance; scalars over their whole range, lists of 0..4 messages and
  // packed runs of 0..6 values.
  Sparse,
  // Every field present; scalars over their whole range, lists of 1..4 messages and packed
  // runs of 1..6 values.
  Full,
  // Every field present, lists and runs of 2..8 elements, values in the ranges a baseband
  // reports (timestamps in milliseconds, small counters, signal levels in dB).
  Realistic,
};

// A new, empty libprotobuf message of the record class `name`; nullptr when the schemas
// have no such message.
std::unique_ptr<google::protobuf::Message> newMessageNamed(std::string_view name);

// Fills `message` with values drawn from `seed`: the same seed and fill always give the same
// message. A field numbered like a metric ID stays unset in a message whose record applies the
// metric-ID tag rule, because no decoded record can hold it.
void fillRandomly(google::protobuf::Message& message, std::uint64_t seed, Fill fill);

}  // namespace oracle
