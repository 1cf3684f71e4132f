#include "fleet/DeviceSummary.h"

#include <algorithm>
#include <array>
#include <span>

#include "fleet/WireFields.h"
#include "platform/Format.h"

namespace fleet {

namespace {

// The first occurrence of the fields numbered below 16, which the summaries read.
struct Fields {
  std::array<std::optional<WireField>, 16> byNumber;

  std::optional<std::uint64_t> varint(std::uint32_t number) const {
    if (number >= byNumber.size() || !byNumber[number]) return std::nullopt;
    return byNumber[number]->varint;
  }
  std::span<const std::uint8_t> nested(std::uint32_t number) const {
    if (number >= byNumber.size() || !byNumber[number]) return {};
    return byNumber[number]->nested;
  }
};

std::optional<Fields> readFields(std::span<const std::uint8_t> record) {
  Fields fields;
  const bool read = forEachField(record, [&fields](const WireField& field) {
    if (field.number < fields.byNumber.size() && !fields.byNumber[field.number])
      fields.byNumber[field.number] = field;
  });
  if (!read) return std::nullopt;
  return fields;
}

// Field numbers of the identity of a serving cell, per technology.
struct CellFields {
  std::uint32_t mcc, mnc, mncDigits, code, cellId, channel;
  std::string_view codeName, channelName;
};

void takeCell(DeviceSummary& summary, const Fields& fields, const CellFields& numbers) {
  const auto mcc = fields.varint(numbers.mcc);
  const auto mnc = fields.varint(numbers.mnc);
  if (mcc && mnc) {
    const bool threeDigits = fields.varint(numbers.mncDigits) == 3u;
    summary.network = platform::format(threeDigits ? "%03u-%03u" : "%03u-%02u", *mcc, *mnc);
  }
  summary.cell =
      platform::format("%s %u, cell %u", numbers.codeName, fields.varint(numbers.code).value_or(0),
                       fields.varint(numbers.cellId).value_or(0));
  if (const auto channel = fields.varint(numbers.channel))
    summary.band = platform::format("%s%u", numbers.channelName, *channel);
}

// The first receive measurement's two level indexes, with each index's offset and step.
void takeLevels(DeviceSummary& summary, const Fields& fields, std::string_view format,
                double firstOffset, double secondStep, double secondOffset) {
  const std::optional<Fields> rx = readFields(fields.nested(3));
  if (!rx) return;
  const auto first = rx->varint(2);
  const auto second = rx->varint(3);
  if (!first || !second) return;
  summary.levels = platform::format(format, static_cast<double>(*first) + firstOffset,
                                    static_cast<double>(*second) * secondStep + secondOffset);
}

struct Row {
  std::uint32_t metricId;
  std::string_view technology;
  void (*take)(DeviceSummary&, const Fields&);
};

constexpr Row kRows[] = {
    {0x3C40C2, "LTE",
     [](DeviceSummary& s, const Fields& f) {
       takeCell(s, f, {11, 12, 10, 2, 7, 8, "PCI", "B"});
     }},
    {0x3CD301, "LTE",
     [](DeviceSummary& s, const Fields& f) {
       takeLevels(s, f, "RSRP %g dBm, RSRQ %g dB", -140.0, 0.5, -19.5);
     }},
    {0x3C300C, "UMTS",
     [](DeviceSummary& s, const Fields& f) {
       takeCell(s, f, {4, 5, 13, 10, 7, 9, "PSC", "UARFCN "});
     }},
    {0x3CD102, "UMTS",
     [](DeviceSummary& s, const Fields& f) {
       takeLevels(s, f, "RSCP %g dBm, Ec/No %g dB", -116.0, 0.5, -24.5);
     }},
    {0x3C2E0C, "GSM",
     [](DeviceSummary& s, const Fields& f) {
       takeCell(s, f, {4, 5, 13, 10, 7, 9, "BSIC", "ARFCN "});
     }},
    {0x3CD002, "GSM",
     [](DeviceSummary& s, const Fields& f) {
       if (const auto rxlev = f.varint(5))
         s.levels = platform::format("RxLev %d dBm", zigzag(*rxlev));
     }},
};

}  // namespace

void summarise(DeviceSummary& summary, const tarn::service::Metric& metric) {
  const auto row = std::find_if(std::begin(kRows), std::end(kRows),
                                [&metric](const Row& r) { return r.metricId == metric.metricId; });
  if (row == std::end(kRows)) return;
  const std::optional<Fields> fields = readFields(metric.payload);
  if (!fields) return;
  if (summary.technology != row->technology) {
    // Another radio: what was said of the last one no longer holds.
    summary.technology = std::string(row->technology);
    summary.cell.clear();
    summary.band.clear();
    summary.levels.clear();
  }
  row->take(summary, *fields);
}

}  // namespace fleet
