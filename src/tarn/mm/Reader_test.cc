#include "tarn/mm/Reader.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cmath>
#include <limits>

namespace tarn::mm {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;

Value real(double number) {
  return {"d", number};
}
Value unsignedInt(std::uint64_t number) {
  return {"u", number};
}
Value text(std::string value) {
  return {"s", std::move(value)};
}

TEST(AReader, AnswersWellFormedValuesAndDropsTheRestWithOneLineEach) {
  const Dict dict = {
      {"rsrp", real(-97.5)},
      {"nan", real(std::nan(""))},
      {"infinite", real(std::numeric_limits<double>::infinity())},
      {"low", real(-200)},
      {"string", text("-90")},
      {"earfcn", unsignedInt(6300)},
      {"big", unsignedInt(1u << 20)},
      {"pci", text("1A0")},
      {"notHex", text("1G")},
      {"empty", text("")},
      {"hexTooBig", text("200")},
      {"broken", {"d", std::monostate{}}},
  };
  Problems problems;
  const Reader reader(dict, "Signal.Lte", problems);
  EXPECT_EQ(reader.real("rsrp", -156, -31), -97.5);
  EXPECT_EQ(reader.real("missing", -156, -31), std::nullopt);
  EXPECT_EQ(reader.unsignedInt("earfcn", 262143), 6300u);
  EXPECT_EQ(reader.hex("pci", 503), 0x1A0u);
  EXPECT_THAT(problems, IsEmpty());

  EXPECT_EQ(reader.real("nan", -156, -31), std::nullopt);
  EXPECT_EQ(reader.real("infinite", -156, -31), std::nullopt);
  EXPECT_EQ(reader.real("low", -156, -31), std::nullopt);
  EXPECT_EQ(reader.real("string", -156, -31), std::nullopt);
  EXPECT_EQ(reader.unsignedInt("big", 262143), std::nullopt);
  EXPECT_EQ(reader.hex("notHex", 503), std::nullopt);
  EXPECT_EQ(reader.text("empty"), std::nullopt);
  EXPECT_EQ(reader.hex("hexTooBig", 0xFF), std::nullopt);
  EXPECT_EQ(reader.real("broken", -156, -31), std::nullopt);
  EXPECT_EQ(reader.dictionary("rsrp"), nullptr);
  EXPECT_THAT(problems, ElementsAre("Signal.Lte \"nan\": not a number; dropped",
                                    "Signal.Lte \"infinite\": not a number; dropped",
                                    "Signal.Lte \"low\": -200 is outside -156 to -31; dropped",
                                    "Signal.Lte \"string\": wanted d, got s; dropped",
                                    "Signal.Lte \"big\": 1048576 is above 262143; dropped",
                                    "Signal.Lte \"notHex\": \"1G\" is not hexadecimal; dropped",
                                    "Signal.Lte \"hexTooBig\": 200 is above FF; dropped",
                                    "Signal.Lte \"rsrp\": wanted a{sv}, got d; dropped"));
}

}  // namespace
}  // namespace tarn::mm
