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

// A record of one entry, `key`, that holds `value`.
sdbus::PlainMessage recordWith(const std::string& key, const sdbus::Variant& value) {
  return messageWith([&](sdbus::Message& m) {
    m << std::map<std::string, sdbus::Variant>{{key, value}};
  });
}

// What readRecord says in refusing `message`; "taken" when it does not.
std::string refusalOf(sdbus::PlainMessage message) {
  try {
    readRecord(message);
  } catch (const MalformedRecord& error) {
    return error.what();
  }
  return "taken";
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
  const std::pair<sdbus::Variant, std::int64_t> cases[] = {
      {sdbus::Variant(std::uint8_t{255}), 255},
      {sdbus::Variant(std::int16_t{-32768}), -32768},
      {sdbus::Variant(std::uint16_t{65535}), 65535},
      {sdbus::Variant(std::int32_t{-2147483647 - 1}), -2147483647 - 1},
      {sdbus::Variant(std::uint32_t{4294967295u}), 4294967295},
      {sdbus::Variant(std::int64_t{-5}), -5},
      {sdbus::Variant(std::uint64_t{std::numeric_limits<std::int64_t>::max()}),
       std::numeric_limits<std::int64_t>::max()},
  };
  for (const auto& [value, expected] : cases) {
    sdbus::PlainMessage message = recordWith("kKeyAppID", value);
    EXPECT_EQ(readRecord(message),
              Object::dictionary({entry("kKeyAppID", Object::integer(expected))}))
        << value.peekValueType();
  }
}

TEST(AReceivedRecord, RefusesAnUnsigned64BitIntegerThatASigned64BitOneCannotHold) {
  EXPECT_THAT(refusalOf(recordWith("kKeyTriggerRef",
                                   sdbus::Variant(std::numeric_limits<std::uint64_t>::max()))),
              HasSubstr("kKeyTriggerRef"));
}

TEST(AReceivedRecord, RefusesTypesThatRecordsDoNotCarryNamingTheKey) {
  // A variant that holds a variant, which sdbus::Variant's constructors cannot make.
  sdbus::PlainMessage nested = messageWith([](sdbus::Message& m) {
    m.openVariant("v") << sdbus::Variant(std::int64_t{1});
    m.closeVariant();
  });
  sdbus::Variant variantInAVariant;
  nested >> variantInAVariant;
  const sdbus::Variant cases[] = {
      sdbus::Variant(true),
      sdbus::Variant(1.5),
      sdbus::Variant(sdbus::ObjectPath("/a")),
      sdbus::Variant(sdbus::Signature("s")),
      sdbus::Variant(std::vector<std::string>{"a"}),
      sdbus::Variant(std::vector<std::int64_t>{1}),
      sdbus::Variant(std::map<std::string, std::string>{{"a", "b"}}),
      sdbus::Variant(sdbus::Struct<std::int32_t, std::int32_t>{1, 2}),
      variantInAVariant,
  };
  for (const sdbus::Variant& value : cases) {
    const std::string refusal = refusalOf(recordWith("kKeyTriggerID", value));
    EXPECT_THAT(refusal, HasSubstr("kKeyTriggerID"));
    EXPECT_THAT(refusal, HasSubstr("'" + value.peekValueType() + "'"));
  }
  // Inside a nested dictionary too.
  EXPECT_THAT(refusalOf(recordWith("outer", sdbus::Variant(std::map<std::string, sdbus::Variant>{
                                                {"inner", sdbus::Variant(true)}}))),
              HasSubstr("inner"));
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
