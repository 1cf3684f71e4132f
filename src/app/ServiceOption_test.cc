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
      {"mqtt://broker.lan/fleet/car-7",
       app::ServiceChoice{.bus = {},
                          .broker = tarn::mqtt::BrokerAddress{.tls = false,
                                                              .user = {},
                                                              .password = {},
                                                              .host = "broker.lan",
                                                              .port = 1883,
                                                              .path = "fleet/car-7"},
                          .caFile = {}}},
      {"mqtts://u:p@[::1]/a/b/car-7/",
       app::ServiceChoice{.bus = {},
                          .broker = tarn::mqtt::BrokerAddress{.tls = true,
                                                              .user = "u",
                                                              .password = "p",
                                                              .host = "::1",
                                                              .port = 8883,
                                                              .path = "a/b/car-7"},
                          .caFile = {}}},
      {"mqtt://broker.lan/fleet", std::nullopt},  // which device?
      {"mqtt://broker.lan/fleet/+", std::nullopt},
      {"dbus:", std::nullopt},
      {"DBus", std::nullopt},
      {"", std::nullopt},
  };
  for (const auto& [text, choice] : cases)
    EXPECT_EQ(app::parseServiceChoice(text), choice) << text;
}

}  // namespace
