#include "dashboard/SimFiles.h"

#include <cstdint>

#include "radio/ElementaryFiles.h"
#include "radio/Iccid.h"
#include "radio/Imsi.h"

namespace dashboard {

namespace {

// The content of a file of the latest SIM file metric.
const platform::Bytes* contentOf(const store::MetricValidator& intake, std::uint32_t fileId) {
  const auto& files = intake.mySIMFileInfoDict();
  if (!files) return nullptr;
  const platform::Value* list = files->find("ef_list");
  if (list == nullptr || !list->isList()) return nullptr;
  for (const platform::Value& file : *list->asList()) {
    const platform::Dictionary* fields = file.asDictionary();
    if (fields == nullptr) continue;
    const platform::Value* id = fields->find("ef_id");
    const platform::Value* content = fields->find("content");
    if (id != nullptr && id->asInteger() == fileId && content != nullptr) return content->asBytes();
  }
  return nullptr;
}

// The SMS default alphabet (TS 23.038 6.2.1) agrees with ASCII on letters, digits, space and
// most punctuation; what it puts elsewhere shows as '?'.
char defaultAlphabetCharacter(std::uint8_t code) {
  if (code == 0x00) return '@';
  const bool sameAsAscii =
      code >= 0x20 && code <= 0x7A && code != 0x24 && code != 0x40 && (code < 0x5B || code > 0x60);
  return sameAsAscii ? static_cast<char>(code) : '?';
}

}  // namespace

std::optional<std::string> serviceProviderName(const store::MetricValidator& intake) {
  const platform::Bytes* content = contentOf(intake, radio::ef::kServiceProviderName);
  if (content == nullptr || content->size() < 2) return std::nullopt;
  if ((*content)[1] >= 0x80 && (*content)[1] <= 0x82) return std::nullopt;
  std::string name;
  for (std::size_t i = 1; i < content->size() && (*content)[i] != 0xFF; ++i)
    name += defaultAlphabetCharacter((*content)[i]);
  if (name.empty()) return std::nullopt;
  return name;
}

std::optional<platform::Dictionary> subscriberOf(const store::MetricValidator& intake) {
  platform::Dictionary subscriber;
  const platform::Bytes* imsiFile = contentOf(intake, radio::ef::kImsi);
  const auto imsi = imsiFile != nullptr ? radio::decodeEfImsi(*imsiFile) : std::nullopt;
  if (imsi) {
    subscriber.append("imsi", *imsi);
    const platform::Bytes* administrative = contentOf(intake, radio::ef::kAdministrativeData);
    const auto mncLength =
        administrative != nullptr ? radio::mncLengthFromEfAd(*administrative) : std::nullopt;
    const auto parts = radio::splitImsi(
        *imsi, mncLength.value_or(radio::usualMncLength(std::string_view(*imsi).substr(0, 3))));
    if (parts) {
      subscriber.append("mcc", parts->plmn.mcc);
      subscriber.append("mnc", parts->plmn.mnc);
      subscriber.append("msin", parts->msin);
    }
  }
  const platform::Bytes* iccidFile = contentOf(intake, radio::ef::kIccid);
  if (const auto iccid = iccidFile != nullptr ? radio::decodeEfIccid(*iccidFile) : std::nullopt)
    subscriber.append("iccid", *iccid);
  if (subscriber.empty()) return std::nullopt;
  return subscriber;
}

}  // namespace dashboard
