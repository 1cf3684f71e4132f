#pragma once

#include <memory>
#include <string>

#include "platform/SerialQueue.h"
#include "tarn/client/Client.h"
#include "tarn/client/Transport.h"

namespace tarn::client {

class Manager {
 public:
  // Empty when the transport cannot connect.
  static std::shared_ptr<Manager> open(const std::string& clientName,
                                       const platform::SerialQueue& queue, Transport& transport);

  Manager(const Manager&) = delete;
  Manager& operator=(const Manager&) = delete;
  ~Manager();

  CommandResult perform(std::string_view command, const ipc::Object& input, ipc::Object& output);
  void registerEventHandler(std::string event, EventHandler handler);
  void setEventsOn(bool on);

 private:
  class Events;

  explicit Manager(std::shared_ptr<Events> events);

  // The transport and the tasks on the session's queue reach it weakly, so that events still on
  // their way are dropped once the session is gone.
  std::shared_ptr<Events> events_;
  std::unique_ptr<Connection> connection_;
};

}  // namespace tarn::client
