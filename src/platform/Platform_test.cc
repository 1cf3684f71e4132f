#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>
#include <limits>
#include <ostream>
#include <sstream>
#include <string>
#include <vector>

#include "platform/CommandLine.h"
#include "platform/Format.h"
#include "platform/Json.h"
#include "platform/Value.h"

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

TEST(TheJsonEncoder, WritesEachValueInItsJsonForm) {
  const std::string r = "\xEF\xBF\xBD";  // the replacement character
  const std::string utf8 =
      "\xC3\xA9 \xE2\x82\xAC \xF0\x9F\x93\xB6 \xF4\x8F\xBF\xBF";  // é € 📶 U+10FFFF
  const Dictionary nested{{"z", 1}, {"a", List{Dictionary{}, List{}}}, {"m", "x"}};
  const std::pair<Value, std::string> cases[] = {
      {std::numeric_limits<std::int64_t>::min(), "-9223372036854775808"},
      {std::numeric_limits<std::uint64_t>::max(), "18446744073709551615"},
      {5.0, "5.0"},
      {-1e-7, "-1e-07"},
      {List{INFINITY, -INFINITY, std::nan("")}, "[null,null,null]"},
      {List{true, false, Value()}, "[true,false,null]"},
      {Bytes{0x0a, 0xff, 0x00, 0x10, 0x20}, R"("0aff001020")"},
      {nested, R"({"z":1,"a":[{},[]],"m":"x"})"},
      {R"(a"b\c)", R"("a\"b\\c")"},
      {std::string("\n\t\x01\x1f\x7f/", 6), "\"\\u000a\\u0009\\u0001\\u001f\x7f/\""},
      {std::string("a\0b", 3), R"("a\u0000b")"},
      {utf8, "\"" + utf8 + "\""},
      // Each ill-formed UTF-8 subpart becomes one replacement character.
      {"a\x80z", "\"a" + r + "z\""},                      // lone continuation
      {"a\xE2\x82", "\"a" + r + "\""},                    // truncated at the end
      {"\xC0\xAF", "\"" + r + r + "\""},                  // overlong
      {"\xED\xA0\x80", "\"" + r + r + r + "\""},          // surrogate
      {"\xF4\x90\x80\x80", "\"" + r + r + r + r + "\""},  // above U+10FFFF
      {"\xFF\xFE", "\"" + r + r + "\""},
  };
  for (const auto& [value, json] : cases)
    EXPECT_EQ(toJson(value), json) << value.description();
  EXPECT_EQ(toJson(nested), toJson(Value(nested)));
}

enum class RrcState : std::uint8_t { Idle = 0, Connected = 3 };

struct Cell {
  int id;
  std::string description() const { return "Cell " + std::to_string(id); }
};

TEST(Format, FillsTheSystemsOwnLogTexts) {
  EXPECT_EQ(format("%s: error=%d msg=%s", "addConfig", -5, std::string("busy")),
            "addConfig: error=-5 msg=busy");
  EXPECT_EQ(format("%s: MetricsTrigger dict=%@", std::string_view("listen"),
                   Dictionary{{"kKeyMetricID", 0x3CD313}, {"kKeyPayload", Bytes{1, 2}}}),
            R"(listen: MetricsTrigger dict=["kKeyMetricID": 3986195, "kKeyPayload": <0102>])");
  EXPECT_EQ(format("Unknown tag: %x:%u", 0x3Cu, 2u), "Unknown tag: 3c:2");
  EXPECT_EQ(format("idx (%tu) is out of range (%tu)", std::size_t{7}, std::size_t{3}),
            "idx (7) is out of range (3)");
  EXPECT_EQ(format("%2X", 0x3CD313), "3CD313");
  EXPECT_EQ(format("%2X", 0xA), " A");
}

TEST(Format, PrintsPercentSignsAndPlainTextAsWritten) {
  EXPECT_EQ(format("100%% done"), "100% done");
  EXPECT_EQ(format("no conversions", 1, 2), "no conversions");
}

TEST(Format, HonoursFlagsAndWidthsForIntegers) {
  EXPECT_EQ(format("[%5d]", 42), "[   42]");
  EXPECT_EQ(format("[%-5d]", 42), "[42   ]");
  EXPECT_EQ(format("[%05d]", -42), "[-0042]");
  EXPECT_EQ(format("[%+d|% d|%+d]", 1, 1, -1), "[+1| 1|-1]");
  EXPECT_EQ(format("[%#x|%#X|%#o|%#x]", 255, 255, 8, 0), "[0xff|0XFF|010|0]");
  EXPECT_EQ(format("[%08.3d]", 7), "[     007]");
  EXPECT_EQ(format("[%.0d|%.0x]", 0, 0), "[|]");
}

TEST(Format, PrintsNegativeArgumentsOfUnsignedConversionsAtTheirOwnWidth) {
  EXPECT_EQ(format("%x", std::int32_t{-1}), "ffffffff");
  EXPECT_EQ(format("%lx", std::int64_t{-1}), "ffffffffffffffff");
  EXPECT_EQ(format("%hhx", std::int8_t{-1}), "ff");
}

TEST(Format, PrintsEveryIntegerByItsOwnSignedness) {
  EXPECT_EQ(format("%d", std::numeric_limits<std::uint64_t>::max()), "18446744073709551615");
  EXPECT_EQ(format("%d", std::numeric_limits<std::int64_t>::min()), "-9223372036854775808");
  EXPECT_EQ(format("%d %d", true, 'A'), "1 65");
  EXPECT_EQ(format("%d", RrcState::Connected), "3");
}

