#include <gtest/gtest.h>

#include <random>
#include <string>

#include "propertylist/BinaryPropertyList.h"
#include "propertylist/PropertyListLimits.h"
#include "tests/propertylist/PropertyListTesting.h"

namespace accounts {
namespace {

using testing::writeBinary;

/// A writer that has already written something else.
class BinaryWriterMemory : public ::testing::Test {
 protected:
  std::string write(const PropertyValue& value) {
    const std::optional<BytesInPieces> bytes = writer_.write(value, error);
    EXPECT_TRUE(bytes) << error.text;
    return bytes ? bytes->whole() : "";
  }

  PropertyListError error;

 private:
  BinaryPropertyListWriter writer_;
};

PropertyDictionary account(const std::string& name) {
  return {{"Identifier", name}, {"Type", "Mail"}, {"Children", PropertyArray{name + "-child", 7}}};
}

TEST_F(BinaryWriterMemory, TheSameValueGivesTheSameBytesAgain) {
  const PropertyValue value = PropertyArray{account("A"), account("B")};

  const std::string first = write(value);

  EXPECT_EQ(write(value), first);
  EXPECT_EQ(first, writeBinary(value));
}

TEST_F(BinaryWriterMemory, AnEqualValueInOtherMemoryGivesTheSameBytes) {
  const std::string first = write(PropertyArray{account("A"), account("B")});

  EXPECT_EQ(write(PropertyArray{account("A"), account("B")}), first);
}

TEST_F(BinaryWriterMemory, AValueThatSharesPartsGivesTheBytesThatItGivesAlone) {
  const PropertyDictionary kept = account("A");
  write(PropertyArray{account("gone"), kept, account("B")});

  const PropertyValue value = PropertyArray{account("new"), kept};

  EXPECT_EQ(write(value), writeBinary(value));
}

TEST_F(BinaryWriterMemory, WhatOnlyEarlierValuesHadIsNotWritten) {
  write(PropertyArray{"earlier", 1, 2, 3});

  const std::string bytes = write(PropertyArray{"later"});

  EXPECT_EQ(bytes.find("earlier"), std::string::npos);
  EXPECT_EQ(bytes, writeBinary(PropertyArray{"later"}));
}

TEST_F(BinaryWriterMemory, APartThatChangedIsWrittenAsItIsNow) {
  PropertyDictionary changing = account("A");
  write(PropertyArray{changing, account("B")});

  changing.set("Type", "Exchange");
  const PropertyValue value = PropertyArray{changing, account("B")};

  EXPECT_EQ(write(value), writeBinary(value));
}

TEST_F(BinaryWriterMemory, BytesThatWereATextMayBeADataLater) {
  const SharedBytes bytes("both");
  write(PropertyArray{Text(bytes)});

  const PropertyValue value = PropertyArray{PropertyData(bytes), Text(bytes)};

  EXPECT_EQ(write(value), writeBinary(value));
}

TEST_F(BinaryWriterMemory, AnotherWritersNotesOnAValueMeanNothing) {
  const PropertyValue value = PropertyArray{account("A"), account("B")};
  BinaryPropertyListWriter other;
  EXPECT_TRUE(other.write(PropertyArray{"first", account("C"), value}, error));

  EXPECT_EQ(write(value), writeBinary(value));
}

TEST_F(BinaryWriterMemory, ARefusedValueLeavesTheWriterUsable) {
  const PropertyValue good = PropertyArray{account("A")};
  write(good);
  BinaryPropertyListWriter writer;
  EXPECT_TRUE(writer.write(good, error));

  EXPECT_FALSE(writer.write(testing::nestedArrays(kMaximumNestingDepth + 1), error));

  EXPECT_NE(error.text.find("nested deeper"), std::string::npos) << error.text;
  const std::optional<BytesInPieces> bytes = writer.write(good, error);
  ASSERT_TRUE(bytes);
  EXPECT_EQ(bytes->whole(), writeBinary(good));
}

TEST_F(BinaryWriterMemory, AContainerKnownFromALowerPlaceMayBeTooHighForAnother) {
  const PropertyValue high = testing::nestedArrays(kMaximumNestingDepth - 1);
  BinaryPropertyListWriter writer;
  EXPECT_TRUE(writer.write(high, error));

  EXPECT_FALSE(writer.write(PropertyArray{PropertyValue(PropertyArray{high})}, error));
}

TEST_F(BinaryWriterMemory, ManyStagesOfOneValueGiveTheBytesThatEachGivesAlone) {
  constexpr int kStages = 60;
  std::mt19937 random(1);
  PropertyArray accounts;
  for (int stage = 0; stage < kStages; ++stage) {
    const std::string name = "account-" + std::to_string(random() % 20);
    if (accounts.empty() || random() % 3 == 0) {
      accounts.append(account(name));
    } else {
      accounts.replace(random() % accounts.size(), account(name + "\xC3\xA4"));
    }
    const PropertyValue value = PropertyDictionary{{"Accounts", accounts}, {"Version", stage}};

    ASSERT_EQ(write(value), writeBinary(value)) << "stage " << stage;
  }
}

}  // namespace
}  // namespace accounts
