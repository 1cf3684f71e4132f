#include "app/ServiceOption.h"

#include <gtest/gtest.h>

namespace {

TEST(AServiceOption, NamesTheServiceInsideNorvoOrTheBusToFindTarndOn) {
  const struct {
    std::string_view text;
    std::optional<app::ServiceChoice> choice;
  } cases[] = {
      {"builtin", app::ServiceChoice{}},
      {"dbus", app::ServiceChoice{.bus = "session"}},
      {"dbus:session", app::ServiceChoice{.bus = "session"}},
      {"dbus:system", app::ServiceChoice{.bus = "system"}},
      {"dbus:unix:path=/tmp/bus", app::ServiceChoice{.bus = "unix:path=/tmp/bus"}},
      {"dbus:", std::nullopt},
      {"DBus", std::nullopt},
      {"", std::nullopt},
  };
  for (const auto& [text, choice] : cases)
    EXPECT_EQ(app::parseServiceChoice(text), choice) << text;
}

}  // namespace
