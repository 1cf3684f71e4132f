#include "platform/Value.h"

#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>
#include <limits>
#include <ostream>

namespace platform {

// Failure messages show values in their text form.
void PrintTo(const Value& value, std::ostream* out) {
  *out << value.description();
}
void PrintTo(const Dictionary& dictionary, std::ostream* out) {
  *out << dictionary.description();
}

namespace {

using Kind = Value::Kind;

TEST(AValue, TakesTheKindOfTheArgumentsOwnType) {
  EXPECT_EQ(Value("x").kind(), Kind::String);
  EXPECT_EQ(Value(true).kind(), Kind::Bool);
  EXPECT_EQ(Value(5).kind(), Kind::Int32);
  EXPECT_EQ(Value(5u).kind(), Kind::UInt32);
  EXPECT_EQ(Value(5L).kind(), Kind::Int64);
  EXPECT_EQ(Value(5ULL).kind(), Kind::UInt64);
  EXPECT_EQ(Value(std::uint8_t{5}).kind(), Kind::UInt32);
  EXPECT_EQ(Value(5.0).kind(), Kind::Double);
  char buffer[] = "x";
  EXPECT_EQ(Value(buffer).kind(), Kind::String);
  EXPECT_EQ(Value(static_cast<char*>(buffer)).kind(), Kind::String);
}

TEST(AValue, IsNullWhenAbsentOrMadeFromANullPointer) {
  EXPECT_TRUE(Value().isNull());
  EXPECT_TRUE(Value(nullptr).isNull());
  EXPECT_TRUE(Value(static_cast<const char*>(nullptr)).isNull());
}

TEST(AValue, CountsBooleansAsNumbersButNotTextOrContainers) {
  EXPECT_TRUE(Value(false).isNumber());
  EXPECT_FALSE(Value("1").isNumber());
  EXPECT_FALSE(Value(List{1}).isNumber());
}

TEST(AValue, ReadsAsAnIntegerOnlyWhenTheNumberIsExactlyOne) {
  EXPECT_EQ(Value(true).asInteger(), 1);
  EXPECT_EQ(Value(5.0).asInteger(), 5);
  EXPECT_EQ(Value(-0x1p63).asInteger(), std::numeric_limits<std::int64_t>::min());
  EXPECT_EQ(Value(std::uint64_t{1} << 63).asInteger(), std::nullopt);
  EXPECT_EQ(Value(0x1p63).asInteger(), std::nullopt);
  EXPECT_EQ(Value(5.5).asInteger(), std::nullopt);
  EXPECT_EQ(Value(std::nan("")).asInteger(), std::nullopt);
  EXPECT_EQ(Value("5").asInteger(), std::nullopt);
}

TEST(AValue, ReadsAsAnInt32OnlyWithinItsRange) {
  EXPECT_EQ(Value(std::int64_t{-2147483648}).asInt32(), -2147483647 - 1);
  EXPECT_EQ(Value(std::int64_t{2147483648}).asInt32(), std::nullopt);
  EXPECT_EQ(Value(2147483647.0).asInt32(), 2147483647);
  EXPECT_EQ(Value(2147483648.0f).asInt32(), std::nullopt);
}

TEST(AValue, ReadsAsAFloatOnlyWhenTheFloatHoldsTheValueExactly) {
  EXPECT_EQ(Value(3).asFloat(), 3.0f);
  EXPECT_EQ(Value(-10.5).asFloat(), -10.5f);
  EXPECT_EQ(Value(0.1).asFloat(), std::nullopt);
  EXPECT_EQ(Value(16777217).asFloat(), std::nullopt);
  EXPECT_EQ(Value(std::numeric_limits<std::int64_t>::max()).asFloat(), std::nullopt);
  EXPECT_EQ(Value(-INFINITY).asFloat(), -INFINITY);
  EXPECT_TRUE(std::isnan(*Value(std::nan("")).asFloat()));
}

TEST(AValue, ReadsAsADoubleOnlyWhenTheDoubleHoldsTheValueExactly) {
  EXPECT_EQ(Value(0.1f).asDouble(), static_cast<double>(0.1f));
  EXPECT_EQ(Value(std::int64_t{1} << 53).asDouble(), 9007199254740992.0);
  EXPECT_EQ(Value((std::int64_t{1} << 53) + 1).asDouble(), std::nullopt);
  EXPECT_EQ(Value(std::numeric_limits<std::uint64_t>::max()).asDouble(), std::nullopt);
}

TEST(AValue, HandsOutItsContentsOnlyForTheirOwnKind) {
  EXPECT_EQ(*Value("x").asString(), "x");
  EXPECT_EQ(Value(1).asString(), nullptr);
  EXPECT_EQ(*Value(Bytes{1, 2}).asBytes(), (Bytes{1, 2}));
  EXPECT_EQ(Value("x").asList(), nullptr);

  Value list(List{1});
  list.asList()->push_back(2);
  EXPECT_EQ(list, Value(List{1, 2}));
}

TEST(AValue, EqualsOnlyAValueOfTheSameKindAndValue) {
  EXPECT_EQ(Value(1), Value(1));
  EXPECT_NE(Value(1), Value(std::int64_t{1}));
  EXPECT_NE(Value(1), Value(true));
  EXPECT_NE(Value(1.0f), Value(1.0));
  EXPECT_NE(Value(), Value(""));
  EXPECT_NE(Value(List{1, 2}), Value(List{2, 1}));
}

TEST(AValue, CompareDictionariesWhateverTheirOrder) {
  const Dictionary forward{{"a", 1}, {"b", List{Dictionary{{"x", "y"}, {"z", 2}}}}};
  const Dictionary backward{{"b", List{Dictionary{{"z", 2}, {"x", "y"}}}}, {"a", 1}};
  EXPECT_EQ(Value(forward), Value(backward));
  EXPECT_NE(forward, (Dictionary{{"a", 1}}));
  EXPECT_NE((Dictionary{{"a", 1}}), (Dictionary{{"a", 2}}));
}

TEST(ADictionary, KeepsTheOrderOfInsertionWhenValuesAreReplacedOrRemoved) {
  Dictionary dictionary;
  dictionary.set("c", 1);
  dictionary.append("a", 2);
  dictionary.set("b", 3);
  dictionary.set("c", "replaced");
  EXPECT_TRUE(dictionary.erase("a"));
  EXPECT_FALSE(dictionary.erase("a"));
  dictionary.set("a", 4);

  std::vector<std::string> keys;
  for (const auto& [key, value] : dictionary)
    keys.push_back(key);
  EXPECT_EQ(keys, (std::vector<std::string>{"c", "b", "a"}));
  EXPECT_EQ(*dictionary.find("c"), Value("replaced"));
  EXPECT_EQ(dictionary.size(), 3u);
}

TEST(ADictionary, LetsAFoundValueBeChangedInPlace) {
  Dictionary dictionary{{"rsrp", 40}};
  *dictionary.find("rsrp") = 40 - 140;
  EXPECT_EQ(dictionary, (Dictionary{{"rsrp", -100}}));
  EXPECT_EQ(dictionary.find("rsrq"), nullptr);
  EXPECT_FALSE(dictionary.contains("rsrq"));
}

// Keys are compared a word at a time: a key of any length that differs from another in any one
// character, or only in its length, is another key.
TEST(ADictionary, FindsAKeyOnlyWhenEveryCharacterMatches) {
  for (std::size_t length = 0; length <= 20; ++length) {
    const std::string key(length, 'k');
    Dictionary dictionary{{key, 1}};
    ASSERT_NE(dictionary.find(key), nullptr) << length;
    EXPECT_EQ(dictionary.find(key + "k"), nullptr) << length;
    for (std::size_t at = 0; at < length; ++at) {
      std::string other = key;
      other[at] = 'x';
      EXPECT_EQ(dictionary.find(other), nullptr) << length << " differing at " << at;
    }
  }
}

// Writing over a dictionary entry by entry gives what building it anew gives, whatever it held.
TEST(ADictionary, WrittenOverIsTheDictionaryWrittenWhateverItHeldBefore) {
  const Dictionary kWritten{{"sinr0", 12.5f}, {"rsrp0", -90}, {"timestamp", "2017-07-14 02:40:00"}};
  const Dictionary kBefore[] = {
      {},
      kWritten,
      {{"timestamp", "2017-07-14 02:39:59"}, {"sinr0", 3}, {"rsrp0", "text"}},
      {{"sinr0", List{1, 2}}, {"a", 1}, {"b", 2}, {"c", 3}, {"timestamp", Dictionary{}}},
  };
  for (const Dictionary& before : kBefore) {
    Dictionary dictionary = before;
    std::size_t index = 0;
    for (const auto& [key, value] : kWritten)
      dictionary.writeOver(index++, key, value);
    dictionary.truncate(index);
    EXPECT_EQ(dictionary.description(), kWritten.description()) << before.description();
  }
}

TEST(ADictionary, TakesTheLastOfRepeatedKeysInAnInitializerList) {
  const Dictionary dictionary{{"a", 1}, {"b", 2}, {"a", 3}};
  EXPECT_EQ(dictionary.size(), 2u);
  EXPECT_EQ(*dictionary.find("a"), Value(3));
  EXPECT_EQ(dictionary.begin()->first, "a");
}

TEST(AValueDescription, WritesTextAloneWithoutQuotesButQuotesItInsideContainers) {
  EXPECT_EQ(Value("say \"hi\"").description(), "say \"hi\"");
  EXPECT_EQ(Value(List{"a\"b", "c\\d"}).description(), R"(["a\"b", "c\\d"])");
  EXPECT_EQ(Value(Dictionary{{"k\"", "v"}}).description(), R"(["k\"": "v"])");
}

