#include "ui/web/ListenAddress.h"

#include <gtest/gtest.h>

namespace ui::web {
namespace {

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
