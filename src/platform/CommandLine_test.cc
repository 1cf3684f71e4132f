#include "platform/CommandLine.h"

#include <gtest/gtest.h>

#include <sstream>
#include <vector>

namespace platform {
namespace {

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
