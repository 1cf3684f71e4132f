#include "platform/Format.h"

#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>
#include <limits>
#include <string>

namespace platform {
namespace {

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

}  // namespace
}  // namespace platform
