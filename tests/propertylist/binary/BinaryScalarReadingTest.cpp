#include <gtest/gtest.h>

#include <bit>
#include <cmath>
#include <limits>
#include <string>

#include "tests/propertylist/PropertyListTesting.h"

namespace accounts {
namespace {

using namespace std::string_literals;

PropertyValue read(std::string_view object) {
  return readBinary(fileWithObject(object));
}

std::string errorOf(std::string_view object) {
  return errorOfReadingBinary(fileWithObject(object));
}

TEST(BinaryScalars, Booleans) {
  EXPECT_EQ(read("\x08"), PropertyValue(false));
  EXPECT_EQ(read("\x09"), PropertyValue(true));
}

TEST(BinaryScalars, IntegersOfOneTwoAndFourBytesAreUnsigned) {
  EXPECT_EQ(read("\x10\xFF"), PropertyValue(255));
  EXPECT_EQ(read("\x11\xFF\xFF"), PropertyValue(65535));
  EXPECT_EQ(read("\x12\xFF\xFF\xFF\xFF"), PropertyValue(4294967295));
}

TEST(BinaryScalars, IntegersOfEightBytesAreSigned) {
  EXPECT_EQ(read("\x13\xFF\xFF\xFF\xFF\xFF\xFF\xFF\xFE"), PropertyValue(-2));
  EXPECT_EQ(read("\x13\x80\0\0\0\0\0\0\0"s),
            PropertyValue(std::numeric_limits<std::int64_t>::min()));
}

TEST(BinaryScalars, AnIntegerOfSixteenBytesIsReadWhenItFitsSixtyFourBits) {
  EXPECT_EQ(read("\x14"s + std::string(8, '\0') + std::string(8, '\xFF')),
            PropertyValue(std::numeric_limits<std::uint64_t>::max()));
  EXPECT_EQ(read("\x14"s + std::string(15, '\0') + "\x05"), PropertyValue(5));
  EXPECT_EQ(read("\x14"s + std::string(15, '\xFF') + "\xFB"), PropertyValue(-5));
}

TEST(BinaryScalars, AnIntegerOfSixteenBytesIsRefusedWhenItDoesNotFit) {
  const std::string expected = "an integer that needs more than 64 bits at byte offset 8";
  EXPECT_TRUE(
      contains(errorOf("\x14"s + std::string(7, '\0') + "\x01" + std::string(8, '\0')), expected));
  EXPECT_TRUE(contains(errorOf("\x14"s + std::string(8, '\xFF') + std::string(8, '\0')), expected));
}

TEST(BinaryScalars, RealsOfFourAndEightBytes) {
  EXPECT_EQ(read("\x22\x3F\xC0\0\0"s), PropertyValue(1.5));
  EXPECT_EQ(read("\x23\xBF\xF8\0\0\0\0\0\0"s), PropertyValue(-1.5));
  EXPECT_EQ(read("\x22\x7F\x80\0\0"s), PropertyValue(std::numeric_limits<double>::infinity()));
}

TEST(BinaryScalars, TheBitsOfANaNAreKept) {
  const PropertyValue value = read("\x23\x7F\xF8\0\0\0\0\x12\x34"s);

  ASSERT_NE(value.asReal(), nullptr);
  EXPECT_EQ(std::bit_cast<std::uint64_t>(*value.asReal()), 0x7FF8000000001234U);
}

TEST(BinaryScalars, DatesAreKeptBitForBit) {
  EXPECT_EQ(read("\x33\x41\xB3\x6F\x28\x30\x80\0\0"s),
            PropertyValue(PropertyDate{std::bit_cast<double>(0x41B36F2830800000U)}));
  EXPECT_EQ(read("\x33\xBF\xE0\0\0\0\0\0\0"s), PropertyValue(PropertyDate{-0.5}));
  EXPECT_EQ(read("\x33\xFF\xF0\0\0\0\0\0\0"s),
            PropertyValue(PropertyDate{-std::numeric_limits<double>::infinity()}));
  const PropertyValue nan = read("\x33\x7F\xF0\0\0\0\0\0\x01"s);
  ASSERT_NE(nan.asDate(), nullptr);
  EXPECT_EQ(std::bit_cast<std::uint64_t>(nan.asDate()->secondsSinceReferenceDate),
            0x7FF0000000000001U);
}

TEST(BinaryScalars, DataKeepsEveryByte) {
  EXPECT_EQ(read("\x43\0\xFF\x80"s), PropertyValue(PropertyData("\0\xFF\x80"s)));
}

TEST(BinaryScalars, EmptyScalarsAndContainers) {
  EXPECT_EQ(read("\x40"), PropertyValue(PropertyData()));
  EXPECT_EQ(read("\x50"), PropertyValue(""));
  EXPECT_EQ(read("\x60"), PropertyValue(""));
  EXPECT_EQ(read("\xA0"), PropertyValue(PropertyArray()));
  EXPECT_EQ(read("\xD0"), PropertyValue(PropertyDictionary()));
}

TEST(BinaryScalars, ALongLengthFollowsAsAnInteger) {
  const std::string text(300, 'x');

  EXPECT_EQ(read("\x5F\x11\x01\x2C" + text), PropertyValue(text));
  EXPECT_EQ(read("\x5F\x13\0\0\0\0\0\0\x01\x2C"s + text), PropertyValue(text));
}

TEST(BinaryScalars, AnEmbeddedNULIsKept) {
  EXPECT_EQ(read("\x53"
                 "a\0b"s),
            PropertyValue("a\0b"s));
  EXPECT_EQ(read("\x62\0\0\x20\xAC"s), PropertyValue("\0\xE2\x82\xAC"s));
}

TEST(BinaryScalars, AnASCIITextWithOtherBytesIsRefused) {
  EXPECT_TRUE(contains(errorOf("\x52\xC3\xA4"), "bytes that are not ASCII at byte offset 8"));
  EXPECT_TRUE(contains(errorOf("\x5C"
                               "12345678901\x80"),
                       "bytes that are not ASCII"));
}

TEST(BinaryScalars, UTF16BecomesUTF8) {
  EXPECT_EQ(read("\x62\0\x41\0\xFC"s), PropertyValue("A\xC3\xBC"));
  EXPECT_EQ(read("\x61\x20\xAC"), PropertyValue("\xE2\x82\xAC"));
  EXPECT_EQ(read("\x62\xD8\x3D\xDE\x00"s), PropertyValue("\xF0\x9F\x98\x80"));
}

TEST(BinaryScalars, AnUnpairedUTF16UnitIsKeptAndWrittenBackAsItWas) {
  const std::string unpaired[] = {
      fileWithObject("\x62\xD8\x3D\0\x41"s),          // a high unit before a letter
      fileWithObject("\x61\xD8\x3D"),                 // a high unit at the end
      fileWithObject("\x62\xDE\x00\0\x41"s),          // a low unit
      fileWithObject("\x62\0\x41\xDE\x00"s),          // a letter before a low unit
      fileWithObject("\x62\xDE\x00\xD8\x3D"s),        // a pair the wrong way round
      fileWithObject("\x63\xD8\x3D\xD8\x3D\xDE\0"s),  // a high unit before a pair
  };
  for (const std::string& file : unpaired) {
    const PropertyValue value = readBinary(file);
    const std::string written = writeBinary(value);

    const std::size_t objectSize = 1 + 2 * (static_cast<std::size_t>(file[8]) & 0xF);
    EXPECT_EQ(written.substr(8, objectSize), file.substr(8, objectSize));
    EXPECT_EQ(readBinary(written), value);
  }
}

TEST(BinaryScalars, AHighUnitAtTheEndOfATextMakesNoPairWithWhatFollowsTheText) {
  BinaryFile file;
  file.add("\x61\xD8\x3D");
  file.add("\xDC\x00"s);  // as a low unit would be stored
  file.setTopObject(0);

  EXPECT_EQ(readBinary(file.build()), read("\x61\xD8\x3D"));
}

TEST(BinaryScalars, AKindThatPropertyListsDoNotHaveIsRefusedByName) {
  EXPECT_TRUE(contains(errorOf("\0"s), "a null, which no property list of ours has"));
  EXPECT_TRUE(contains(errorOf("\x0F"), "a fill byte in place of an object"));
  EXPECT_TRUE(contains(errorOf("\x0C\x50"), "a URL, which no property list of ours has"));
  EXPECT_TRUE(contains(errorOf("\x0D\x50\x50"), "a URL, which no property list of ours has"));
  EXPECT_TRUE(contains(errorOf("\x0E" + std::string(16, 'u')),
                       "a UUID, which no property list of ours has"));
  EXPECT_TRUE(contains(errorOf("\x80\x01"), "a UID, which no property list of ours has"));
  EXPECT_TRUE(contains(errorOf("\xB0"), "an ordered set, which no property list of ours has"));
  EXPECT_TRUE(contains(errorOf("\xC0"), "a set, which no property list of ours has"));
  EXPECT_TRUE(contains(errorOf("\x01"), "an object of unknown kind"));
  EXPECT_TRUE(contains(errorOf("\x71"), "an object of unknown kind"));
  EXPECT_TRUE(contains(errorOf("\xF0"), "an object of unknown kind"));
}

TEST(BinaryScalars, NumbersOfOtherSizesAreRefused) {
  EXPECT_TRUE(contains(errorOf("\x15" + std::string(32, 'x')), "more than 16 bytes"));
  EXPECT_TRUE(contains(errorOf("\x20\x01"), "neither 4 nor 8 bytes"));
  EXPECT_TRUE(contains(errorOf("\x24" + std::string(16, 'x')), "neither 4 nor 8 bytes"));
  EXPECT_TRUE(contains(errorOf("\x32\0\0\0\0"s), "a date of other than 8 bytes"));
}

TEST(BinaryScalars, WhatIsCutOffIsRefusedWithTheWholeReason) {
  const std::pair<std::string, std::string> reasons[] = {
      {"\x5F", "an object whose length is cut off"},
      {"\x5F\x11\x01", "an object whose length is cut off"},
      {"\x52z", "a text or data that ends beyond the objects"},
      {"\x11\x01", "an integer that ends beyond the objects"},
      {"\x22\x01", "a real that ends beyond the objects"},
      {"\x33\x01", "a date that ends beyond the objects"},
      {"\x5F\x50", "an object whose length is no integer of 1 to 8 bytes"},
      {"\x15", "an integer of more than 16 bytes"},
      {"\x20\x01", "a real of neither 4 nor 8 bytes"},
      {"\x32", "a date of other than 8 bytes"}};
  for (const auto& [object, reason] : reasons) {
    EXPECT_EQ(errorOf(object), "binary property list: " + reason + " at byte offset 8");
  }
}

TEST(BinaryScalars, ALengthThatIsNoIntegerIsRefused) {
  EXPECT_TRUE(contains(errorOf("\x5F\x50"), "whose length is no integer"));
  EXPECT_TRUE(contains(errorOf("\x5F\x14" + std::string(16, 'x')), "whose length is no integer"));
}

}  // namespace
}  // namespace accounts
