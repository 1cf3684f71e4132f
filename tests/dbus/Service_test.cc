#include "tarn/dbus/Service.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sdbus-c++/sdbus-c++.h>

#include <fstream>
#include <functional>
#include <map>
#include <regex>
#include <set>
#include <sstream>

#include "Eventually.h"
#include "Printing.h"
#include "PrivateBus.h"
#include "RecordingSession.h"
#include "Records.h"
#include "platform/Log.h"
#include "tarn/Names.h"
#include "tarn/dbus/Bus.h"
#include "tarn/dbus/BusTransport.h"
#include "tarn/dbus/Interface.h"
#include "tarn/dbus/Marshal.h"
#include "tarn/testing/ScriptedMetricSource.h"

namespace {

using bustest::bytesOf;
using bustest::entry;
using bustest::eventually;
using bustest::metricIdsOf;
using bustest::ReceivedEvent;
using bustest::RecordingSession;
using bustest::withAppId;
using tarn::CommandResult;
using tarn::ipc::Object;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::StartsWith;
namespace status = tarn::status;

using bustest::kCaStatus;
using bustest::kRrcState;
using bustest::kSimFiles;
constexpr std::uint32_t kNeighbours = 0x3CD30F;

Object metricRecord(std::uint32_t metricId, platform::Bytes payload, std::int64_t profileId) {
  return Object::dictionary({entry(tarn::kKeyMetricID, Object::integer(metricId)),
                             entry(tarn::kKeyPayload, Object::bytes(std::move(payload))),
                             entry(tarn::kKeyProfileID, Object::integer(profileId)),
                             entry(tarn::kKeyAppID, Object::integer(2))});
}

ReceivedEvent metricEvent(std::uint32_t metricId, platform::Bytes payload, std::int64_t profileId) {
  return {std::string(tarn::kEventMetric), metricRecord(metricId, std::move(payload), profileId)};
}

// A client that talks to the service without the client library, to send what that never would.
class RawClient {
 public:
  using Append = std::function<void(sdbus::Message&)>;

  explicit RawClient(const std::string& address)
      : connection_(sdbus::createSessionBusConnectionWithAddress(address)) {}

  std::string uniqueName() const { return connection_->getUniqueName(); }

  sdbus::MethodReply call(const std::string& path, std::string_view interface,
                          std::string_view method, const Append& append = {}) {
    const auto proxy = sdbus::createProxy(*connection_, std::string(tarn::dbus::kBusName), path);
    sdbus::MethodCall call = proxy->createMethodCall(std::string(interface), std::string(method));
    if (append) append(call);
    return proxy->callMethod(call);
  }

  std::string openSession(const std::string& clientName) {
    sdbus::MethodReply reply =
        call(std::string(tarn::dbus::kManagerPath), tarn::dbus::kManagerInterface,
             tarn::dbus::kOpenSession, [&](sdbus::Message& m) { m << clientName; });
    sdbus::ObjectPath path;
    reply >> path;
    return path;
  }

  // PerformCommand with `command` and the record that `append` writes.
  CommandResult perform(const std::string& session, std::string_view command,
                        const Append& append) {
    sdbus::MethodReply reply = call(session, tarn::dbus::kSessionInterface,
                                    tarn::dbus::kPerformCommand, [&](sdbus::Message& m) {
                                      m << std::string(command);
                                      append(m);
                                    });
    CommandResult result;
    reply >> result.status >> result.message;
    return result;
  }

  CommandResult perform(const std::string& session, std::string_view command, const Object& input) {
    return perform(session, command,
                   [&](sdbus::Message& m) { tarn::dbus::appendRecord(m, input); });
  }

  void setEventsOn(const std::string& session, bool on) {
    call(session, tarn::dbus::kSessionInterface, tarn::dbus::kSetEventsOn,
         [on](sdbus::Message& m) { m << on; });
  }

