#include "tarn/mm/Selection.h"

#include <gtest/gtest.h>

#include "tarn/mm/Names.h"

namespace tarn::mm {
namespace {

std::map<std::string, Dict, std::less<>> modem(std::string imei) {
  return {
      {std::string(kModemInterface), Dict{{"EquipmentIdentifier", Value{"s", std::move(imei)}}}}};
}

TEST(ChoosingAModem, PicksByPathIndexOrImeiAndTheLowestIndexWithoutASelector) {
  const Objects objects = {
      {"/org/freedesktop/ModemManager1/Modem/12", modem("356938035643809")},
      {"/org/freedesktop/ModemManager1/Modem/3", modem("490154203237518")},
      {"/org/freedesktop/ModemManager1/SIM/3", {{std::string(kSimInterface), Dict{}}}},
  };
  const struct {
    std::string_view selector;
    std::optional<std::string> chosen;
  } cases[] = {
      {"", "/org/freedesktop/ModemManager1/Modem/3"},
      {"12", "/org/freedesktop/ModemManager1/Modem/12"},
      {"/org/freedesktop/ModemManager1/Modem/12", "/org/freedesktop/ModemManager1/Modem/12"},
      {"356938035643809", "/org/freedesktop/ModemManager1/Modem/12"},
      {"4", std::nullopt},
      {"/org/freedesktop/ModemManager1/SIM/3", std::nullopt},
  };
  for (const auto& test : cases)
    EXPECT_EQ(chooseModem(objects, test.selector), test.chosen) << test.selector;
  EXPECT_EQ(chooseModem({}, ""), std::nullopt);
  EXPECT_EQ(modemIndex("/org/freedesktop/ModemManager1/Modem/12"), "12");
}

}  // namespace
}  // namespace tarn::mm
