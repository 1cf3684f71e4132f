#include "tarn/mm/Follower.h"

#include <sdbus-c++/Error.h>
#include <sdbus-c++/Message.h>

#include <algorithm>

#include "platform/Format.h"
#include "tarn/mm/BusValues.h"
#include "tarn/mm/Metrics.h"
#include "tarn/mm/Names.h"
#include "tarn/mm/Reading.h"
#include "tarn/mm/SimFiles.h"

namespace tarn::mm {
namespace {

constexpr std::chrono::seconds kCallTimeout{20};
// Distinct dropped values said in one follow; a modem that sends more is not worth more lines.
constexpr std::size_t kMaxProblemLines = 100;

const Dict kNoProperties;
// The path ModemManager gives for "no object".
constexpr std::string_view kNoObject = "/";

std::string describeError(const sdbus::Error& error) {
  return error.getName() + ": " + error.getMessage();
}

std::string text(const Dict& properties, std::string_view key) {
  Problems ignored;
  return Reader(properties, {}, ignored).text(key).value_or("");
}

}  // namespace

Follower::Follower(std::unique_ptr<sdbus::IConnection> connection,
                   const ModemManagerOptions& options, Hooks hooks)
    : options_(options),
      hooks_(std::move(hooks)),
      loop_(std::move(connection), [this](const std::string& reason) {
        lost_ = true;
        hooks_.status("lost the connection to the bus: " + reason);
      }) {
  loop_.call([this] {
    subscribe();
    askForObjects();
  });
}

Follower::~Follower() {
  loop_.stop();
  // The loop has stopped: proxies and matches go before their connection.
  proxies_.clear();
  matches_.clear();
}

void Follower::refresh() {
  loop_.post([this] { poll(); });
}

void Follower::subscribe() {
  sdbus::IConnection& connection = loop_.connection();
  const auto from = [](std::string_view interface, std::string_view member,
                       std::string_view where) {
    return platform::format("type='signal',sender='%s',interface='%s',member='%s',%s", kService,
                            interface, member, where);
  };
  const std::string root = platform::format("path='%s'", kRootPath);
  matches_.push_back(connection.addMatch(
      platform::format("type='signal',sender='org.freedesktop.DBus',interface='org.freedesktop."
                       "DBus',member='NameOwnerChanged',arg0='%s'",
                       kService),
      [this](sdbus::Message& signal) { ownerChanged(signal); }));
  matches_.push_back(
      connection.addMatch(from(kObjectManagerInterface, "InterfacesAdded", root),
                          [this](sdbus::Message& signal) { interfacesAdded(signal); }));
  matches_.push_back(
      connection.addMatch(from(kObjectManagerInterface, "InterfacesRemoved", root),
                          [this](sdbus::Message& signal) { interfacesRemoved(signal); }));
  matches_.push_back(
      connection.addMatch(from(kPropertiesInterface, "PropertiesChanged",
                               platform::format("path_namespace='%s'", kRootPath)),
                          [this](sdbus::Message& signal) { propertiesChanged(signal); }));
}

sdbus::IProxy& Follower::proxy(const std::string& path) {
  std::unique_ptr<sdbus::IProxy>& proxy = proxies_[path];
  if (!proxy) proxy = sdbus::createProxy(loop_.connection(), std::string(kService), path);
  return *proxy;
}

const Dict& Follower::properties(const std::string& path, std::string_view interface) const {
  const auto object = objects_.find(path);
  if (object == objects_.end()) return kNoProperties;
  const auto found = object->second.find(interface);
  return found != object->second.end() ? found->second : kNoProperties;
}

void Follower::askForObjects() {
  sdbus::IProxy& root = proxy(std::string(kRootPath));
  sdbus::MethodCall call =
      root.createMethodCall(std::string(kObjectManagerInterface), "GetManagedObjects");
  root.callMethod(
      call,
      [this](sdbus::MethodReply& reply, const sdbus::Error* error) {
        if (error != nullptr) {
          say("ModemManager is not running (" + describeError(*error) + "); waiting for it");
          return;
        }
        std::map<sdbus::ObjectPath, std::map<std::string, RawDict>> managed;
        try {
          reply >> managed;
        } catch (const sdbus::Error& broken) {
          say("ModemManager's objects do not read (" + describeError(broken) + ")");
          return;
        }
        for (const auto& [path, interfaces] : managed) {
          for (const auto& [interface, raw] : interfaces)
            objects_[path][interface] = dictOf(raw);
        }
        present_ = true;
        follow();
      },
      kCallTimeout);
}

void Follower::ownerChanged(sdbus::Message& signal) {
  std::string name, oldOwner, newOwner;
  try {
    signal >> name >> oldOwner >> newOwner;
  } catch (const sdbus::Error&) {
    return;  // not what the bus sends
  }
  objects_.clear();
  proxies_.clear();  // and with them the calls they wait on
  cells_.clear();
  cellsPending_ = false;
  present_ = false;
  if (newOwner.empty()) {
    say("ModemManager has left the bus; waiting for it to return");
    follow();
  } else {
    askForObjects();
  }
}

void Follower::interfacesAdded(sdbus::Message& signal) {
  sdbus::ObjectPath path;
  std::map<std::string, RawDict> interfaces;
  try {
    signal >> path >> interfaces;
  } catch (const sdbus::Error& error) {
    report({"InterfacesAdded: " + describeError(error) + "; dropped"});
    return;
  }
  for (const auto& [interface, raw] : interfaces)
    objects_[path][interface] = dictOf(raw);
  follow();
}

void Follower::interfacesRemoved(sdbus::Message& signal) {
  sdbus::ObjectPath path;
  std::vector<std::string> interfaces;
  try {
    signal >> path >> interfaces;
  } catch (const sdbus::Error& error) {
    report({"InterfacesRemoved: " + describeError(error) + "; dropped"});
    return;
  }
  const auto object = objects_.find(path);
  if (object == objects_.end()) return;
  for (const std::string& interface : interfaces)
    object->second.erase(interface);
  if (object->second.empty()) objects_.erase(object);
  follow();
}

void Follower::propertiesChanged(sdbus::Message& signal) {
  const std::string path = signal.getPath();
  std::string interface;
  RawDict changed;
  try {
    signal >> interface >> changed;
  } catch (const sdbus::Error& error) {
    report({"PropertiesChanged of " + path + ": " + describeError(error) + "; dropped"});
    return;
  }
  const auto object = objects_.find(path);
  if (object == objects_.end()) return;
  Dict& properties = object->second[interface];
  for (const auto& [name, variant] : changed)
    properties.insert_or_assign(name, valueOf(variant));

  if (path != modem_) {
    if (interface == kSimInterface) readOwnObjects();  // the SIM's identities changed
    return;
  }
  if (changed.contains(std::string(property::kBearers)) ||
      changed.contains(std::string(property::kSim)) ||
      changed.contains(std::string(property::kInitialEpsBearer)))
    readOwnObjects();
  if (interface == kModemInterface && changed.contains(std::string(property::kState))) sayState();
}

void Follower::follow() {
  // The modem followed stays followed while it is there.
  const auto followed = modem_ ? objects_.find(*modem_) : objects_.end();
  if (followed != objects_.end() && followed->second.contains(kModemInterface)) return;
  const std::optional<std::string> chosen = chooseModem(objects_, options_.modem);
  if (modem_) say(platform::format("modem %s has gone away", modemIndex(*modem_)));
  modem_ = chosen;
  cells_.clear();
  cellsRefused_ = false;
  lastState_.clear();
  problemsSaid_.clear();
  if (!modem_) {
    const std::string waiting =
        options_.modem.empty() ? "ModemManager has no modem; waiting for one"
                               : "ModemManager has no modem " + options_.modem + "; waiting for it";
    // Said once while ModemManager is there without the modem.
    if (present_ && waiting != lastWaiting_) say(waiting);
    lastWaiting_ = present_ ? waiting : std::string();
    return;
  }
  lastWaiting_.clear();
  const Dict& modem = properties(*modem_, kModemInterface);
  std::string identity = text(modem, property::kModel);
  const std::string imei = text(modem, property::kEquipmentIdentifier);
  if (!imei.empty()) identity += (identity.empty() ? "" : ", ") + imei;
  say(platform::format("following modem %s (%s%s%s)", modemIndex(*modem_), *modem_,
                       identity.empty() ? "" : ", ", identity));
  sayState();
  setUpSignal();
  readOwnObjects();
}

void Follower::setUpSignal() {
  const auto seconds = static_cast<std::uint32_t>(
      std::max<std::int64_t>(1, (options_.refresh.count() + 999) / 1000));
  sdbus::IProxy& modem = proxy(*modem_);
  sdbus::MethodCall call =
      modem.createMethodCall(std::string(kSignalInterface), std::string(method::kSetup));
  call << seconds;
  modem.callMethod(
      call,
      [this](sdbus::MethodReply&, const sdbus::Error* error) {
        if (error != nullptr) sayRefused("Signal.Setup", *error);
      },
      kCallTimeout);
}

std::vector<std::string> Follower::bearerPaths(Problems& problems) const {
  std::vector<std::string> paths = Reader(properties(*modem_, kModemInterface), "Modem", problems)
                                       .paths(property::kBearers)
                                       .value_or(std::vector<std::string>{});
  const std::optional<std::string> initial =
      Reader(properties(*modem_, kModem3gppInterface), "Modem3gpp", problems)
          .path(property::kInitialEpsBearer);
  if (initial && *initial != kNoObject &&
      std::find(paths.begin(), paths.end(), *initial) == paths.end())
    paths.push_back(*initial);
  return paths;
}

void Follower::readOwnObjects() {
  if (!modem_) return;
  Problems problems;
  const Reader modem(properties(*modem_, kModemInterface), "Modem", problems);
  if (const std::optional<std::string> sim = modem.path(property::kSim); sim && *sim != kNoObject)
    readProperties(*sim, kSimInterface);
  for (const std::string& bearer : bearerPaths(problems))
    readProperties(bearer, kBearerInterface);
  report(problems);
}

void Follower::readProperties(const std::string& path, std::string_view interface) {
  sdbus::IProxy& object = proxy(path);
  sdbus::MethodCall call = object.createMethodCall(std::string(kPropertiesInterface), "GetAll");
  call << std::string(interface);
  object.callMethod(
      call,
      [this, path, interface = std::string(interface)](sdbus::MethodReply& reply,
                                                       const sdbus::Error* error) {
        if (error != nullptr) return;  // gone again before it answered
        RawDict raw;
        try {
          reply >> raw;
        } catch (const sdbus::Error& broken) {
          report({path + " " + interface + ": " + describeError(broken) + "; dropped"});
          return;
        }
        objects_[path][interface] = dictOf(raw);
        if (interface != kSimInterface) return;
        Problems problems;
        const Sim sim = readSim(objects_[path][interface], problems);
        report(problems);
        const std::uint64_t now = hooks_.clock();
        if (std::optional<service::Metric> files = simFilesMetric(sim, now))
          hooks_.simFiles(std::move(*files));
        if (std::optional<service::Metric> common = mmCommonInfoMetric(sim, now))
          hooks_.deliver(std::move(*common));
      },
      kCallTimeout);
}

void Follower::poll() {
  if (!modem_) return;
  if (cellsRefused_) {
    publish();
    return;
  }
  // A modem slower than the refresh is asked again once it has answered.
  if (cellsPending_) return;
  cellsPending_ = true;
  sdbus::IProxy& modem = proxy(*modem_);
  sdbus::MethodCall call =
      modem.createMethodCall(std::string(kModemInterface), std::string(method::kGetCellInfo));
  modem.callMethod(
      call,
      [this, path = *modem_](sdbus::MethodReply& reply, const sdbus::Error* error) {
        cellsPending_ = false;
        if (path != modem_) return;  // answered for a modem no longer followed
        cells_.clear();
        if (error != nullptr) {
          sayRefused("GetCellInfo", *error);
        } else {
          std::vector<RawDict> cells;
          try {
            reply >> cells;
          } catch (const sdbus::Error& broken) {
            report({"GetCellInfo: " + describeError(broken) + "; dropped"});
          }
          for (const RawDict& cell : cells)
            cells_.push_back(dictOf(cell));
        }
        publish();
      },
      kCallTimeout);
}

void Follower::publish() {
  Problems problems;
  Snapshot snapshot;
  for (std::size_t i = 0; i < cells_.size(); ++i) {
    if (std::optional<Cell> cell = readCell(cells_[i], platform::format("cell %u", i), problems))
      snapshot.cells.push_back(std::move(*cell));
  }
  const Reader signal(properties(*modem_, kSignalInterface), "Signal", problems);
  if (const Dict* lte = signal.dictionary(property::kLte))
    snapshot.lte = readLteSignal(*lte, problems);
  if (const Dict* umts = signal.dictionary(property::kUmts))
    snapshot.umts = readUmtsSignal(*umts, problems);
  if (const Dict* gsm = signal.dictionary(property::kGsm))
    snapshot.gsm = readGsmSignal(*gsm, problems);
  const Dict& modem = properties(*modem_, kModemInterface);
  snapshot.registration =
      readRegistration(modem, properties(*modem_, kModem3gppInterface), problems);

  const std::uint64_t now = hooks_.clock();
  std::vector<service::Metric> metrics = radioMetrics(snapshot, now, problems);

  std::vector<Bearer> connected;
  for (const std::string& path : bearerPaths(problems)) {
    if (std::optional<Bearer> bearer =
            readBearer(properties(path, kBearerInterface), "Bearer " + path, problems))
      connected.push_back(std::move(*bearer));
  }
  // Connected bearers, and once more when the last one goes down.
  if (!connected.empty() || hadBearers_) metrics.push_back(bearerMetric(connected, now));
  hadBearers_ = !connected.empty();

  report(problems);
  for (service::Metric& metric : metrics)
    hooks_.deliver(std::move(metric));
}

void Follower::sayState() {
  if (!modem_) return;
  Problems ignored;
  const std::optional<std::int32_t> state =
      Reader(properties(*modem_, kModemInterface), {}, ignored).signedInt(property::kState);
  const std::string_view index = modemIndex(*modem_);
  std::string line;
  if (state == MM_MODEM_STATE_LOCKED) {
    line = platform::format(
        "modem %s is locked: its SIM wants a PIN (mmcli -m %s shows which; mmcli -i SIM "
        "--pin=PIN unlocks it); waiting",
        index, index);
  } else if (state == MM_MODEM_STATE_DISABLED) {
    line =
        platform::format("modem %s is disabled; mmcli -m %s -e enables it; waiting", index, index);
  } else if (state == MM_MODEM_STATE_FAILED) {
    line = platform::format("modem %s has failed (mmcli -m %s says why); waiting", index, index);
  } else if (!lastState_.empty()) {
    line = platform::format("modem %s is enabled", index);
  }
  if (line.empty() || line == lastState_) return;
  lastState_ = line;
  say(line);
}

void Follower::sayRefused(std::string_view what, const sdbus::Error& error) {
  if (error.getName() == kUnauthorizedError) {
    if (what == method::kGetCellInfo) cellsRefused_ = true;
    say(platform::format(
        "ModemManager refused %s: this user lacks the polkit action %s; "
        "docs/modemmanager.md gives the rule that grants it. Going on with what can still be "
        "read",
        what, kDeviceControlAction));
  } else {
    report({std::string(what) + ": " + describeError(error)});
  }
}

void Follower::say(const std::string& line) {
  hooks_.status(line);
}

void Follower::report(const Problems& problems) {
  for (const std::string& problem : problems) {
    if (problemsSaid_.size() >= kMaxProblemLines) return;
    if (problemsSaid_.insert(problem).second) say(problem);
  }
}

}  // namespace tarn::mm
