#include "tarn/mm/SimFiles.h"

#include <algorithm>
#include <memory>

#include "messages/Metrics.h"
#include "messages/Records.h"
#include "radio/ElementaryFiles.h"
#include "radio/Iccid.h"
#include "radio/Imsi.h"

namespace tarn::mm {
namespace {

constexpr std::size_t kSpnNameBytes = 16;

// The characters that the GSM default alphabet codes as ASCII does.
bool gsmAsAscii(char c) {
  return (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z') || (c >= '0' && c <= '9') ||
         std::string_view(" !\"#%&'()*+,-./:;<=>?").find(c) != std::string_view::npos;
}

}  // namespace

std::optional<platform::Bytes> encodeEfSpn(std::string_view name) {
  if (name.size() > kSpnNameBytes || !std::all_of(name.begin(), name.end(), gsmAsAscii))
    return std::nullopt;
  platform::Bytes content(1 + kSpnNameBytes, 0xFF);
  content[0] = 0;
  std::copy(name.begin(), name.end(), content.begin() + 1);
  return content;
}

std::optional<service::Metric> simFilesMetric(const Sim& sim, std::uint64_t atMs) {
  messages::KCellularSimCardFiles record;
  record.setTimestamp(atMs);
  const auto add = [&record](std::uint32_t id, std::optional<platform::Bytes> content) {
    if (!content) return;
    auto file = std::make_shared<messages::ElementaryFile>();
    file->setEfId(id);
    file->setContent(std::move(content));
    record.addEfList(std::move(file));
  };
  if (sim.iccid) add(radio::ef::kIccid, radio::encodeEfIccid(*sim.iccid));
  if (sim.imsi) add(radio::ef::kImsi, radio::encodeEfImsi(*sim.imsi));
  if (sim.serviceProvider) add(radio::ef::kServiceProviderName, encodeEfSpn(*sim.serviceProvider));
  if (record.efListsCount() == 0) return std::nullopt;
  return service::Metric{messages::metric::KCellularSimCardFiles, record.data()};
}

std::optional<service::Metric> mmCommonInfoMetric(const Sim& sim, std::uint64_t atMs) {
  if (!sim.imsi) return std::nullopt;
  std::optional<platform::Bytes> imsi = radio::encodeEfImsi(*sim.imsi);
  if (!imsi) return std::nullopt;
  messages::KCellularMmCommonInfo record;
  record.setTimestamp(atMs);
  record.setImsi(std::move(imsi));
  return service::Metric{messages::metric::KCellularMmCommonInfo, record.data()};
}

}  // namespace tarn::mm
