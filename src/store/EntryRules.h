#pragma once

#include <functional>
#include <optional>
#include <string>
#include <string_view>

#include "platform/Value.h"

// The rewrites that turn raw record entries into what an engineer reads: measurement indexes
// into dBm and dB, bandwidth codes into MHz, millisecond counts into local date text, and
// nested values into their text form.
namespace store {

// The date text of a millisecond count since 1970; empty when it cannot be shown as a date.
using TimestampFormatter = std::function<std::optional<std::string>(double milliseconds)>;

enum class EntryRule {
  CentiDbInteger,   // integer: value / 100, truncated toward zero
  CentiDbFloat,     // 32-bit float: value / 100.0
  RsrpIndex,        // integer: value - 140
  RsrqIndex,        // 32-bit float: value * 0.5 - 19.5
  RscpIndex,        // integer: value - 116
  EcNoIndex,        // 32-bit float: value * 0.5 - 24.5
  RxLevIndex,       // integer: value - 110
  SinrHalfDb,       // 32-bit float: value * 0.5
  BandwidthCode,    // integer code: MHz from the downlink bandwidth table; other codes drop it
  HalvedBandwidth,  // 32-bit integer: value / 2, truncated toward zero
  TimestampText,    // number of milliseconds since 1970: its date text
};

struct EntryConversion {
  std::string_view key;
  EntryRule rule;
};

// Rewrites the entry under conversion.key by its rule. An entry that is missing, or that is not
// of the type the rule reads, stays as it is; so does one whose result would not fit.
void convertEntry(platform::Dictionary& dictionary, EntryConversion conversion,
                  const TimestampFormatter& formatTimestamp);

// The result of the rule on one value: the new value, Null when the rule drops the entry, or
// nothing when the value is not of the type the rule reads.
std::optional<platform::Value> convertValue(EntryRule rule, const platform::Value& value,
                                            const TimestampFormatter& formatTimestamp);

enum class ValueShape {
  IntegerList,     // a list whose elements are all integers
  Dictionary,      // a dictionary
  DictionaryList,  // a list whose elements are all dictionaries
};

bool hasShape(const platform::Value& value, ValueShape shape);

}  // namespace store
