#include "tarn/Ipc.h"

#include <gtest/gtest.h>

using platform::Dictionary;
using platform::List;
using platform::Value;
using tarn::ipc::Object;

namespace {

TEST(AnIpcObject, BecomesAPlainDictionaryWithItsEntriesInOrderAndNestedValuesConverted) {
  Object record;
  record.set("kKeyMetricID", Object::integer(-1));
  record.set("kKeyPayload", Object::bytes({0x0A, 0xFF}));
  record.set("note", Object::text("rrc"));
  record.set("none", Object());
  record.set("cells", Object::array(
                          {Object::integer(3), Object::dictionary({{"pci", Object::integer(7)}})}));
  record.set("kKeyMetricID", Object::integer(0x3C4E04));

  const Value plain = tarn::ipc::toPlainDictionary(record);

  EXPECT_EQ(plain, Value(Dictionary{
                       {"kKeyMetricID", std::int64_t{0x3C4E04}},
                       {"kKeyPayload", platform::Bytes{0x0A, 0xFF}},
                       {"note", "rrc"},
                       {"none", nullptr},
                       {"cells", List{std::int64_t{3}, Dictionary{{"pci", std::int64_t{7}}}}}}));
  ASSERT_TRUE(plain.isDictionary());
  EXPECT_EQ(plain.asDictionary()->begin()->first, "kKeyMetricID");
}

TEST(AnIpcObject, IsNullForAByteBufferLargerThanAMessageCarries) {
  EXPECT_TRUE(Object::bytes(platform::Bytes(Object::kMaxBufferSize + 1)).isNull());
  EXPECT_FALSE(Object::bytes({}).isNull());
}

}  // namespace
