#pragma once

#include <sdbus-c++/IObject.h>
#include <sdbus-c++/Types.h>

#include <atomic>
#include <cstdint>
#include <functional>
#include <map>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "tarn/dbus/Loop.h"
#include "tarn/mm/Names.h"

namespace mmtest {

// One property value with its D-Bus type.
struct Property {
  std::string signature;
  std::function<void(sdbus::PropertyGetReply&)> write;
};

template <class T>
Property property(T value) {
  return {sdbus::signature_of<T>::str(),
          [value = std::move(value)](sdbus::PropertyGetReply& reply) { reply << value; }};
}

using Properties = std::map<std::string, Property>;
using Entries = std::map<std::string, sdbus::Variant>;  // an a{sv} dictionary

// The part of ModemManager that the source uses, on a bus of a test's own: the object manager,
// modems with the Modem, Modem3gpp and Signal interfaces, bearers and SIMs, with
// PropertiesChanged, InterfacesAdded and InterfacesRemoved. Takes ModemManager's name while it
// lives; a new one after it is ModemManager restarted.
class FakeModemManager {
 public:
  // The interface of a modem's object that `properties` fill; properties not given take a
  // neutral value of their type.
  struct Modem {
    Properties modem;
    Properties modem3gpp;
    Properties signal;
  };

  explicit FakeModemManager(const std::string& busAddress);
  ~FakeModemManager();
  FakeModemManager(const FakeModemManager&) = delete;
  FakeModemManager& operator=(const FakeModemManager&) = delete;

  static std::string modemPath(unsigned index);
  static std::string bearerPath(unsigned index);
  static std::string simPath(unsigned index);

  // Adds the modem and announces it with InterfacesAdded.
  void addModem(unsigned index, Modem modem);
  // Announces InterfacesRemoved and takes the modem away.
  void removeModem(unsigned index);
  // Changes properties of an object's interface and sends PropertiesChanged.
  void set(const std::string& path, std::string_view interface, Properties changed);
  // What GetCellInfo answers for the modem.
  void setCells(unsigned index, std::vector<Entries> cells);
  // Adds a bearer or SIM object, which ModemManager exports beside its object manager.
  void addBearer(unsigned index, Properties properties);
  void addSim(unsigned index, Properties properties);
  // Whether Signal.Setup and GetCellInfo answer as polkit's refusal does.
  void refuseDeviceControl(bool refuse) { refuse_ = refuse; }

  std::uint32_t setupRate(unsigned index) const;
  unsigned cellInfoCalls(unsigned index) const;

  // Every member the fake serves, with its signature.
  static std::vector<tarn::mm::Member> served();

 private:
  struct Object;
  void publish(const std::string& path, std::map<std::string, Properties, std::less<>> interfaces,
               bool announce);
  void registerInterface(Object& object, const std::string& interface);

  std::atomic<bool> refuse_ = false;
  mutable tarn::dbus::Loop loop_;
  std::unique_ptr<sdbus::IObject> root_;
  std::map<std::string, std::unique_ptr<Object>> objects_;
  std::map<unsigned, std::vector<Entries>> cells_;
  std::map<unsigned, std::uint32_t> setupRates_;
  std::map<unsigned, unsigned> cellInfoCalls_;
};

}  // namespace mmtest
