#include "store/EntryRules.h"

#include <algorithm>
#include <cstdint>
#include <type_traits>
#include <variant>

#include "store/BandwidthTable.h"

namespace store {

namespace {

using platform::Value;

bool isInteger(const Value& value) {
  return value.kind() >= Value::Kind::Int32 && value.kind() <= Value::Kind::UInt64;
}

// Any number, rounded to the nearest double where it has no exact one.
std::optional<double> numberOf(const Value& value) {
  return value.visit([](const auto& stored) -> std::optional<double> {
    using Stored = std::decay_t<decltype(stored)>;
    if constexpr (std::is_arithmetic_v<Stored>) {
      return static_cast<double>(stored);
    } else {
      return std::nullopt;
    }
  });
}

std::optional<Value> offsetIndex(const Value& entry, std::int64_t offset) {
  const std::optional<std::int64_t> index = entry.asInteger();
  std::int64_t result = 0;
  if (!index || __builtin_sub_overflow(*index, offset, &result)) return std::nullopt;
  return Value(result);
}

// Reads the entry as a 32-bit float and answers formula(value) in that precision.
template <class Formula>
std::optional<Value> floatResult(const Value& entry, Formula formula) {
  const std::optional<double> number = numberOf(entry);
  if (!number) return std::nullopt;
  return Value(static_cast<float>(formula(static_cast<double>(static_cast<float>(*number)))));
}

}  // namespace

std::optional<Value> convertValue(EntryRule rule, const Value& entry,
                                  const TimestampFormatter& formatTimestamp) {
  switch (rule) {
    case EntryRule::CentiDbInteger:
      if (const auto level = entry.asInteger()) return Value(*level / 100);
      return std::nullopt;
    case EntryRule::CentiDbFloat:
      return floatResult(entry, [](double level) { return level / 100.0; });
    case EntryRule::RsrpIndex:
      return offsetIndex(entry, 140);
    case EntryRule::RsrqIndex:
      return floatResult(entry, [](double index) { return index * 0.5 - 19.5; });
    case EntryRule::RscpIndex:
      return offsetIndex(entry, 116);
    case EntryRule::EcNoIndex:
      return floatResult(entry, [](double index) { return index * 0.5 - 24.5; });
    case EntryRule::RxLevIndex:
      return offsetIndex(entry, 110);
    case EntryRule::SinrHalfDb:
      return floatResult(entry, [](double sinr) { return sinr * 0.5; });
    case EntryRule::BandwidthCode: {
      // Codes are read as 32-bit integers; anything else is not a code and stays as it is.
      const std::optional<std::int32_t> code = entry.asInt32();
      if (!code) return std::nullopt;
      const auto& table = downlinkBandwidthMHz();
      const auto found = table.find(*code);
      return found == table.end() ? Value() : Value(found->second);
    }
    case EntryRule::HalvedBandwidth:
      if (const auto bandwidth = entry.asInt32()) return Value(*bandwidth / 2);
      return std::nullopt;
    case EntryRule::TimestampText: {
      const std::optional<double> milliseconds = numberOf(entry);
      if (!milliseconds) return std::nullopt;
      if (std::optional<std::string> text = formatTimestamp(*milliseconds)) {
        return Value(std::move(*text));
      }
      return std::nullopt;
    }
  }
  return std::nullopt;
}

void convertEntry(platform::Dictionary& dictionary, EntryConversion conversion,
                  const TimestampFormatter& formatTimestamp) {
  Value* entry = dictionary.find(conversion.key);
  if (entry == nullptr) return;
  std::optional<Value> result = convertValue(conversion.rule, *entry, formatTimestamp);
  if (!result) return;
  if (result->isNull()) {
    dictionary.erase(conversion.key);
  } else {
    *entry = std::move(*result);
  }
}

bool hasShape(const platform::Value& value, ValueShape shape) {
  const auto allOf = [&value](bool (*accepts)(const Value&)) {
    const platform::List* list = value.asList();
    return list != nullptr && std::all_of(list->begin(), list->end(), accepts);
  };
  switch (shape) {
    case ValueShape::IntegerList:
      return allOf(isInteger);
    case ValueShape::Dictionary:
      return value.isDictionary();
    case ValueShape::DictionaryList:
      return allOf([](const Value& element) { return element.isDictionary(); });
  }
  return false;
}

}  // namespace store
