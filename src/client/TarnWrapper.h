#pragma once

#include <atomic>
#include <cstdint>
#include <memory>
#include <optional>
#include <string_view>

#include "client/TarnWrapperDelegate.h"
#include "platform/SerialQueue.h"
#include "tarn/Ipc.h"
#include "tarn/client/Client.h"
#include "tarn/client/Transport.h"

// The app's one session with the baseband manager service. It sends the configuration and query
// commands and hands each delivered event and metric to its delegate on the main queue.
//
// Commands and the delegate property belong to the main queue; the session's events arrive on
// the wrapper's serial queue. Every event becomes one delegate call, but the serial queue waits
// while a few dozen calls are already on their way to the main queue: a main queue that falls
// behind holds the session back rather than piling up work ahead of everything else it does.
class TarnWrapper {
 public:
  // The app's name: the client name of its session and the app ID text of its commands.
  static constexpr std::string_view kAppName = "vexmora";

  // Created on first use and never released.
  static TarnWrapper& sharedInstance();

  // Opens a session under the client name "vexmora" over the application's transport (or over
  // `transport`); no delegate yet, and no events until listen().
  TarnWrapper();
  explicit TarnWrapper(tarn::client::Transport& transport);
  ~TarnWrapper();
  TarnWrapper(const TarnWrapper&) = delete;
  TarnWrapper& operator=(const TarnWrapper&) = delete;

  // The serial queue that the session delivers events on.
  platform::SerialQueue queue();

  // Each command answers false at once, sending nothing, unless `appId` is "vexmora"; otherwise
  // it answers whether the service accepted the command.
  //
  // Pushes the configuration file at `path`, read whole and sent unread.
  bool addVelaConfigForAppId(std::string_view appId, std::string_view path);
  bool removeVelaConfigForAppid(std::string_view appId);
  bool querySpecificMetric(std::string_view appId, std::int32_t triggerRef,
                           std::int32_t triggerType, std::int32_t triggerID, std::int32_t profileID,
                           std::int32_t metricID);

  // Registers the event and metric handlers and switches events off and on. May be called again.
  void listen();

  std::weak_ptr<TarnWrapperDelegate> delegate() const;
  void setDelegate(std::weak_ptr<TarnWrapperDelegate> delegate);

 private:
  using DelegateSlot = std::atomic<std::weak_ptr<TarnWrapperDelegate>>;
  class MainQueueHop;

  bool perform(const char* logName, std::string_view command, tarn::ipc::Object::Entries entries);

  std::shared_ptr<tarn::client::Manager> tarnManager_;
  std::optional<platform::SerialQueue> queue_;
  // Read on the serial queue and on the main queue; shared with the event handlers and the tasks
  // they post, so that those may outlive the wrapper.
  std::shared_ptr<DelegateSlot> delegate_;
  std::shared_ptr<MainQueueHop> hop_;
};
