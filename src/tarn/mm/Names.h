#pragma once

#include <ModemManager.h>

#include <string_view>

// ModemManager's D-Bus names that the source uses. The interface, path and error names come from
// ModemManager's own headers; member and key names are those of its introspection XML, against
// which a test checks kMembersUsed.
namespace tarn::mm {

inline constexpr std::string_view kService = MM_DBUS_SERVICE;
inline constexpr std::string_view kRootPath = MM_DBUS_PATH;
inline constexpr std::string_view kModemPathPrefix = MM_DBUS_MODEM_PREFIX "/";

inline constexpr std::string_view kModemInterface = MM_DBUS_INTERFACE_MODEM;
inline constexpr std::string_view kModem3gppInterface = MM_DBUS_INTERFACE_MODEM_MODEM3GPP;
inline constexpr std::string_view kSignalInterface = MM_DBUS_INTERFACE_MODEM_SIGNAL;
inline constexpr std::string_view kBearerInterface = MM_DBUS_INTERFACE_BEARER;
inline constexpr std::string_view kSimInterface = MM_DBUS_INTERFACE_SIM;

inline constexpr std::string_view kPropertiesInterface = "org.freedesktop.DBus.Properties";
inline constexpr std::string_view kObjectManagerInterface = "org.freedesktop.DBus.ObjectManager";

// What ModemManager answers when polkit does not grant an action.
inline constexpr std::string_view kUnauthorizedError = MM_CORE_ERROR_DBUS_PREFIX ".Unauthorized";
// The polkit action that Signal.Setup and GetCellInfo need.
inline constexpr std::string_view kDeviceControlAction =
    "org.freedesktop.ModemManager1.Device.Control";

namespace method {
inline constexpr std::string_view kSetup = "Setup";
inline constexpr std::string_view kGetCellInfo = "GetCellInfo";
}  // namespace method

namespace property {
// Modem
inline constexpr std::string_view kState = "State";
inline constexpr std::string_view kAccessTechnologies = "AccessTechnologies";
inline constexpr std::string_view kEquipmentIdentifier = "EquipmentIdentifier";
inline constexpr std::string_view kBearers = "Bearers";
inline constexpr std::string_view kSim = "Sim";
inline constexpr std::string_view kModel = "Model";
// Modem3gpp
inline constexpr std::string_view kImei = "Imei";
inline constexpr std::string_view kRegistrationState = "RegistrationState";
inline constexpr std::string_view kOperatorCode = "OperatorCode";
inline constexpr std::string_view kEpsUeModeOperation = "EpsUeModeOperation";
inline constexpr std::string_view kPacketServiceState = "PacketServiceState";
inline constexpr std::string_view kInitialEpsBearer = "InitialEpsBearer";
// Signal
inline constexpr std::string_view kLte = "Lte";
inline constexpr std::string_view kUmts = "Umts";
inline constexpr std::string_view kGsm = "Gsm";
// Bearer
inline constexpr std::string_view kConnected = "Connected";
inline constexpr std::string_view kIp4Config = "Ip4Config";
inline constexpr std::string_view kIp6Config = "Ip6Config";
inline constexpr std::string_view kProfileId = "ProfileId";
inline constexpr std::string_view kBearerProperties = "Properties";
// Sim
inline constexpr std::string_view kSimIdentifier = "SimIdentifier";
inline constexpr std::string_view kImsi = "Imsi";
inline constexpr std::string_view kOperatorIdentifier = "OperatorIdentifier";
inline constexpr std::string_view kOperatorName = "OperatorName";
}  // namespace property

// Keys of the GetCellInfo dictionaries.
namespace cell_key {
inline constexpr std::string_view kType = "cell-type";
inline constexpr std::string_view kServing = "serving";
inline constexpr std::string_view kOperatorId = "operator-id";
inline constexpr std::string_view kLac = "lac";
inline constexpr std::string_view kTac = "tac";
inline constexpr std::string_view kCi = "ci";
inline constexpr std::string_view kPhysicalCi = "physical-ci";
inline constexpr std::string_view kEarfcn = "earfcn";
inline constexpr std::string_view kUarfcn = "uarfcn";
inline constexpr std::string_view kArfcn = "arfcn";
inline constexpr std::string_view kPsc = "psc";
inline constexpr std::string_view kBaseStationId = "base-station-id";
inline constexpr std::string_view kRxLevel = "rx-level";
inline constexpr std::string_view kRsrp = "rsrp";
inline constexpr std::string_view kRsrq = "rsrq";
inline constexpr std::string_view kRscp = "rscp";
inline constexpr std::string_view kEcio = "ecio";
}  // namespace cell_key

// Keys of the Signal dictionaries.
namespace signal_key {
inline constexpr std::string_view kRssi = "rssi";
inline constexpr std::string_view kRsrp = "rsrp";
inline constexpr std::string_view kRsrq = "rsrq";
inline constexpr std::string_view kSnr = "snr";
inline constexpr std::string_view kRscp = "rscp";
inline constexpr std::string_view kEcio = "ecio";
}  // namespace signal_key

// Keys of a bearer's Properties.
namespace bearer_key {
inline constexpr std::string_view kApn = "apn";
inline constexpr std::string_view kIpType = "ip-type";
}  // namespace bearer_key

// A method, property or signal of an interface, with its D-Bus signature: the arguments of a
// method (in, then out) or signal, the type of a property.
struct Member {
  enum class Kind { Method, Property, Signal };
  std::string_view interface;
  Kind kind;
  std::string_view name;
  std::string_view in;
  std::string_view out = {};
};

// Every member of ModemManager that the source calls or reads.
inline constexpr Member kMembersUsed[] = {
    {kModemInterface, Member::Kind::Method, method::kGetCellInfo, "", "aa{sv}"},
    {kModemInterface, Member::Kind::Property, property::kState, "i"},
    {kModemInterface, Member::Kind::Property, property::kAccessTechnologies, "u"},
    {kModemInterface, Member::Kind::Property, property::kEquipmentIdentifier, "s"},
    {kModemInterface, Member::Kind::Property, property::kBearers, "ao"},
    {kModemInterface, Member::Kind::Property, property::kSim, "o"},
    {kModemInterface, Member::Kind::Property, property::kModel, "s"},
    {kModem3gppInterface, Member::Kind::Property, property::kImei, "s"},
    {kModem3gppInterface, Member::Kind::Property, property::kRegistrationState, "u"},
    {kModem3gppInterface, Member::Kind::Property, property::kOperatorCode, "s"},
    {kModem3gppInterface, Member::Kind::Property, property::kEpsUeModeOperation, "u"},
    {kModem3gppInterface, Member::Kind::Property, property::kPacketServiceState, "u"},
    {kModem3gppInterface, Member::Kind::Property, property::kInitialEpsBearer, "o"},
    {kSignalInterface, Member::Kind::Method, method::kSetup, "u"},
    {kSignalInterface, Member::Kind::Property, property::kLte, "a{sv}"},
    {kSignalInterface, Member::Kind::Property, property::kUmts, "a{sv}"},
    {kSignalInterface, Member::Kind::Property, property::kGsm, "a{sv}"},
    {kBearerInterface, Member::Kind::Property, property::kConnected, "b"},
    {kBearerInterface, Member::Kind::Property, property::kIp4Config, "a{sv}"},
    {kBearerInterface, Member::Kind::Property, property::kIp6Config, "a{sv}"},
    {kBearerInterface, Member::Kind::Property, property::kProfileId, "i"},
    {kBearerInterface, Member::Kind::Property, property::kBearerProperties, "a{sv}"},
    {kSimInterface, Member::Kind::Property, property::kSimIdentifier, "s"},
    {kSimInterface, Member::Kind::Property, property::kImsi, "s"},
    {kSimInterface, Member::Kind::Property, property::kOperatorIdentifier, "s"},
    {kSimInterface, Member::Kind::Property, property::kOperatorName, "s"},
};

}  // namespace tarn::mm
