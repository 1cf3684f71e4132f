#pragma once

#include <sdbus-c++/IConnection.h>
#include <sdbus-c++/IProxy.h>

#include <atomic>
#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <set>
#include <string>
#include <vector>

#include "tarn/dbus/Loop.h"
#include "tarn/mm/ModemManagerSource.h"
#include "tarn/mm/Reader.h"
#include "tarn/mm/Selection.h"
#include "tarn/mm/Snapshot.h"

namespace tarn::mm {

// One connection to the bus that ModemManager is on, and what the source knows through it:
// ModemManager's objects, kept up to date from the object manager and PropertiesChanged, the
// modem followed, and its cells of the last refresh. Everything but the public members runs on
// the connection's own thread.
class Follower {
 public:
  struct Hooks {
    std::function<void(service::Metric)> deliver;
    // The SIM files metric, whenever the SIM's identities change.
    std::function<void(service::Metric)> simFiles;
    StatusSink status;
    WallClock clock;
  };

  // Subscribes and asks for ModemManager's objects. Throws sdbus::Error when it cannot subscribe.
  Follower(std::unique_ptr<sdbus::IConnection> connection, const ModemManagerOptions& options,
           Hooks hooks);
  ~Follower();
  Follower(const Follower&) = delete;
  Follower& operator=(const Follower&) = delete;

  // Any thread: reads the cells and delivers the metrics of the modem followed.
  void refresh();
  // Any thread: whether the connection to the bus has broken.
  bool lost() const { return lost_; }

 private:
  void subscribe();
  void askForObjects();
  void ownerChanged(sdbus::Message& signal);
  void interfacesAdded(sdbus::Message& signal);
  void interfacesRemoved(sdbus::Message& signal);
  void propertiesChanged(sdbus::Message& signal);
  void follow();
  void setUpSignal();
  // The modem's bearers and its initial EPS bearer.
  std::vector<std::string> bearerPaths(Problems& problems) const;
  void readOwnObjects();
  void readProperties(const std::string& path, std::string_view interface);
  void poll();
  void publish();
  void sayState();
  void sayRefused(std::string_view what, const sdbus::Error& error);
  void say(const std::string& line);
  void report(const Problems& problems);
  sdbus::IProxy& proxy(const std::string& path);
  const Dict& properties(const std::string& path, std::string_view interface) const;

  const ModemManagerOptions options_;
  const Hooks hooks_;
  std::atomic<bool> lost_ = false;
  tarn::dbus::Loop loop_;

  std::map<std::string, std::unique_ptr<sdbus::IProxy>> proxies_;
  std::vector<sdbus::Slot> matches_;
  Objects objects_;
  bool present_ = false;  // ModemManager has answered with its objects
  std::optional<std::string> modem_;
  std::vector<Dict> cells_;
  bool cellsRefused_ = false;
  bool cellsPending_ = false;  // a GetCellInfo has not been answered yet
  bool hadBearers_ = false;
  std::string lastState_;
  std::string lastWaiting_;
  std::set<std::string> problemsSaid_;
};

}  // namespace tarn::mm
