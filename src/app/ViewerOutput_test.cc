#include <gtest/gtest.h>

#include "app/LogDestination.h"
#include "app/StatusLine.h"

namespace app {
namespace {

TEST(TheLogDestination, IsTheStatusLineOnATerminalAndTheLinesElsewhere) {
  const std::optional<std::string> home = "/home/ann/.local/state/norvo/norvo.log";
  struct Case {
    std::optional<std::string_view> option;
    bool terminal;
    std::optional<std::string> defaultFile;
    LogDestination destination;
  };
  const Case cases[] = {
      {std::nullopt, true, home, {home, true}},
      {std::nullopt, false, home, {std::nullopt, false}},
      {std::nullopt, true, std::nullopt, {std::nullopt, false}},
      {"-", true, home, {std::nullopt, false}},
      {"-", false, home, {std::nullopt, false}},
      {"drive.log", true, home, {"drive.log", true}},
      {"drive.log", false, home, {"drive.log", false}},
  };
  for (const Case& c : cases) {
    EXPECT_EQ(chooseLogDestination(c.option, c.terminal, c.defaultFile), c.destination)
        << c.option.value_or("(none)") << " terminal=" << c.terminal;
  }
}

TEST(TheDefaultLogFile, IsUnderTheStateHomeWhenItIsAnAbsolutePath) {
  EXPECT_EQ(defaultLogFile("/state", "/home/ann"), "/state/norvo/norvo.log");
  EXPECT_EQ(defaultLogFile(nullptr, "/home/ann"), "/home/ann/.local/state/norvo/norvo.log");
  EXPECT_EQ(defaultLogFile("relative", "/home/ann"), "/home/ann/.local/state/norvo/norvo.log");
  EXPECT_EQ(defaultLogFile("", "/home/ann"), "/home/ann/.local/state/norvo/norvo.log");
  EXPECT_EQ(defaultLogFile(nullptr, nullptr), std::nullopt);
}

TEST(TheStatusLine, ShowsTheAddressSourceRateAndServingLevelWithinTheTerminalsWidth) {
  StatusFigures figures{"http://127.0.0.1:8080/", "simulated phone", 4.25, std::nullopt, {}, {}};
  EXPECT_EQ(statusText(figures, 200),
            "Open http://127.0.0.1:8080/ | simulated phone | 4.2 metrics/s | no service");
  figures.serving = dashboard::ServingLevel{"LTE", "lte.rsrp", {0, -95.4}};
  figures.servingUnit = "dBm";
  figures.alerts = 1;
  EXPECT_EQ(
      statusText(figures, 200),
      "Open http://127.0.0.1:8080/ | simulated phone | 4.2 metrics/s | LTE -95 dBm | 1 alert");
  figures.alerts = 3;
  EXPECT_TRUE(statusText(figures, 200).ends_with("| 3 alerts"));
  // One column short of the width, so that the terminal never wraps it.
  EXPECT_EQ(statusText(figures, 28), "Open http://127.0.0.1:8080/");
  figures.address.clear();
  EXPECT_TRUE(statusText(figures, 200).starts_with("Norvo is starting | simulated phone |"));
}

}  // namespace
}  // namespace app
