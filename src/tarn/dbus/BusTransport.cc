#include "tarn/dbus/BusTransport.h"

#include <sdbus-c++/Error.h>

#include <algorithm>
#include <condition_variable>
#include <mutex>
#include <shared_mutex>
#include <thread>

#include "platform/Format.h"
#include "platform/Log.h"
#include "tarn/dbus/Bus.h"
#include "tarn/dbus/BusConnection.h"

namespace tarn::dbus {

namespace {

// A session that survives its bus: a BusConnection while the bus is reached, and a thread that
// reaches it again, with backoff, whenever it is not.
class RetryingConnection final : public client::Connection {
 public:
  RetryingConnection(std::string bus, std::string clientName, client::EventSink sink,
                     Backoff backoff, std::shared_ptr<client::LinkStatus> link)
      : bus_(std::move(bus)),
        clientName_(std::move(clientName)),
        sink_(std::move(sink)),
        backoff_(backoff),
        link_(std::move(link)) {
    // The first attempt is made before the session is handed out, so that a bus that is there
    // serves the first command.
    reach();
    retrier_ = std::jthread([this](std::stop_token stop) { keepReaching(stop); });
  }

  CommandResult perform(std::string_view command, const ipc::Object& input,
                        ipc::Object& output) override {
    const std::shared_lock lock(swap_);
    if (live_) return live_->perform(command, input, output);
    const std::lock_guard away(awayMutex_);
    const CommandResult result = serviceGone(whyUnreached_);
    wishes_.remember(command, input, result);
    return result;
  }

  void setEventsOn(bool on) override {
    const std::shared_lock lock(swap_);
    if (live_) return live_->setEventsOn(on);
    const std::lock_guard away(awayMutex_);
    wishes_.eventsOn = on;
  }

 private:
  // One attempt to reach the bus; true when it was reached. Commands wait meanwhile, so that
  // none lands between two connections and is forgotten.
  bool reach() {
    const std::unique_lock lock(swap_);
    try {
      live_ = std::make_unique<BusConnection>(connectToBus(bus_), clientName_, sink_, wishes_,
                                              link_, [this] {
                                                {
                                                  const std::lock_guard wake(wakeMutex_);
                                                  busLost_ = true;
                                                }
                                                wake_.notify_all();
                                              });
    } catch (const sdbus::Error& error) {
      whyUnreached_ = error.getMessage();
      link_->set(false, "cannot reach the bus " + bus_ + " (" + whyUnreached_ + "); trying again");
      return false;
    }
    return true;
  }

  // Takes the session's wishes from a connection whose bus has gone, and lets it go.
  void dropLost() {
    const std::unique_lock lock(swap_);
    wishes_ = live_->wishes();
    live_.reset();
    whyUnreached_ = "the connection to the bus broke";
  }

  void keepReaching(std::stop_token stop) {
    std::chrono::milliseconds delay = backoff_.first;
    bool saidFailure = false;
    // A session that did reach its bus at first said so already.
    if (!hasLive()) sayFailure(saidFailure);
    while (!stop.stop_requested()) {
      if (hasLive()) {
        {
          std::unique_lock lock(wakeMutex_);
          if (!wake_.wait(lock, stop, [this] { return busLost_; })) return;
          busLost_ = false;
        }
        dropLost();
        platform::log::warningf("tarn::client: lost the bus %s; trying again", bus_);
        saidFailure = true;
        delay = backoff_.first;
      }
      {
        std::unique_lock lock(wakeMutex_);
        wake_.wait_for(lock, stop, delay, [] { return false; });
      }
      if (stop.stop_requested()) return;
      if (reach()) {
        if (saidFailure) platform::log::plainf("tarn::client: reached the bus %s", bus_);
        saidFailure = false;
      } else {
        sayFailure(saidFailure);
        delay = std::min(delay * 2, backoff_.longest);
      }
    }
  }

  // The first failure in a row only.
  void sayFailure(bool& said) {
    if (said) return;
    said = true;
    const std::shared_lock lock(swap_);
    platform::log::warningf(
        "tarn::client: cannot reach the bus %s: %s; trying again every %.2f s at first, then "
        "up to every %.0f s",
        bus_, whyUnreached_, std::chrono::duration<double>(backoff_.first).count(),
        std::chrono::duration<double>(backoff_.longest).count());
  }

  bool hasLive() {
    const std::shared_lock lock(swap_);
    return live_ != nullptr;
  }

  const std::string bus_;
  const std::string clientName_;
  const client::EventSink sink_;
  const Backoff backoff_;
  const std::shared_ptr<client::LinkStatus> link_;

  // Commands hold it shared; reaching the bus and letting a connection go hold it alone.
  std::shared_mutex swap_;
  std::unique_ptr<BusConnection> live_;
  // While there is no connection: what the session is to be like, and why. Commands change them
  // holding `swap_` shared and `awayMutex_`.
  std::mutex awayMutex_;
  SessionWishes wishes_;
  std::string whyUnreached_;

  std::mutex wakeMutex_;
  bool busLost_ = false;
  std::condition_variable_any wake_;
  // Last, so that its thread starts once every member it may touch is there, and is stopped and
  // joined before any goes.
  std::jthread retrier_;
};

}  // namespace

BusTransport::BusTransport(std::string bus, Backoff backoff,
                           std::shared_ptr<client::LinkStatus> link)
    : bus_(std::move(bus)),
      backoff_(backoff),
      link_(link ? std::move(link) : std::make_shared<client::LinkStatus>()) {}

std::unique_ptr<client::Connection> BusTransport::connect(const std::string& clientName,
                                                          client::EventSink sink) {
  return std::make_unique<RetryingConnection>(bus_, clientName, std::move(sink), backoff_, link_);
}

}  // namespace tarn::dbus
