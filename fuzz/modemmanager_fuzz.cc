// Feeds arbitrary dictionaries, as ModemManager could send them, to the ModemManager source's
// reader and record encoding: any key, any D-Bus type, any value. Nothing may crash, hang or
// read out of bounds, and every record made must decode again.
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <string>
#include <string_view>
#include <utility>

#include "codec/Reader.h"
#include "messages/Metrics.h"
#include "messages/RecordClass.h"
#include "messages/Records.h"
#include "tarn/mm/Metrics.h"
#include "tarn/mm/Reading.h"
#include "tarn/mm/SimFiles.h"

namespace {

using tarn::mm::Dict;
using tarn::mm::Value;

// Takes values off the input, front to back; zeros once it runs out.
class Input {
 public:
  Input(const std::uint8_t* data, std::size_t size) : data_(data), size_(size) {}
  bool empty() const { return position_ >= size_; }
  std::uint8_t byte() { return position_ < size_ ? data_[position_++] : 0; }
  std::uint64_t bytes(std::size_t count) {
    std::uint64_t value = 0;
    for (std::size_t i = 0; i < count; ++i)
      value = value << 8 | byte();
    return value;
  }
  std::string text() {
    std::string text;
    for (std::size_t length = byte() % 24; length > 0; --length)
      text.push_back(static_cast<char>(byte()));
    return text;
  }

 private:
  const std::uint8_t* data_;
  std::size_t size_;
  std::size_t position_ = 0;
};

// The keys and property names the reader looks for, so that most entries hit one.
constexpr const char* kKeys[] = {"cell-type",
                                 "serving",
                                 "operator-id",
                                 "lac",
                                 "tac",
                                 "ci",
                                 "physical-ci",
                                 "earfcn",
                                 "uarfcn",
                                 "arfcn",
                                 "psc",
                                 "base-station-id",
                                 "rx-level",
                                 "rsrp",
                                 "rsrq",
                                 "rscp",
                                 "ecio",
                                 "rssi",
                                 "snr",
                                 "AccessTechnologies",
                                 "RegistrationState",
                                 "EpsUeModeOperation",
                                 "PacketServiceState",
                                 "Connected",
                                 "Properties",
                                 "Ip4Config",
                                 "Ip6Config",
                                 "ProfileId",
                                 "apn",
                                 "ip-type",
                                 "address",
                                 "dns1",
                                 "dns2",
                                 "SimIdentifier",
                                 "Imsi",
                                 "OperatorIdentifier",
                                 "OperatorName"};
constexpr const char* kSignatures[] = {"b",  "u",     "i", "d", "s",  "o",
                                       "ao", "a{sv}", "y", "x", "as", ""};

Dict dictionary(Input& input, int depth);

Value value(Input& input, int depth) {
  Value value{kSignatures[input.byte() % std::size(kSignatures)], {}};
  const std::string& type = value.signature;
  if (type == "b") {
    value.content = (input.byte() & 1) != 0;
  } else if (type == "u" || type == "y") {
    value.content = input.bytes(4);
  } else if (type == "i" || type == "x") {
    value.content = static_cast<std::int64_t>(static_cast<std::int32_t>(input.bytes(4)));
  } else if (type == "d") {
    const std::uint64_t bits = input.bytes(8);
    double number;
    std::memcpy(&number, &bits, sizeof number);
    // Half of them plausible numbers rather than raw bit patterns.
    value.content =
        (bits & 1) != 0 ? number : static_cast<double>(static_cast<std::int8_t>(bits >> 8)) - 60.0;
  } else if (type == "s" || type == "o") {
    value.content = input.text();
  } else if (type == "ao" || type == "as") {
    std::vector<std::string> list;
    for (std::size_t count = input.byte() % 4; count > 0; --count)
      list.push_back(input.text());
    value.content = std::move(list);
  } else if (type == "a{sv}" && depth < 3) {
    value.content = std::make_shared<const Dict>(dictionary(input, depth + 1));
  }
  return value;
}

Dict dictionary(Input& input, int depth) {
  Dict dict;
  for (std::size_t count = input.byte() % 12; count > 0 && !input.empty(); --count) {
    const std::uint8_t pick = input.byte();
    std::string key = pick < 240 ? kKeys[pick % std::size(kKeys)] : input.text();
    dict.insert_or_assign(std::move(key), value(input, depth));
  }
  return dict;
}

[[noreturn]] void fail(std::uint32_t metricId, const char* what) {
  std::fprintf(stderr, "metric %X: %s\n", metricId, what);
  std::abort();
}

// The metric's payload decodes with its record class and encodes back to the same bytes.
void mustDecode(const tarn::service::Metric& metric) {
  for (const messages::MetricKind& kind : messages::kMetricKinds) {
    if (kind.metricID != metric.metricId || kind.recordClass.empty()) continue;
    const auto record = messages::recordClassNamed(kind.recordClass)->create();
    codec::Reader reader(metric.payload);
    if (!record->readFrom(reader)) fail(metric.metricId, "does not decode");
    if (record->data() != metric.payload) fail(metric.metricId, "encodes to other bytes");
    return;
  }
  fail(metric.metricId, "is not a metric a record carries");
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  Input input(data, size);
  tarn::mm::Problems problems;
  tarn::mm::Snapshot snapshot;
  for (std::size_t cells = input.byte() % 6; cells > 0; --cells) {
    if (auto cell = tarn::mm::readCell(dictionary(input, 0), "cell", problems))
      snapshot.cells.push_back(std::move(*cell));
  }
  snapshot.lte = tarn::mm::readLteSignal(dictionary(input, 0), problems);
  snapshot.umts = tarn::mm::readUmtsSignal(dictionary(input, 0), problems);
  snapshot.gsm = tarn::mm::readGsmSignal(dictionary(input, 0), problems);
  snapshot.registration =
      tarn::mm::readRegistration(dictionary(input, 0), dictionary(input, 0), problems);
  std::vector<tarn::mm::Bearer> bearers;
  if (auto bearer = tarn::mm::readBearer(dictionary(input, 0), "bearer", problems))
    bearers.push_back(std::move(*bearer));
  const tarn::mm::Sim sim = tarn::mm::readSim(dictionary(input, 0), problems);

  for (const tarn::service::Metric& metric : tarn::mm::radioMetrics(snapshot, 0, problems))
    mustDecode(metric);
  mustDecode(tarn::mm::bearerMetric(bearers, 0));
  if (auto files = tarn::mm::simFilesMetric(sim, 0)) mustDecode(*files);
  if (auto common = tarn::mm::mmCommonInfoMetric(sim, 0)) mustDecode(*common);
  return 0;
}
