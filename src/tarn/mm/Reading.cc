#include "tarn/mm/Reading.h"

#include <ModemManager.h>
#include <arpa/inet.h>

#include <algorithm>
#include <cmath>

#include "tarn/mm/Names.h"

namespace tarn::mm {
namespace {

// What a receiver can plausibly report; anything beyond is a broken value.
struct Range {
  double low, high;
};
constexpr Range kRsrp{-156.0, -31.0};
constexpr Range kRsrq{-34.0, 3.0};
constexpr Range kSnr{-50.0, 60.0};
constexpr Range kRssi{-150.0, 0.0};
constexpr Range kRscp{-130.0, 0.0};
constexpr Range kEcio{-40.0, 0.0};

constexpr std::uint32_t kMaxPci = 503;
constexpr std::uint32_t kMaxPsc = 511;
constexpr std::uint32_t kMaxBsic = 63;
constexpr std::uint32_t kMaxRxLevel = 63;
constexpr std::uint32_t kMaxChannel = 262143;  // the largest EARFCN
constexpr std::uint32_t kMaxLac = 0xFFFF;
constexpr std::uint32_t kMaxTac = 0xFFFFFF;
constexpr std::uint32_t kMaxCellId = 0xFFFFFFF;  // 28 bits

std::optional<double> real(const Reader& reader, std::string_view key, Range range) {
  return reader.real(key, range.low, range.high);
}

std::optional<Plmn> plmn(const Reader& reader, std::string_view key) {
  const std::optional<std::string> digits = reader.text(key);
  if (!digits) return std::nullopt;
  std::optional<Plmn> parsed = parsePlmn(*digits);
  if (!parsed) {
    reader.problems().push_back(reader.where() + " \"" + std::string(key) + "\": \"" + *digits +
                                "\" is not an MCC and MNC; dropped");
  }
  return parsed;
}

// An address in its text form, as 4 or 16 bytes.
std::optional<platform::Bytes> address(const Reader& reader, std::string_view key) {
  const std::optional<std::string> text = reader.text(key);
  if (!text) return std::nullopt;
  platform::Bytes bytes(16);
  if (::inet_pton(AF_INET, text->c_str(), bytes.data()) == 1) {
    bytes.resize(4);
    return bytes;
  }
  if (::inet_pton(AF_INET6, text->c_str(), bytes.data()) == 1) return bytes;
  reader.problems().push_back(reader.where() + " \"" + std::string(key) + "\": \"" + *text +
                              "\" is not an IP address; dropped");
  return std::nullopt;
}

void readIpConfig(const Reader& bearer, std::string_view key, Bearer& into,
                  std::optional<platform::Bytes> Bearer::*address_) {
  const Dict* config = bearer.dictionary(key);
  if (config == nullptr) return;
  const Reader reader(*config, bearer.where() + " " + std::string(key), bearer.problems());
  into.*address_ = address(reader, "address");
  for (const std::string_view dns : {"dns1", "dns2", "dns3"}) {
    if (std::optional<platform::Bytes> server = address(reader, dns))
      into.dns.push_back(std::move(*server));
  }
}

}  // namespace

std::optional<Plmn> parsePlmn(std::string_view digits) {
  if (digits.size() != 5 && digits.size() != 6) return std::nullopt;
  if (!std::all_of(digits.begin(), digits.end(), [](char c) { return c >= '0' && c <= '9'; }))
    return std::nullopt;
  const auto number = [](std::string_view part) {
    std::uint32_t value = 0;
    for (const char c : part)
      value = value * 10 + static_cast<std::uint32_t>(c - '0');
    return value;
  };
  return Plmn{.mcc = number(digits.substr(0, 3)),
              .mnc = number(digits.substr(3)),
              .mncDigits = static_cast<std::uint32_t>(digits.size() - 3),
              .digits = std::string(digits)};
}

std::optional<Cell> readCell(const Dict& dict, std::string where, Problems& problems) {
  const Reader reader(dict, std::move(where), problems);
  const std::optional<std::uint32_t> type = reader.unsignedInt(cell_key::kType, UINT32_MAX);
  const std::optional<bool> serving = reader.boolean(cell_key::kServing);
  if (!type || !serving) return std::nullopt;
  Cell cell;
  cell.serving = *serving;
  cell.plmn = plmn(reader, cell_key::kOperatorId);
  cell.cellId = reader.hex(cell_key::kCi, kMaxCellId);
  switch (*type) {
    case MM_CELL_TYPE_LTE:
      cell.rat = Rat::Lte;
      cell.tac = reader.hex(cell_key::kTac, kMaxTac);
      cell.pci = reader.hex(cell_key::kPhysicalCi, kMaxPci);
      cell.channel = reader.unsignedInt(cell_key::kEarfcn, kMaxChannel);
      cell.rsrp = real(reader, cell_key::kRsrp, kRsrp);
      cell.rsrq = real(reader, cell_key::kRsrq, kRsrq);
      return cell;
    case MM_CELL_TYPE_UMTS:
      cell.rat = Rat::Umts;
      cell.lac = reader.hex(cell_key::kLac, kMaxLac);
      cell.channel = reader.unsignedInt(cell_key::kUarfcn, kMaxChannel);
      cell.psc = reader.unsignedInt(cell_key::kPsc, kMaxPsc);
      cell.rscp = real(reader, cell_key::kRscp, kRscp);
      cell.ecio = real(reader, cell_key::kEcio, kEcio);
      return cell;
    case MM_CELL_TYPE_GSM:
      cell.rat = Rat::Gsm;
      cell.lac = reader.hex(cell_key::kLac, kMaxLac);
      cell.channel = reader.unsignedInt(cell_key::kArfcn, kMaxChannel);
      cell.bsic = reader.hex(cell_key::kBaseStationId, kMaxBsic);
      cell.rxLevel = reader.unsignedInt(cell_key::kRxLevel, kMaxRxLevel);
      return cell;
    default:
      return std::nullopt;
  }
}

LteSignal readLteSignal(const Dict& dict, Problems& problems) {
  const Reader reader(dict, "Signal.Lte", problems);
  return {.rssi = real(reader, signal_key::kRssi, kRssi),
          .rsrp = real(reader, signal_key::kRsrp, kRsrp),
          .rsrq = real(reader, signal_key::kRsrq, kRsrq),
          .snr = real(reader, signal_key::kSnr, kSnr)};
}

UmtsSignal readUmtsSignal(const Dict& dict, Problems& problems) {
  const Reader reader(dict, "Signal.Umts", problems);
  return {.rssi = real(reader, signal_key::kRssi, kRssi),
          .rscp = real(reader, signal_key::kRscp, kRscp),
          .ecio = real(reader, signal_key::kEcio, kEcio)};
}

GsmSignal readGsmSignal(const Dict& dict, Problems& problems) {
  const Reader reader(dict, "Signal.Gsm", problems);
  return {.rssi = real(reader, signal_key::kRssi, kRssi)};
}

Registration readRegistration(const Dict& modem, const Dict& modem3gpp, Problems& problems) {
  const Reader fromModem(modem, "Modem", problems);
  const Reader from3gpp(modem3gpp, "Modem3gpp", problems);
  Registration registration{
      .accessTechnologies = fromModem.unsignedInt(property::kAccessTechnologies, UINT32_MAX),
      .state = from3gpp.unsignedInt(property::kRegistrationState,
                                    MM_MODEM_3GPP_REGISTRATION_STATE_ATTACHED_RLOS),
      .epsUeMode = from3gpp.unsignedInt(property::kEpsUeModeOperation,
                                        MM_MODEM_3GPP_EPS_UE_MODE_OPERATION_CSPS_2),
      .packetService = from3gpp.unsignedInt(property::kPacketServiceState,
                                            MM_MODEM_3GPP_PACKET_SERVICE_STATE_ATTACHED),
      .operatorPlmn = plmn(from3gpp, property::kOperatorCode),
  };
  // ModemManager documents these zeros as "unknown".
  if (registration.state == MM_MODEM_3GPP_REGISTRATION_STATE_UNKNOWN) registration.state.reset();
  if (registration.epsUeMode == MM_MODEM_3GPP_EPS_UE_MODE_OPERATION_UNKNOWN)
    registration.epsUeMode.reset();
  if (registration.packetService == MM_MODEM_3GPP_PACKET_SERVICE_STATE_UNKNOWN)
    registration.packetService.reset();
  if (registration.accessTechnologies == MM_MODEM_ACCESS_TECHNOLOGY_UNKNOWN)
    registration.accessTechnologies.reset();
  return registration;
}

std::optional<Bearer> readBearer(const Dict& dict, std::string where, Problems& problems) {
  const Reader reader(dict, std::move(where), problems);
  if (reader.boolean(property::kConnected) != true) return std::nullopt;
  Bearer bearer;
  if (const Dict* properties = reader.dictionary(property::kBearerProperties)) {
    const Reader settings(*properties, reader.where() + " Properties", problems);
    bearer.apn = settings.text(bearer_key::kApn);
    bearer.ipFamily = settings.unsignedInt(bearer_key::kIpType, UINT32_MAX);
  }
  bearer.profileId = reader.signedInt(property::kProfileId);
  // ModemManager reports -1 when the profile is not known.
  if (bearer.profileId < 0) bearer.profileId.reset();
  readIpConfig(reader, property::kIp4Config, bearer, &Bearer::ip4);
  readIpConfig(reader, property::kIp6Config, bearer, &Bearer::ip6);
  return bearer;
}

Sim readSim(const Dict& dict, Problems& problems) {
  const Reader reader(dict, "Sim", problems);
  return {.iccid = reader.text(property::kSimIdentifier),
          .imsi = reader.text(property::kImsi),
          .operatorId = reader.text(property::kOperatorIdentifier),
          .serviceProvider = reader.text(property::kOperatorName)};
}

}  // namespace tarn::mm
