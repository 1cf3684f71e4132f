#include "platform/Base64.h"

#include <gtest/gtest.h>

#include <string>

namespace platform {
namespace {

Bytes bytesOf(std::string_view text) {
  return Bytes(text.begin(), text.end());
}

TEST(Base64, EncodesTheRfcExamplesWithPadding) {
  EXPECT_EQ(base64Encode(bytesOf("")), "");
  EXPECT_EQ(base64Encode(bytesOf("f")), "Zg==");
  EXPECT_EQ(base64Encode(bytesOf("fo")), "Zm8=");
  EXPECT_EQ(base64Encode(bytesOf("foo")), "Zm9v");
  EXPECT_EQ(base64Encode(bytesOf("foobar")), "Zm9vYmFy");
  EXPECT_EQ(base64Encode(Bytes{0xFB, 0xFF, 0xBF}), "+/+/");
}

TEST(Base64, DecodesWhatItEncodesForEveryByteValueAndLength) {
  Bytes bytes;
  for (int i = 0; i < 256; ++i) {
    bytes.push_back(static_cast<std::uint8_t>(255 - i));
    EXPECT_EQ(base64Decode(base64Encode(bytes)), bytes) << "length " << bytes.size();
  }
}

TEST(Base64, RefusesTextThatIsNotStandardBase64) {
  EXPECT_FALSE(base64Decode("Zg="));       // length not a multiple of four
  EXPECT_FALSE(base64Decode("Zg"));        // padding left out
  EXPECT_FALSE(base64Decode("Z=g="));      // padding inside
  EXPECT_FALSE(base64Decode("Zm9v\n"));    // whitespace
  EXPECT_FALSE(base64Decode("Zm 9"));      // blank
  EXPECT_FALSE(base64Decode("-_8A"));      // the URL-safe alphabet
  EXPECT_FALSE(base64Decode("===="));      // padding only
  EXPECT_FALSE(base64Decode("Zg==Zg=="));  // padding before the end
  EXPECT_EQ(base64Decode(""), Bytes{});
}

}  // namespace
}  // namespace platform
