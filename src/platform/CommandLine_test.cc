#include "platform/CommandLine.h"

#include <gtest/gtest.h>

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
}

}  // namespace
}  // namespace platform
