#include "propertylist/PropertyListFile.h"

#include <gtest/gtest.h>

#include "tests/propertylist/PropertyListTesting.h"

namespace accounts {
namespace {

std::string errorOfReading(std::string_view bytes) {
  const auto value = readPropertyList(bytes);
  EXPECT_FALSE(value);
  return value ? "" : value.error().text;
}

TEST(PropertyListFile, ABinaryFileIsRead) {
  EXPECT_EQ(readPropertyList(writeBinary(PropertyArray{1})), PropertyValue(PropertyArray{1}));
}

TEST(PropertyListFile, AnXMLFileIsRead) {
  EXPECT_EQ(readPropertyList(inPropertyList("<array><integer>1</integer></array>")),
            PropertyValue(PropertyArray{1}));
}

TEST(PropertyListFile, AnXMLFileMayBeginWithAByteOrderMark) {
  EXPECT_EQ(readPropertyList("\xEF\xBB\xBF<plist><true/></plist>"), PropertyValue(true));
}

TEST(PropertyListFile, AFileOfZeroBytesIsAnError) {
  EXPECT_EQ(errorOfReading(""), "property list: the file is empty");
}

TEST(PropertyListFile, AFileInNeitherFormatIsAnError) {
  EXPECT_TRUE(contains(errorOfReading("{ \"a\" = 1; }"), "not well-formed"));
  EXPECT_TRUE(contains(errorOfReading(std::string(100, '\0')), "XML property list: "));
}

TEST(PropertyListFile, ADamagedBinaryFileIsReportedAsBinary) {
  EXPECT_TRUE(contains(errorOfReading("bplist00"), "binary property list: "));
}

}  // namespace
}  // namespace accounts