TEST(Format, PrintsCharactersAndFloatingValuesAsPrintfDoes) {
  EXPECT_EQ(format("[%c%c|%3c]", 'o', 107, 'x'), "[ok|  x]");
  EXPECT_EQ(format("%.2f", -10.5f), "-10.50");
  EXPECT_EQ(format("%08.3f", -3.14159), "-003.142");
  EXPECT_EQ(format("%e", 12345.678), "1.234568e+04");
  EXPECT_EQ(format("%g %g %g", 0.0001, 100000.0, 1e6), "0.0001 100000 1e+06");
  EXPECT_EQ(format("%.0f", 2.5), "2");
}

TEST(Format, PadsNonFiniteFloatsWithSpacesOnly) {
  EXPECT_EQ(format("[%05f]", -INFINITY), "[ -inf]");
  EXPECT_EQ(format("[%6.2f]", std::nan("")), "[   nan]");
}

TEST(Format, PrintsTextWithWidthAndPrecision) {
  EXPECT_EQ(format("[%6s|%-6s|%.2s]", "ab", "cd", "efgh"), "[    ab|cd    |ef]");
  EXPECT_EQ(format("[%06s]", "ab"), "[    ab]");
  EXPECT_EQ(format("%s", static_cast<const char*>(nullptr)), "(null)");
  char buffer[8] = "buf";
  EXPECT_EQ(format("%s", buffer), "buf");
}

TEST(Format, DescribesValuesListsAndObjectsForTextConversions) {
  EXPECT_EQ(format("%@", Value("plain")), "plain");
  EXPECT_EQ(format("%@", Value(List{"a", 1})), R"(["a", 1])");
  EXPECT_EQ(format("%s", Dictionary{}), "[:]");
  EXPECT_EQ(format("[%-8@]", Cell{7}), "[Cell 7  ]");
}

TEST(Format, ReadsNumbersOutOfValues) {
  EXPECT_EQ(format("%X", Value(0x3CD30E)), "3CD30E");
  EXPECT_EQ(format("%x", Value(-1)), "ffffffff");
  EXPECT_EQ(format("%u", Value(std::numeric_limits<std::uint64_t>::max())), "18446744073709551615");
  EXPECT_EQ(format("%.1f", Value(-10.5f)), "-10.5");
}

TEST(Format, MarksMissingArgumentsAndKeepsGoing) {
  EXPECT_EQ(format("%d and %s.", 1), "1 and %!s(missing).");
  EXPECT_EQ(format("%@"), "%!@(missing)");
}

TEST(Format, MarksArgumentsThatDoNotSuitTheConversion) {
  EXPECT_EQ(format("%d", "abc"), "%!d(string=abc)");
  EXPECT_EQ(format("%s", 5), "%!s(integer=5)");
  EXPECT_EQ(format("%x", 1.5), "%!x(float=1.5)");
  EXPECT_EQ(format("%d", Value(1.5)), "%!d(value=1.5)");
  EXPECT_EQ(format("%d", Cell{2}), "%!d(object=Cell 2)");
  EXPECT_EQ(format("%d|%d", "x", 2), "%!d(string=x)|2");
}

TEST(Format, MarksUnknownConversionsWithoutUsingAnArgument) {
  EXPECT_EQ(format("%k %d", 4), "%!k(unknown) 4");
}

TEST(Format, MarksAConversionCutShortByTheEndOfTheFormat) {
  EXPECT_EQ(format("abc %-08.2l", 1), "abc %!(incomplete)");
}

TEST(Format, LimitsAbsurdWidths) {
  EXPECT_EQ(format("%99999999999999999999999d", 1).size(), 4096u);
  EXPECT_EQ(format("%.99999999999999999999999f", 1.0).size(), 4098u);
}

// What is wrong with the arguments of `convert IN [--out FILE] [--quiet]`.
std::string convertFault(std::vector<std::string_view> arguments) {
  std::optional<std::string_view> in, out;
  bool quiet = false;
  const CommandLineOption options[] = {{"--out", &out, "a file name"}, {"--quiet", &quiet}};
  return readCommandLine(arguments, options, CommandLinePositional{&in, "input", "which input?"});
}

TEST(ACommandLine, SaysInOneLineWhatIsWrongWithItsShape) {
  EXPECT_EQ(convertFault({"in", "--verbose"}), "unknown option --verbose");
  EXPECT_EQ(convertFault({"in", "--out"}), "--out needs a file name");
  EXPECT_EQ(convertFault({"in", "--quiet", "other"}), "one input at a time, not also other");
  EXPECT_EQ(convertFault({"--out", "in"}), "which input?");
  EXPECT_EQ(convertFault({"in", "--out", "a", "--out", "b"}), "--out is given twice; give it once");
  EXPECT_EQ(convertFault({"in", "--quiet", "--quiet"}), "--quiet is given twice; give it once");
}

TEST(ACommandLine, OpensACommandWithItsUsageOnHelpOrOnAWrongShape) {
  const CommandUsage command{"convert", "usage: convert IN\n"};
  const struct {
    std::vector<std::string_view> arguments;
    std::optional<int> exit;
    std::string_view out;
    std::string_view errors;
  } cases[] = {
      {{"in"}, std::nullopt, "", ""},
      {{"in", "--what", "-h"}, 0, "usage: convert IN\n", ""},
      {{"in", "--what"}, 2, "", "convert: unknown option --what\n\nusage: convert IN\n"},
  };
  for (const auto& each : cases) {
    std::optional<std::string_view> in;
    std::ostringstream out, errors;
    EXPECT_EQ(openCommandLine(command, each.arguments, {},
                              CommandLinePositional{&in, "input", "which input?"}, out, errors),
              each.exit);
    EXPECT_EQ(out.str(), each.out);
    EXPECT_EQ(errors.str(), each.errors);
  }
}

}  // namespace
}  // namespace platform
