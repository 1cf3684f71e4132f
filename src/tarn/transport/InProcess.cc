#include "tarn/transport/InProcess.h"

namespace tarn::transport {

namespace {

class InProcessConnection final : public client::Connection {
 public:
  InProcessConnection(std::weak_ptr<service::Core> core, service::Core::SessionId session)
      : core_(std::move(core)), session_(session) {}

  ~InProcessConnection() override {
    if (const auto core = core_.lock()) core->closeSession(session_);
  }

  InProcessConnection(const InProcessConnection&) = delete;
  InProcessConnection& operator=(const InProcessConnection&) = delete;

  // The service answers with a status only, so `output` stays as it is.
  CommandResult perform(std::string_view command, const ipc::Object& input,
                        ipc::Object& /*output*/) override {
    const auto core = core_.lock();
    if (!core) return {status::kServiceUnavailable, "the baseband manager service has gone away"};
    return core->perform(session_, command, input);
  }

  void setEventsOn(bool on) override {
    if (const auto core = core_.lock()) core->setEventsOn(session_, on);
  }

 private:
  std::weak_ptr<service::Core> core_;
  service::Core::SessionId session_;
};

}  // namespace

InProcess::InProcess(std::shared_ptr<service::Core> core) : core_(std::move(core)) {}

std::unique_ptr<client::Connection> InProcess::connect(const std::string& clientName,
                                                       client::EventSink sink) {
  if (!core_) return nullptr;
  const service::Core::SessionId session = core_->openSession(clientName, std::move(sink));
  return std::make_unique<InProcessConnection>(core_, session);
}

}  // namespace tarn::transport
