#include <gtest/gtest.h>
#include <stdio.h>
#include <unistd.h>

#include <bit>
#include <fstream>
#include <string>

#include "tests/propertylist/PropertyListTesting.h"

namespace accounts {
namespace {

constexpr const char* kPython = "/usr/bin/python3";

/// Prints the value of a file in the form of `render` below.
constexpr const char* kScript = R"(
import datetime, plistlib, struct, sys

def render(value):
    if isinstance(value, dict):
        entries = sorted((key.encode('utf-8'), entry) for key, entry in value.items())
        return '{' + ','.join(key.hex() + ':' + render(entry) for key, entry in entries) + '}'
    if isinstance(value, list):
        return '[' + ','.join(render(element) for element in value) + ']'
    if isinstance(value, bool):
        return 'true' if value else 'false'
    if isinstance(value, int):
        return 'integer %d' % value
    if isinstance(value, float):
        return 'real ' + struct.pack('>d', value).hex()
    if isinstance(value, str):
        return 'text ' + value.encode('utf-8').hex()
    if isinstance(value, bytes):
        return 'data ' + value.hex()
    if isinstance(value, datetime.datetime):
        seconds = (value - datetime.datetime(2001, 1, 1)).total_seconds()
        return 'date ' + struct.pack('>d', seconds).hex()
    raise TypeError(type(value))

with open(sys.argv[1], 'rb') as file:
    print(render(plistlib.load(file)))
)";

std::string hexadecimal(std::string_view bytes) {
  std::string text;
  for (const char byte : bytes) {
    text.push_back("0123456789abcdef"[static_cast<unsigned char>(byte) >> 4]);
    text.push_back("0123456789abcdef"[byte & 0xF]);
  }
  return text;
}

std::string hexadecimal(double number) {
  std::string bytes;
  BinaryFile::appendNumber(bytes, std::bit_cast<std::uint64_t>(number), 8);
  return hexadecimal(bytes);
}

std::string render(const PropertyValue& value) {
  std::string text;
  switch (value.kind()) {
    case PropertyKind::Dictionary:
      for (const PropertyEntry& entry : *value.asDictionary()) {
        text +=
            (text.empty() ? "" : ",") + hexadecimal(entry.key.view()) + ":" + render(entry.value);
      }
      return "{" + text + "}";
    case PropertyKind::Array:
      for (const PropertyValue& element : *value.asArray()) {
        text += (text.empty() ? "" : ",") + render(element);
      }
      return "[" + text + "]";
    case PropertyKind::Boolean:
      return *value.asBoolean() ? "true" : "false";
    case PropertyKind::Integer:
      return "integer " + (value.asSigned() != nullptr ? std::to_string(*value.asSigned())
                                                       : std::to_string(*value.asLargeUnsigned()));
    case PropertyKind::Real:
      return "real " + hexadecimal(*value.asReal());
    case PropertyKind::String:
      return "text " + hexadecimal(value.asText()->view());
    case PropertyKind::Data:
      return "data " + hexadecimal(value.asData()->bytes.view());
    case PropertyKind::Date:
      return "date " + hexadecimal(value.asDate()->secondsSinceReferenceDate);
  }
  return text;
}

/// What the independent reader makes of a file.
std::string renderIndependently(const std::string& bytes) {
  const std::string stem = testing::TempDir() + "independent-reader-" + std::to_string(getpid());
  const std::string file = stem + ".plist";
  const std::string script = stem + ".py";
  std::ofstream(file, std::ios::binary) << bytes;
  std::ofstream(script) << kScript;
  const std::string command = std::string(kPython) + " -I '" + script + "' '" + file + "' 2>&1";
  std::string output;
  FILE* pipe = popen(command.c_str(), "r");
  if (pipe == nullptr) {
    return "cannot start the independent reader";
  }
  char buffer[4096];
  while (const std::size_t count = fread(buffer, 1, sizeof buffer, pipe)) {
    output.append(buffer, count);
  }
  pclose(pipe);
  unlink(file.c_str());
  unlink(script.c_str());
  if (output.ends_with('\n')) {
    output.pop_back();
  }
  return output;
}

class IndependentReader : public testing::Test {
 protected:
  void SetUp() override {
    if (access(kPython, X_OK) != 0) {
      GTEST_SKIP() << kPython << " is not installed";
    }
  }
};

TEST_F(IndependentReader, ReadsEveryKindAsItWasWritten) {
  const PropertyValue value = valueOfEveryKind();

  EXPECT_EQ(renderIndependently(writeBinary(value)), render(value));
}

TEST_F(IndependentReader, ReadsEveryKindAsItWasWrittenInXML) {
  const PropertyValue value = valueOfEveryKindInXML();

  EXPECT_EQ(renderIndependently(writeXML(value)), render(value));
}

TEST_F(IndependentReader, ReadsAwkwardTextsAsTheyWereWrittenInXML) {
  const PropertyValue value =
      PropertyArray{" ", "\r\n", "a\tb", "]]>", "&amp;", "<string>", "\xC2\x85", "\xE2\x80\xA8"};

  EXPECT_EQ(renderIndependently(writeXML(value)), render(value));
}

TEST_F(IndependentReader, ReadsAFileWithSharedContainersAndManyObjects) {
  PropertyArray accounts;
  const PropertyArray dataclasses{"Mail", "Notes"};
  for (int index = 0; index < 3000; ++index) {
    accounts.append(PropertyDictionary{{"Identifier", "account " + std::to_string(index)},
                                       {"Enabled Dataclasses", dataclasses},
                                       {"Port", index}});
  }
  const PropertyValue value = PropertyDictionary{{"Version", 12}, {"Accounts", accounts}};

  EXPECT_EQ(renderIndependently(writeBinary(value)), render(value));
}

TEST_F(IndependentReader, ReadsAnXMLFileAsWeDo) {
  const std::string file = inPropertyList(
      "<dict><key>a</key><integer>0x1F</integer><key>b</key><real>1.25</real>"
      "<key>c</key><date>2011-05-02T16:34:56Z</date><key>d</key><data>QUI= </data>"
      "<key>e</key><array><true/><string>B\xC3\xBCro &amp; co</string></array></dict>");

  EXPECT_EQ(renderIndependently(file), render(readXML(file)));
}

}  // namespace
}  // namespace accounts