 private:
  std::unique_ptr<sdbus::IConnection> connection_;
};

// The name of the D-Bus error that `call` throws, or "none".
std::string errorOf(const std::function<void()>& call) {
  try {
    call();
  } catch (const sdbus::Error& error) {
    return error.getName();
  }
  return "none";
}

// The members of the service's own interfaces in introspection XML, one line each: interface,
// kind, name, type or access where given, and the arguments in their order.
std::set<std::string> membersIn(const std::string& xml) {
  static const std::regex comment(R"re(<!--[\s\S]*?-->)re");
  static const std::regex interface(
      R"re(<interface name="(org\.norvo\.[^"]+)">([\s\S]*?)</interface>)re");
  static const std::regex member(R"re(<(method|signal|property)\b([^>]*?)(/>|>([\s\S]*?)</\1>))re");
  static const std::regex arg(R"re(<arg\b([^>]*?)/>)re");
  static const std::regex attribute(R"re((\w+)="([^"]*)")re");
  const auto attributes = [](const std::string& text) {
    std::map<std::string, std::string> found;
    for (std::sregex_iterator it(text.begin(), text.end(), attribute), end; it != end; ++it)
      found[(*it)[1]] = (*it)[2];
    return found;
  };
  const std::string plain = std::regex_replace(xml, comment, "");
  std::set<std::string> members;
  for (std::sregex_iterator i(plain.begin(), plain.end(), interface), end; i != end; ++i) {
    const std::string body = (*i)[2];
    for (std::sregex_iterator m(body.begin(), body.end(), member); m != end; ++m) {
      auto own = attributes((*m)[2]);
      std::string line = (*i)[1].str() + " " + (*m)[1].str() + " " + own["name"] + " " +
                         own["type"] + " " + own["access"];
      const std::string args = (*m)[4];
      for (std::sregex_iterator a(args.begin(), args.end(), arg); a != end; ++a) {
        auto of = attributes((*a)[1]);
        line += " (" + of["direction"] + " " + of["type"] + " " + of["name"] + ")";
      }
      members.insert(line);
    }
  }
  return members;
}

class AServiceOnABus : public ::testing::Test {
 protected:
  bustest::PrivateBus bus;
  tarn::dbus::BusTransport transport{bus.address()};
  std::shared_ptr<tarn::testing::ScriptedMetricSource> source =
      std::make_shared<tarn::testing::ScriptedMetricSource>();
  std::shared_ptr<tarn::service::Core> core = std::make_shared<tarn::service::Core>(source);
  tarn::dbus::Service service{core, tarn::dbus::connectToBus(bus.address())};
};

// A record of each shape that a command takes, and an answer of each kind, over the bus; the
// service's own tests hold every fault it names.
TEST_F(AServiceOnABus, AnswersEveryCommandWithTheStatusAndMessageThatTheServiceGave) {
  RecordingSession session(transport);
  const struct {
    std::string_view command;
    Object input;
    CommandResult result;
  } cases[] = {
      {tarn::kCommandAddConfiguration,
       withAppId({entry(tarn::kKeyPayload, bytesOf("0x3C4E04"))}),
       {}},
      {tarn::kCommandClearConfiguration, withAppId({}), {}},
      {"Reboot", withAppId({}), {status::kUnknownCommand, "unknown command 'Reboot'"}},
      {tarn::kCommandClearConfiguration,
       Object::integer(2),
       {status::kInvalidArgument, "the command's arguments are not a dictionary"}},
      {tarn::kCommandClearConfiguration,
       Object::dictionary({entry(tarn::kKeyAppID, Object())}),
       {status::kMissingArgument, "missing argument kKeyAppID"}},
      {tarn::kCommandClearConfiguration,
       Object::dictionary({entry(tarn::kKeyAppID, Object::text("2"))}),
       {status::kInvalidArgument, "argument kKeyAppID is not an integer"}},
      {tarn::kCommandAddConfiguration,
       withAppId({entry(tarn::kKeyPayload, bytesOf("0x1\n0xZZ\n"))}),
       {status::kMalformedConfiguration,
        "malformed configuration: line 2: '0xZZ' is not a metric ID; write metric IDs in hex, "
        "like 0x3C4E04"}},
      {tarn::kCommandQueryMetric,
       withAppId({entry(tarn::kKeyTriggerID, Object::integer(0x7F4E04))}),
       {status::kNoSuchMetric, "the baseband has no metric 0x3C4E04 to report"}},
  };
  for (const auto& command : cases) {
    EXPECT_EQ(session.perform(command.command, command.input), command.result) << command.command;
  }

  const CommandResult untravelled = session.perform(
      tarn::kCommandClearConfiguration,
      Object::dictionary({entry(tarn::kKeyAppID, Object::text(std::string("2\0", 2)))}));
  EXPECT_EQ(untravelled.status, status::kInvalidArgument);
  EXPECT_THAT(untravelled.message, HasSubstr("NUL"));
}

TEST_F(AServiceOnABus, DeliversTheSubscribedMetricsAndQueryAnswersInTheirOrder) {
  RecordingSession session(transport);
  ASSERT_EQ(session.configure("profile 7\n0x3C4E04\n0x3CD313\n"), CommandResult{});
  source->answerQueriesWith({kSimFiles, {5, 5}});

  std::vector<ReceivedEvent> expected;
  for (std::uint32_t i = 0; i < 300; ++i) {
    const std::uint32_t metricId = i % 3 == 0 ? kCaStatus : kRrcState;
    platform::Bytes payload = {static_cast<std::uint8_t>(i), static_cast<std::uint8_t>(i >> 8)};
    source->emit({metricId, payload});
    source->emit({kNeighbours, {1}});
    expected.push_back(metricEvent(metricId, std::move(payload), 7));
  }
  source->flush();
  ASSERT_EQ(session.perform(tarn::kCommandQueryMetric, bustest::simFilesQuery(9999)),
            CommandResult{});
  expected.push_back({std::string(tarn::kEventTrigger),
                      withAppId({entry(tarn::kKeyTriggerRef, Object::integer(9999)),
                                 entry(tarn::kKeyTriggerType, Object::integer(0)),
                                 entry(tarn::kKeyTriggerID, Object::integer(0x7F0013)),
                                 entry(tarn::kKeyProfileID, Object::integer(0))})});
  expected.push_back(metricEvent(kSimFiles, {5, 5}, 0));

  EXPECT_EQ(session.waitFor(expected.size()), expected);
}

TEST_F(AServiceOnABus, GivesEachClientOnlyWhatItsOwnConfigurationSubscribes) {
  RecordingSession rrc(transport);
  RecordingSession ca(transport);
  RecordingSession unconfigured(transport);
  ASSERT_EQ(rrc.configure("0x3C4E04"), CommandResult{});
  ASSERT_EQ(ca.configure("profile 5\n0x3CD313"), CommandResult{});
  source->answerQueriesWith({kSimFiles, {1}});

  source->emit({kRrcState, {1}});
  source->emit({kCaStatus, {2}});
  source->emit({kRrcState, {3}});
  source->flush();
  // Answers come after everything delivered before them, so the unconfigured session's first
  // events show that no metric reached it.
  ASSERT_EQ(unconfigured.perform(tarn::kCommandQueryMetric, bustest::simFilesQuery()),
            CommandResult{});

  EXPECT_EQ(rrc.waitFor(2),
            (std::vector{metricEvent(kRrcState, {1}, 0), metricEvent(kRrcState, {3}, 0)}));
  EXPECT_EQ(ca.waitFor(1), std::vector{metricEvent(kCaStatus, {2}, 5)});
  const std::vector<ReceivedEvent> answers = unconfigured.waitFor(2);
  ASSERT_EQ(answers.size(), 2u);
  EXPECT_EQ(answers[0].name, tarn::kEventTrigger);
  EXPECT_EQ(answers[1], metricEvent(kSimFiles, {1}, 0));
}

TEST_F(AServiceOnABus, RefusesMalformedCallsAndCallsOnAnotherClientsSessionAndKeepsServing) {
  RawClient owner(bus.address());
  RawClient intruder(bus.address());
  const std::string session = owner.openSession("vexmora");
  EXPECT_THAT(session, StartsWith(tarn::dbus::kSessionPathPrefix));
  const std::string manager(tarn::dbus::kManagerPath);
  namespace dbus = tarn::dbus;
  const auto clear = [](sdbus::Message& m) { m << std::string("ClearConfiguration"); };
  const struct {
    RawClient& client;
    std::string path;
    std::string_view interface, method;
    RawClient::Append append;
    std::string error;
  } calls[] = {
      {owner, manager, dbus::kManagerInterface, dbus::kOpenSession,
       [](sdbus::Message& m) { m << std::int32_t{2}; }, "InvalidArgs"},
      {owner, session, dbus::kSessionInterface, dbus::kPerformCommand, clear, "InvalidArgs"},
      {owner, session, dbus::kSessionInterface, dbus::kPerformCommand,
       [&](sdbus::Message& m) {
         clear(m);
         m << std::map<std::string, std::string>{{"kKeyAppID", "2"}};
       },
       "InvalidArgs"},
      {owner, manager, dbus::kManagerInterface, "Reboot", {}, "UnknownMethod"},
      {owner,
       std::string(dbus::kSessionPathPrefix) + "999999",
       dbus::kSessionInterface,
       dbus::kClose,
       {},
       "UnknownObject"},
      {intruder, session, dbus::kSessionInterface, dbus::kPerformCommand,
       [&](sdbus::Message& m) {
         clear(m);
         dbus::appendRecord(m, withAppId({}));
       },
       "AccessDenied"},
      {intruder, session, dbus::kSessionInterface, dbus::kSetEventsOn,
       [](sdbus::Message& m) { m << true; }, "AccessDenied"},
      {intruder, session, dbus::kSessionInterface, dbus::kClose, {}, "AccessDenied"},
  };
  for (const auto& call : calls) {
    EXPECT_EQ(
        errorOf([&] { call.client.call(call.path, call.interface, call.method, call.append); }),
        "org.freedesktop.DBus.Error." + call.error)
        << call.method;
  }

  const CommandResult withABoolean =
      owner.perform(session, tarn::kCommandClearConfiguration, [](sdbus::Message& m) {
        m << std::map<std::string, sdbus::Variant>{{"kKeyAppID", sdbus::Variant(true)}};
      });
  EXPECT_EQ(withABoolean.status, status::kInvalidArgument);
  EXPECT_THAT(withABoolean.message, HasSubstr("kKeyAppID"));
  EXPECT_EQ(owner.perform(session, tarn::kCommandClearConfiguration,
                          [](sdbus::Message& m) {
                            m << std::map<std::string, sdbus::Variant>{
                                {"kKeyAppID", sdbus::Variant(std::uint32_t{2})}};
                          }),
            CommandResult{});

  EXPECT_EQ(owner.perform(session, tarn::kCommandAddConfiguration,
                          withAppId({entry(tarn::kKeyPayload, bytesOf("0x3C4E04"))})),
            CommandResult{});
  RecordingSession bystander(transport);
  ASSERT_EQ(bystander.configure("0x3C4E04"), CommandResult{});
  source->emit({kRrcState, {4}});
  EXPECT_EQ(bystander.waitFor(1), std::vector{metricEvent(kRrcState, {4}, 0)});
}

TEST_F(AServiceOnABus, EndsASessionThatItsOwnerCloses) {
  RawClient owner(bus.address());
  const std::string session = owner.openSession("vexmora");
  owner.call(session, tarn::dbus::kSessionInterface, tarn::dbus::kClose);

  // Until the object goes, its commands answer that there is no session.
  EXPECT_TRUE(eventually([&] {
    return errorOf([&] {
             const CommandResult result =
                 owner.perform(session, tarn::kCommandClearConfiguration, withAppId({}));
             EXPECT_EQ(result.status, status::kNoSession);
           }) == "org.freedesktop.DBus.Error.UnknownObject";
  }));
}

TEST_F(AServiceOnABus, ForgetsAClientThatLeavesTheBusAndKeepsServingTheOthers) {
  platform::log::Capture log;
  RecordingSession stays(transport);
  ASSERT_EQ(stays.configure("0x3C4E04"), CommandResult{});
  auto leaves = std::make_unique<RawClient>(bus.address());
  const std::string leaverName = leaves->uniqueName();
  const std::string session = leaves->openSession("vexmora");
  ASSERT_EQ(leaves->perform(session, tarn::kCommandAddConfiguration,
                            withAppId({entry(tarn::kKeyPayload, bytesOf("0x3C4E04"))})),
            CommandResult{});
  leaves->setEventsOn(session, true);
  source->emit({kRrcState, {1}});
  ASSERT_EQ(stays.waitFor(1).size(), 1u);

  leaves.reset();
  RawClient observer(bus.address());
  // While the session lives, it is another client's; once it is gone, there is no such object.
  EXPECT_TRUE(eventually([&] {
    return errorOf([&] {
             observer.call(session, tarn::dbus::kSessionInterface, tarn::dbus::kClose);
           }) == "org.freedesktop.DBus.Error.UnknownObject";
  }));
  EXPECT_EQ(log.count("tarnd: client " + leaverName + " left the bus; closed its 1 session(s)"),
            1u);

  source->emit({kRrcState, {2}});
  EXPECT_THAT(metricIdsOf(stays.waitFor(2)), ElementsAre(kRrcState, kRrcState));
}

TEST_F(AServiceOnABus, ServesTheInterfaceThatItsIntrospectionFileDocuments) {
  RawClient client(bus.address());
  const auto introspect = [&client](const std::string& path) {
    sdbus::MethodReply reply =
        client.call(path, "org.freedesktop.DBus.Introspectable", "Introspect");
    std::string xml;
    reply >> xml;
    return xml;
  };
  std::set<std::string> served = membersIn(introspect(std::string(tarn::dbus::kManagerPath)));
  served.merge(membersIn(introspect(client.openSession("vexmora"))));

  std::ifstream file(NORVO_INTERFACE_XML);
  std::stringstream documented;
  documented << file.rdbuf();
  EXPECT_EQ(served, membersIn(documented.str()));
  EXPECT_EQ(served.size(), 6u);
}

}  // namespace