TEST(AValueDescription, WritesListsAndDictionariesInBracketsInTheirOwnOrder) {
  EXPECT_EQ(Value(List{1, 3, 7}).description(), "[1, 3, 7]");
  EXPECT_EQ(Value(Dictionary{}).description(), "[:]");
  EXPECT_EQ(Value(Dictionary{{"b", 1}, {"a", "x"}}).description(), R"(["b": 1, "a": "x"])");
  EXPECT_EQ(Value(Dictionary{{"l", List{Dictionary{}, List{}}}, {"d", Dictionary{{"n", Value()}}}})
                .description(),
            R"(["l": [[:], []], "d": ["n": (null)]])");
}

TEST(AValueDescription, PrintsFloatsInTheirShortestFormWithAFractionalPart) {
  EXPECT_EQ(Value(5.0).description(), "5.0");
  EXPECT_EQ(Value(1.4f).description(), "1.4");
  EXPECT_EQ(Value(-0.0).description(), "-0.0");
  EXPECT_EQ(Value(1e20).description(), "1e+20");
  EXPECT_EQ(Value(INFINITY).description(), "inf");
  EXPECT_EQ(Value(-std::nan("")).description(), "nan");
}

TEST(AValueDescription, EscapesAQuoteOrBackslashWhereverItStandsInTextOfAnyLength) {
  for (std::size_t length = 1; length <= 24; ++length) {
    for (std::size_t position = 0; position < length; ++position) {
      for (const char escaped : {'"', '\\'}) {
        // Neighbours of both characters in the code table, and a UTF-8 sequence.
        std::string text = std::string("!#[]\xc3\xa9xyz0123456789ABCDEFGHIJ").substr(0, length);
        text[position] = escaped;
        std::string quoted = text;
        quoted.insert(position, 1, '\\');
        EXPECT_EQ(Value(List{text}).description(), "[\"" + quoted + "\"]") << text;
        EXPECT_EQ(Dictionary({{text, 1}}).description(), "[\"" + quoted + "\": 1]") << text;
      }
    }
  }
}

