#include "propertylist/value/SerializedPropertyList.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "tests/propertylist/PropertyListTesting.h"

namespace accounts {
namespace {

/// Gives each text of an array as a piece.
bool giveTexts(const PropertyValue& value, const SerializedPropertyList::Taker& take) {
  for (const PropertyValue& element : *value.asArray()) {
    if (!take(*element.asText())) {
      return false;
    }
  }
  return true;
}

TEST(SerializedPropertyList, NoneHasNoValueAndNoBytes) {
  const SerializedPropertyList none;
  EXPECT_FALSE(none);
  EXPECT_EQ(none.value(), nullptr);
  EXPECT_TRUE(piecesOf(none).empty());
}

TEST(SerializedPropertyList, ItsValueIsTheOneThatItWasMadeOf) {
  const PropertyArray texts = {"a", "b"};
  const SerializedPropertyList serialized(texts, &giveTexts);
  ASSERT_TRUE(serialized);
  EXPECT_TRUE(serialized.value()->asArray()->isSameAs(texts));
}

TEST(SerializedPropertyList, ItsBytesCanBeAskedForAgainAndFromACopy) {
  SerializedPropertyList copy;
  {
    const SerializedPropertyList original(PropertyArray{"a", "b"}, &giveTexts);
    EXPECT_EQ(bytesOf(original), "ab");
    copy = original;
  }
  EXPECT_EQ(bytesOf(copy), "ab");
  EXPECT_EQ(piecesOf(copy), (std::vector<std::string>{"a", "b"}));
}

TEST(SerializedPropertyList, GivingEndsWithThePieceThatIsNotGoneOnAfter) {
  const SerializedPropertyList serialized(PropertyArray{"a", "b"}, &giveTexts);
  int count = 0;
  EXPECT_FALSE(serialized.giveTo([&count](std::string_view) { return ++count < 1; }));
  EXPECT_EQ(count, 1);
}

}  // namespace
}  // namespace accounts
