#include "tarn/sim/SimFiles.h"

#include <algorithm>
#include <string_view>
#include <utility>
#include <vector>

#include "messages/Metrics.h"
#include "messages/Records.h"

namespace tarn::sim {
namespace {

using platform::Bytes;

constexpr std::string_view kServiceProviderName = "Test Network";

void append(Bytes& bytes, const Bytes& more) {
  bytes.insert(bytes.end(), more.begin(), more.end());
}

void appendBigEndian(Bytes& bytes, std::uint32_t value, int size) {
  for (int shift = 8 * (size - 1); shift >= 0; shift -= 8) {
    bytes.push_back(static_cast<std::uint8_t>(value >> shift));
  }
}

// Display condition, then the name in the default alphabet, padded with FF to 16 characters.
Bytes serviceProviderName() {
  Bytes bytes(17, 0xFF);
  bytes[0] = 0x01;
  std::copy(kServiceProviderName.begin(), kServiceProviderName.end(), bytes.begin() + 1);
  return bytes;
}

// The access class is the last digit of the IMSI, one bit of the second byte for classes 0-7.
Bytes accessControlClass(const Subscriber& subscriber) {
  const int accessClass = subscriber.imsi.back() - '0';
  return {static_cast<std::uint8_t>(accessClass >= 8 ? 1 << (accessClass - 8) : 0),
          static_cast<std::uint8_t>(accessClass < 8 ? 1 << accessClass : 0)};
}

// TMSI, location area identity, a reserved byte and the update status (0 = updated).
Bytes location(const Plmn& plmn, const NasState& nas) {
  const bool updated = nas.lac != 0;
  Bytes bytes;
  appendBigEndian(bytes, updated ? nas.tmsi : 0xFFFFFFFF, 4);
  append(bytes, identity::encodePlmn(plmn));
  appendBigEndian(bytes, updated ? nas.lac : 0xFFFE, 2);
  bytes.push_back(0xFF);
  bytes.push_back(updated ? 0x00 : 0x01);
  return bytes;
}

// P-TMSI, its signature, the routing area identity and the update status.
Bytes psLocation(const Plmn& plmn, const NasState& nas) {
  const bool updated = nas.rac != 0;
  Bytes bytes;
  appendBigEndian(bytes, updated ? nas.pTmsi : 0xFFFFFFFF, 4);
  appendBigEndian(bytes, updated ? (nas.pTmsi * 2654435761u) >> 8 : 0xFFFFFF, 3);
  append(bytes, identity::encodePlmn(plmn));
  appendBigEndian(bytes, updated ? nas.routingLac : 0xFFFE, 2);
  bytes.push_back(static_cast<std::uint8_t>(updated ? nas.rac : 0xFF));
  bytes.push_back(updated ? 0x00 : 0x01);
  return bytes;
}

// The GUTI as an EPS mobile identity, the last visited tracking area and the update status.
Bytes epsLocation(const Plmn& plmn, const NasState& nas) {
  const bool updated = nas.guti.mTmsi != 0;
  Bytes bytes = {0x0B, 0xF6};
  append(bytes, identity::encodePlmn(plmn));
  appendBigEndian(bytes, nas.guti.mmegi, 2);
  appendBigEndian(bytes, nas.guti.mmec, 1);
  appendBigEndian(bytes, nas.guti.mTmsi, 4);
  if (!updated) bytes = Bytes(12, 0xFF);
  append(bytes, identity::encodePlmn(plmn));
  appendBigEndian(bytes, updated ? nas.lastTac : 0xFFFE, 2);
  bytes.push_back(updated ? 0x00 : 0x01);
  return bytes;
}

}  // namespace

service::Metric simFiles(const Network& network, const Subscriber& subscriber, const NasState& nas,
                         std::uint64_t atMs) {
  const Plmn& plmn = network.plmn;
  const std::vector<std::pair<std::uint32_t, Bytes>> files = {
      {ef::kIccid, identity::encodeSwappedBcd(subscriber.iccid, 10)},
      {ef::kPreferredLanguages, {'e', 'n', 0xFF, 0xFF, 0xFF, 0xFF, 0xFF, 0xFF}},
      {ef::kImsi, identity::encodeImsi(subscriber.imsi)},
      {ef::kHplmnSearchPeriod, {0x0A}},  // every 60 minutes
      {ef::kServiceProviderName, serviceProviderName()},
      {ef::kPsLocation, psLocation(plmn, nas)},
      {ef::kAccessControlClass, accessControlClass(subscriber)},
      {ef::kForbiddenPlmns, Bytes(12, 0xFF)},
      {ef::kLocation, location(plmn, nas)},
      {ef::kAdministrativeData, {0x00, 0x00, 0x00, static_cast<std::uint8_t>(plmn.mncDigits)}},
      {ef::kEpsLocation, epsLocation(plmn, nas)},
  };
  messages::KCellularSimCardFiles record;
  record.setTimestamp(atMs);
  for (const auto& [id, content] : files) {
    auto file = std::make_shared<messages::ElementaryFile>();
    file->setEfId(id);
    file->setContent(content);
    record.addEfList(file);
  }
  return {messages::metric::KCellularSimCardFiles, record.data()};
}

}  // namespace tarn::sim