TEST(AValueDescription, WritesTextThatIsAllEscapesAndTheLongestNumbersInFull) {
  EXPECT_EQ(Value(Dictionary{{"\"\"", List{"\\\\\\", ""}}}).description(),
            R"(["\"\"": ["\\\\\\", ""]])");
  EXPECT_EQ(
      Value(
          List{std::numeric_limits<std::int32_t>::min(), std::numeric_limits<std::uint32_t>::max(),
               std::numeric_limits<std::int64_t>::min(), std::numeric_limits<std::uint64_t>::max()})
          .description(),
      "[-2147483648, 4294967295, -9223372036854775808, 18446744073709551615]");
  EXPECT_EQ(Value(List{true, false}).description(), "[1, 0]");
  EXPECT_EQ(Value(List{-std::numeric_limits<double>::min(), -std::numeric_limits<double>::max(),
                       -std::numeric_limits<double>::denorm_min(), -0.00012345678901234567,
                       123456789012345680.0, -std::numeric_limits<float>::min(),
                       -std::numeric_limits<float>::max()})
                .description(),
            "[-2.2250738585072014e-308, -1.7976931348623157e+308, -5e-324, "
            "-0.00012345678901234567, 123456789012345680.0, -1.1754944e-38, -3.4028235e+38]");
}

TEST(AValueDescription, WritesBytesInGroupsOfFourInHexadecimal) {
  EXPECT_EQ(Value(Bytes{0x0a, 0x1b, 0x2c, 0x3d, 0x4e}).description(), "<0a1b2c3d 4e>");
  EXPECT_EQ(Value(Bytes{}).description(), "<>");
}

TEST(AValueDescription, IsTheSameForAContainerAloneAndInsideAValue) {
  const List list{"a", 1};
  const Dictionary dictionary{{"a", list}};
  EXPECT_EQ(description(list), Value(list).description());
  EXPECT_EQ(dictionary.description(), Value(dictionary).description());
}

}  // namespace
}  // namespace platform
