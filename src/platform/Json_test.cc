#include "platform/Json.h"

#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>
#include <limits>

namespace platform {
namespace {

TEST(TheJsonEncoder, WritesIntegersExactlyOverTheFull64BitRanges) {
  EXPECT_EQ(toJson(std::numeric_limits<std::int64_t>::min()), "-9223372036854775808");
  EXPECT_EQ(toJson(std::numeric_limits<std::uint64_t>::max()), "18446744073709551615");
}

TEST(TheJsonEncoder, MarksFloatsAsFloatsAndWritesNonFiniteOnesAsNull) {
  EXPECT_EQ(toJson(5.0), "5.0");
  EXPECT_EQ(toJson(-1e-7), "-1e-07");
  EXPECT_EQ(toJson(List{INFINITY, -INFINITY, std::nan("")}), "[null,null,null]");
}

TEST(TheJsonEncoder, WritesBooleansNullAndBytesInTheirJsonForms) {
  EXPECT_EQ(toJson(List{true, false, Value()}), "[true,false,null]");
  EXPECT_EQ(toJson(Bytes{0x0a, 0xff, 0x00, 0x10, 0x20}), R"("0aff001020")");
}

TEST(TheJsonEncoder, WritesDictionariesAsCompactObjectsInInsertionOrder) {
  const Dictionary dictionary{{"z", 1}, {"a", List{Dictionary{}, List{}}}, {"m", "x"}};
  EXPECT_EQ(toJson(dictionary), R"({"z":1,"a":[{},[]],"m":"x"})");
  EXPECT_EQ(toJson(Value(dictionary)), toJson(dictionary));
}

TEST(TheJsonEncoder, EscapesQuotesBackslashesAndControlCharacters) {
  EXPECT_EQ(toJson(R"(a"b\c)"), R"("a\"b\\c")");
  EXPECT_EQ(toJson(std::string("\n\t\x01\x1f\x7f/", 6)), "\"\\u000a\\u0009\\u0001\\u001f\x7f/\"");
  EXPECT_EQ(toJson(std::string("a\0b", 3)), R"("a\u0000b")");
}

TEST(TheJsonEncoder, PassesWellFormedUtf8Through) {
  const std::string text =
      "\xC3\xA9 \xE2\x82\xAC \xF0\x9F\x93\xB6 \xF4\x8F\xBF\xBF";  // é € 📶 U+10FFFF
  EXPECT_EQ(toJson(text), "\"" + text + "\"");
}

TEST(TheJsonEncoder, ReplacesEachIllFormedUtf8SubpartWithOneReplacementCharacter) {
  const std::string r = "\xEF\xBF\xBD";
  EXPECT_EQ(toJson("a\x80z"), "\"a" + r + "z\"");                      // lone continuation
  EXPECT_EQ(toJson("a\xE2\x82"), "\"a" + r + "\"");                    // truncated at the end
  EXPECT_EQ(toJson("\xC0\xAF"), "\"" + r + r + "\"");                  // overlong
  EXPECT_EQ(toJson("\xED\xA0\x80"), "\"" + r + r + r + "\"");          // surrogate
  EXPECT_EQ(toJson("\xF4\x90\x80\x80"), "\"" + r + r + r + r + "\"");  // above U+10FFFF
  EXPECT_EQ(toJson("\xFF\xFE"), "\"" + r + r + "\"");
}

}  // namespace
}  // namespace platform
