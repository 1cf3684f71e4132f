#include "tarn/dbus/Marshal.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sdbus-c++/sdbus-c++.h>

#include <cstdint>
#include <functional>
#include <limits>
#include <map>

#include "Printing.h"
#include "Records.h"

// A message that belongs to no bus, as sdbus-c++ makes for its variants. The library exports it;
// its headers declare it only from version 1.3 on.
namespace sdbus {
PlainMessage createPlainMessage();
}

namespace {

using bustest::entry;
using tarn::dbus::appendEvents;
using tarn::dbus::appendRecord;
using tarn::dbus::Event;
using tarn::dbus::MalformedRecord;
using tarn::dbus::readEvents;
using tarn::dbus::readRecord;
using tarn::ipc::Object;
using ::testing::HasSubstr;

// A message holding what `fill` appends, ready to be read from its start.
sdbus::PlainMessage messageWith(const std::function<void(sdbus::Message&)>& fill) {
  sdbus::PlainMessage message = sdbus::createPlainMessage();
  fill(message);
  message.seal();
  message.rewind(true);
  return message;
}

Object roundTrip(const Object& record) {
  sdbus::PlainMessage message = messageWith([&](sdbus::Message& m) { appendRecord(m, record); });
  return readRecord(message);
}

// A record of one entry, `key`, whose variant holds `signature` as `append` writes it.
sdbus::PlainMessage recordWithOneEntry(const std::string& key, const std::string& signature,
                                       const std::function<void(sdbus::Message&)>& append) {
  return messageWith([&](sdbus::Message& message) {
    message.openContainer("{sv}").openDictEntry("sv") << key;
    message.openVariant(signature);
    append(message);
    message.closeVariant().closeDictEntry().closeContainer();
  });
}

TEST(ARecordOnTheBus, KeepsItsEntriesInTheirOrderWithEveryKindOfValue) {
  const Object record = Object::dictionary({
      entry("zeta", Object::integer(std::numeric_limits<std::int64_t>::min())),
      entry("alpha", Object::integer(std::numeric_limits<std::int64_t>::max())),
      entry("kKeyPayload", Object::bytes({0x00, 0xFF, 0x0A, 0x00})),
      entry("empty bytes", Object::bytes({})),
      entry("text", Object::text("Zürich — 3 cells")),
      entry("empty text", Object::text("")),
      entry("list", Object::array({Object::integer(1), Object::text("two"), Object::bytes({3}),
                                   Object::array({Object::integer(4)}),
                                   Object::dictionary({entry("five", Object::integer(5))})})),
      entry("nested", Object::dictionary(
                          {entry("b", Object::array({})),
                           entry("a", Object::dictionary({entry("deep", Object::integer(-1))}))})),
      entry("", Object::integer(0)),
  });

  EXPECT_EQ(roundTrip(record), record);
}

TEST(ARecordOnTheBus, CarriesAPayloadOfAMegabyteWhole) {
  platform::Bytes payload(std::size_t{1} << 20);
  for (std::size_t i = 0; i < payload.size(); ++i)
    payload[i] = static_cast<std::uint8_t>(i * 7);
  const Object record = Object::dictionary({entry("kKeyPayload", Object::bytes(payload))});

  EXPECT_EQ(roundTrip(record), record);
}

TEST(ARecordOnTheBus, LeavesOutNullsAtEveryDepthAndTravelsEmptyWhenItIsNoDictionary) {
  const Object record = Object::dictionary({
      entry("gone", Object()),
      entry("kept", Object::integer(1)),
      entry("list", Object::array({Object(), Object::integer(2), Object()})),
      entry("inner", Object::dictionary({entry("gone too", Object())})),
  });

  EXPECT_EQ(roundTrip(record),
            Object::dictionary({entry("kept", Object::integer(1)),
                                entry("list", Object::array({Object::integer(2)})),
                                entry("inner", Object::dictionary())}));
  EXPECT_EQ(roundTrip(Object::integer(5)), Object::dictionary());
  EXPECT_EQ(roundTrip(Object()), Object::dictionary());
}

TEST(ARecordOnTheBus, RefusesTextWithANulCharacter) {
  sdbus::PlainMessage message = sdbus::createPlainMessage();
  EXPECT_THROW(appendRecord(message, Object::dictionary(
                                         {entry("name", Object::text(std::string("a\0b", 3)))})),
               MalformedRecord);
}

TEST(AReceivedRecord, TakesEveryIntegerTypeAsA64BitInteger) {
  const struct {
    std::string signature;
    std::function<void(sdbus::Message&)> append;
    std::int64_t expected;
  } cases[] = {
      {"y", [](sdbus::Message& m) { m << std::uint8_t{255}; }, 255},
      {"n", [](sdbus::Message& m) { m << std::int16_t{-32768}; }, -32768},
      {"q", [](sdbus::Message& m) { m << std::uint16_t{65535}; }, 65535},
      {"i", [](sdbus::Message& m) { m << std::int32_t{-2147483647 - 1}; }, -2147483647 - 1},
      {"u", [](sdbus::Message& m) { m << std::uint32_t{4294967295u}; }, 4294967295},
      {"x", [](sdbus::Message& m) { m << std::int64_t{-5}; }, -5},
      {"t", [](sdbus::Message& m) { m << std::uint64_t{std::numeric_limits<std::int64_t>::max()}; },
       std::numeric_limits<std::int64_t>::max()},
  };
  for (const auto& integer : cases) {
    sdbus::PlainMessage message =
        recordWithOneEntry("kKeyAppID", integer.signature, integer.append);
    EXPECT_EQ(readRecord(message),
              Object::dictionary({entry("kKeyAppID", Object::integer(integer.expected))}))
        << integer.signature;
  }
}

TEST(AReceivedRecord, RefusesAnUnsigned64BitIntegerThatASigned64BitOneCannotHold) {
  sdbus::PlainMessage message = recordWithOneEntry("kKeyTriggerRef", "t", [](sdbus::Message& m) {
    m << std::uint64_t{std::numeric_limits<std::uint64_t>::max()};
  });
  try {
    readRecord(message);
    ADD_FAILURE() << "the integer was taken";
  } catch (const MalformedRecord& error) {
    EXPECT_THAT(error.what(), HasSubstr("kKeyTriggerRef"));
  }
}

TEST(AReceivedRecord, RefusesTypesThatRecordsDoNotCarryNamingTheKey) {
  const struct {
    std::string signature;
    std::function<void(sdbus::Message&)> append;
  } cases[] = {
      {"b", [](sdbus::Message& m) { m << true; }},
      {"d", [](sdbus::Message& m) { m << 1.5; }},
      {"o", [](sdbus::Message& m) { m << sdbus::ObjectPath("/a"); }},
      {"g", [](sdbus::Message& m) { m << sdbus::Signature("s"); }},
      {"as", [](sdbus::Message& m) { m << std::vector<std::string>{"a"}; }},
      {"ax", [](sdbus::Message& m) { m << std::vector<std::int64_t>{1}; }},
      {"a{ss}",
       [](sdbus::Message& m) {
         m << std::map<std::string, std::string>{{"a", "b"}};
       }},
      {"(ii)",
       [](sdbus::Message& m) {
         m.openStruct("ii") << std::int32_t{1} << std::int32_t{2};
         m.closeStruct();
       }},
      {"v", [](sdbus::Message& m) { m << sdbus::Variant(std::int64_t{1}); }},
  };
  for (const auto& unsupported : cases) {
    sdbus::PlainMessage message =
        recordWithOneEntry("kKeyTriggerID", unsupported.signature, unsupported.append);
    try {
      readRecord(message);
      ADD_FAILURE() << unsupported.signature << " was taken";
    } catch (const MalformedRecord& error) {
      EXPECT_THAT(error.what(), HasSubstr("kKeyTriggerID")) << unsupported.signature;
      EXPECT_THAT(error.what(), HasSubstr("'" + unsupported.signature + "'"));
    }
  }
}

TEST(AReceivedRecord, NamesTheKeyOfAnUnsupportedValueInsideANestedDictionary) {
  sdbus::PlainMessage message = recordWithOneEntry("outer", "a{sv}", [](sdbus::Message& m) {
    m << std::map<std::string, sdbus::Variant>{{"inner", sdbus::Variant(true)}};
  });
  try {
    readRecord(message);
    ADD_FAILURE() << "a boolean was taken";
  } catch (const MalformedRecord& error) {
    EXPECT_THAT(error.what(), HasSubstr("inner"));
  }
}

TEST(AReceivedRecord, IsRefusedWhenTheMessageHoldsNoDictionary) {
  for (const auto& fill : std::vector<std::function<void(sdbus::Message&)>>{
           [](sdbus::Message&) {},
           [](sdbus::Message& m) { m << std::string("kKeyAppID"); },
           [](sdbus::Message& m) {
             m << std::map<std::string, std::string>{{"a", "b"}};
           },
       }) {
    sdbus::PlainMessage message = messageWith(fill);
    EXPECT_THROW(readRecord(message), MalformedRecord);
  }
}

TEST(TheEventsOnTheBus, KeepTheirOrderNamesAndRecords) {
  const std::vector<Event> events = {
      {"TriggerEvent", Object::dictionary({entry("kKeyTriggerID", Object::integer(0x7F0013))})},
      {"MetricEvent", Object::dictionary({entry("kKeyMetricID", Object::integer(0x3C0013)),
                                          entry("kKeyPayload", Object::bytes({1, 2}))})},
      {"MetricEvent", Object::dictionary()},
  };
  for (const std::span<const Event> sent :
       {std::span<const Event>(events), std::span<const Event>()}) {
    sdbus::PlainMessage message = messageWith([&](sdbus::Message& m) { appendEvents(m, sent); });
    EXPECT_EQ(readEvents(message), std::vector<Event>(sent.begin(), sent.end()));
  }
}

TEST(TheEventsOnTheBus, AreRefusedWhenTheMessageHoldsSomethingElse) {
  sdbus::PlainMessage message = messageWith([](sdbus::Message& m) {
    appendRecord(m, Object::dictionary({entry("kKeyAppID", Object::integer(2))}));
  });
  EXPECT_THROW(readEvents(message), MalformedRecord);
}

}  // namespace
