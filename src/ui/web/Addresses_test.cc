#include <gtest/gtest.h>

#include "ui/web/Address.h"
#include "ui/web/ListenAddress.h"

namespace ui::web {
namespace {

TEST(AnAddress, NamesTheTextsOfTheRowsTappedFromTheRoot) {
  EXPECT_EQ(decodePath("/"), Path{});
  EXPECT_EQ(decodePath("/LTE/CA%20Status"), (Path{"LTE", "CA Status"}));
  EXPECT_EQ(decodePath("/LTE/CA%20Status/"), (Path{"LTE", "CA Status"}));
  EXPECT_EQ(decodePath("/a%2Fb"), Path{"a/b"});
  EXPECT_EQ(decodePath("/caf%C3%a9+x"), Path{"caf\xC3\xA9+x"});
}

TEST(AnAddress, IsRefusedWhenItIsNotAPathOrHasAnEmptyOrBrokenSegment) {
  for (const char* address : {"", "LTE", "//", "/LTE//x", "/%", "/%2", "/%zz", "/ab%2"})
    EXPECT_EQ(decodePath(address), std::nullopt) << address;
}

TEST(AnAddress, EscapesEverythingButUnreservedCharactersAndRoundTrips) {
  const Path path{"Sel Resel/Parameters", "C-DRX_1.0~", "\"<x>&'?#%", std::string("\0\xFF", 2)};
  const std::string address = encodePath(path);
  EXPECT_EQ(address, "/Sel%20Resel%2FParameters/C-DRX_1.0~/%22%3Cx%3E%26%27%3F%23%25/%00%FF");
  EXPECT_EQ(decodePath(address), path);
  EXPECT_EQ(encodePath({}), "/");
  EXPECT_EQ(appendToAddress("/", "LTE"), "/LTE");
  EXPECT_EQ(appendToAddress("/LTE", "CA Status"), "/LTE/CA%20Status");
}

TEST(AQuery, GivesItsDecodedParametersOrNothingWhenAnEscapeIsBroken) {
  const std::pair<const char*, std::optional<QueryParameters>> cases[] = {
      {"", QueryParameters{}},
      {"name=lte.rsrp&since=0", QueryParameters{{"name", "lte.rsrp"}, {"since", "0"}}},
      {"name=a+b%2Bc&&flag", QueryParameters{{"name", "a b+c"}, {"flag", ""}}},
      {"since=1&since=2&=x", QueryParameters{{"since", "2"}, {"", "x"}}},
      {"name=%zz", std::nullopt},
      {"na%2=1", std::nullopt},
  };
  for (const auto& [query, parameters] : cases)
    EXPECT_EQ(decodeQuery(query), parameters) << query;
}

TEST(AListenAddress, TakesAnAddressAndAPort) {
  EXPECT_EQ(browserAddress(*parseListenAddress("127.0.0.1:8080")), "http://127.0.0.1:8080/");
  EXPECT_EQ(browserAddress(*parseListenAddress("localhost:0")), "http://127.0.0.1:0/");
  EXPECT_EQ(browserAddress(*parseListenAddress("[::1]:80")), "http://[::1]:80/");
  // Every address of the machine: the browser on it still reaches it over loopback.
  EXPECT_EQ(browserAddress(*parseListenAddress("0.0.0.0:8080")), "http://127.0.0.1:8080/");
}

TEST(AListenAddress, IsRefusedWithoutAUsablePortOrAddress) {
  for (const char* text : {"", "8080", "127.0.0.1", "127.0.0.1:", "127.0.0.1:65536",
                           "127.0.0.1:80x", "127.0.0.1:-1", "example.com:80", "::1:80"})
    EXPECT_EQ(parseListenAddress(text), std::nullopt) << text;
}

}  // namespace
}  // namespace ui::web
