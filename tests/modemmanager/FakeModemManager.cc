#include "FakeModemManager.h"

#include <sdbus-c++/Error.h>
#include <sdbus-c++/IConnection.h>

#include "tarn/dbus/Bus.h"

namespace mmtest {

using tarn::mm::Member;
namespace mm = tarn::mm;

namespace {

// The properties the fake serves, with the type that each has and a neutral value.
const std::map<std::string, std::map<std::string, Property>, std::less<>>& neutralProperties() {
  static const auto* table =
      new std::map<std::string, std::map<std::string, Property>, std::less<>>{
          {std::string(mm::kModemInterface),
           {{"State", property(std::int32_t{MM_MODEM_STATE_REGISTERED})},
            {"AccessTechnologies", property(std::uint32_t{0})},
            {"EquipmentIdentifier", property(std::string())},
            {"Model", property(std::string())},
            {"Bearers", property(std::vector<sdbus::ObjectPath>{})},
            {"Sim", property(sdbus::ObjectPath("/"))}}},
          {std::string(mm::kModem3gppInterface),
           {{"Imei", property(std::string())},
            {"RegistrationState", property(std::uint32_t{0})},
            {"EpsUeModeOperation", property(std::uint32_t{0})},
            {"PacketServiceState", property(std::uint32_t{0})},
            {"InitialEpsBearer", property(sdbus::ObjectPath("/"))}}},
          {std::string(mm::kSignalInterface),
           {{"Lte", property(Entries{})},
            {"Umts", property(Entries{})},
            {"Gsm", property(Entries{})}}},
          {std::string(mm::kBearerInterface),
           {{"Connected", property(false)},
            {"Ip4Config", property(Entries{})},
            {"Ip6Config", property(Entries{})},
            {"ProfileId", property(std::int32_t{-1})},
            {"Properties", property(Entries{})}}},
          {std::string(mm::kSimInterface),
           {{"SimIdentifier", property(std::string())},
            {"Imsi", property(std::string())},
            {"OperatorIdentifier", property(std::string())},
            {"OperatorName", property(std::string())}}},
      };
  return *table;
}

std::map<std::string, Properties, std::less<>> withNeutralValues(
    std::map<std::string, Properties, std::less<>> given) {
  for (auto& [interface, properties] : given) {
    for (const auto& [name, neutral] : neutralProperties().at(interface))
      properties.emplace(name, neutral);
  }
  return given;
}

}  // namespace

struct FakeModemManager::Object {
  std::unique_ptr<sdbus::IObject> object;
  std::map<std::string, Properties, std::less<>> interfaces;
};

FakeModemManager::FakeModemManager(const std::string& busAddress)
    : loop_(tarn::dbus::connectToBus(busAddress)) {
  loop_.call([this] {
    root_ = sdbus::createObject(loop_.connection(), std::string(mm::kRootPath));
    root_->addObjectManager();
    root_->finishRegistration();
    loop_.connection().requestName(std::string(mm::kService));
  });
}

FakeModemManager::~FakeModemManager() {
  loop_.stop();
  objects_.clear();
  root_.reset();
}

std::string FakeModemManager::modemPath(unsigned index) {
  return std::string(mm::kModemPathPrefix) + std::to_string(index);
}
std::string FakeModemManager::bearerPath(unsigned index) {
  return std::string(mm::kRootPath) + "/Bearer/" + std::to_string(index);
}
std::string FakeModemManager::simPath(unsigned index) {
  return std::string(mm::kRootPath) + "/SIM/" + std::to_string(index);
}

void FakeModemManager::registerInterface(Object& object, const std::string& interface) {
  for (const auto& [name, value] : object.interfaces.at(interface)) {
    object.object->registerProperty(
        interface, name, value.signature,
        [&object, interface, name = name](sdbus::PropertyGetReply& reply) {
          object.interfaces.at(interface).at(name).write(reply);
        });
  }
}

void FakeModemManager::publish(const std::string& path,
                               std::map<std::string, Properties, std::less<>> interfaces,
                               bool announce) {
  loop_.call([&] {
    auto object = std::make_unique<Object>();
    object->interfaces = withNeutralValues(std::move(interfaces));
    object->object = sdbus::createObject(loop_.connection(), path);
    for (const auto& [interface, properties] : object->interfaces)
      registerInterface(*object, interface);
    const std::string index = path.substr(path.rfind('/') + 1);
    if (object->interfaces.contains(mm::kModemInterface)) {
      const unsigned modem = static_cast<unsigned>(std::stoul(index));
      object->object->registerMethod(
          std::string(mm::kModemInterface), std::string(mm::method::kGetCellInfo), "", "aa{sv}",
          [this, modem](const sdbus::MethodCall& call) {
            ++cellInfoCalls_[modem];
            if (refuse_) {
              throw sdbus::Error(std::string(mm::kUnauthorizedError),
                                 "Not authorized to perform operation 'GetCellInfo'");
            }
            sdbus::MethodReply reply = call.createReply();
            reply << cells_[modem];
            reply.send();
          });
      object->object->registerMethod(
          std::string(mm::kSignalInterface), std::string(mm::method::kSetup), "u", "",
          [this, modem](sdbus::MethodCall call) {
            if (refuse_) {
              throw sdbus::Error(std::string(mm::kUnauthorizedError),
                                 "Not authorized to perform operation 'Setup'");
            }
            std::uint32_t rate = 0;
            call >> rate;
            setupRates_[modem] = rate;
            call.createReply().send();
          });
    }
    object->object->finishRegistration();
    if (announce) object->object->emitInterfacesAddedSignal();
    objects_[path] = std::move(object);
  });
}

void FakeModemManager::addModem(unsigned index, Modem modem) {
  publish(modemPath(index),
          {{std::string(mm::kModemInterface), std::move(modem.modem)},
           {std::string(mm::kModem3gppInterface), std::move(modem.modem3gpp)},
           {std::string(mm::kSignalInterface), std::move(modem.signal)}},
          true);
}

void FakeModemManager::removeModem(unsigned index) {
  loop_.call([&] {
    const auto found = objects_.find(modemPath(index));
    if (found == objects_.end()) return;
    found->second->object->emitInterfacesRemovedSignal();
    objects_.erase(found);
  });
}

void FakeModemManager::addBearer(unsigned index, Properties properties) {
  publish(bearerPath(index), {{std::string(mm::kBearerInterface), std::move(properties)}}, false);
}

void FakeModemManager::addSim(unsigned index, Properties properties) {
  publish(simPath(index), {{std::string(mm::kSimInterface), std::move(properties)}}, false);
}

void FakeModemManager::set(const std::string& path, std::string_view interface,
                           Properties changed) {
  loop_.call([&] {
    Object& object = *objects_.at(path);
    Properties& properties = object.interfaces.at(std::string(interface));
    std::vector<std::string> names;
    for (auto& [name, value] : changed) {
      properties.at(name) = std::move(value);
      names.push_back(name);
    }
    object.object->emitPropertiesChangedSignal(std::string(interface), names);
  });
}

void FakeModemManager::setCells(unsigned index, std::vector<Entries> cells) {
  loop_.call([&] { cells_[index] = std::move(cells); });
}

std::uint32_t FakeModemManager::setupRate(unsigned index) const {
  return loop_.call([&] {
    const auto found = setupRates_.find(index);
    return found != setupRates_.end() ? found->second : 0u;
  });
}

unsigned FakeModemManager::cellInfoCalls(unsigned index) const {
  return loop_.call([&] {
    const auto found = cellInfoCalls_.find(index);
    return found != cellInfoCalls_.end() ? found->second : 0u;
  });
}

std::vector<Member> FakeModemManager::served() {
  std::vector<Member> members = {
      {mm::kModemInterface, Member::Kind::Method, mm::method::kGetCellInfo, "", "aa{sv}"},
      {mm::kSignalInterface, Member::Kind::Method, mm::method::kSetup, "u", ""},
  };
  for (const auto& [interface, properties] : neutralProperties()) {
    for (const auto& [name, value] : properties) {
      members.push_back({neutralProperties().find(interface)->first, Member::Kind::Property, name,
                         value.signature});
    }
  }
  return members;
}

}  // namespace mmtest
