#include <gtest/gtest.h>

#include <string>

#include "tests/propertylist/PropertyListTesting.h"

namespace accounts {
namespace {

std::string withDocumentType(std::string_view documentType, std::string_view content) {
  return "<?xml version=\"1.0\"?>\n<!DOCTYPE plist " + std::string(documentType) +
         ">\n<plist version=\"1.0\">" + std::string(content) + "</plist>\n";
}

constexpr std::string_view kReference = "<string>&other;</string>";

TEST(HostileXMLFile, ADocumentTypeIsSkipped) {
  for (const char* documentType :
       {"", "SYSTEM \"PropertyList.dtd\"", "PUBLIC \"-//Q//DTD//EN\" \"http://q.example/p.dtd\"",
        "[<!ELEMENT plist ANY>]"}) {
    EXPECT_EQ(readXML(withDocumentType(documentType, "<true/>")), PropertyValue(true));
  }
}

TEST(HostileXMLFile, AnUndefinedEntityIsRefused) {
  EXPECT_TRUE(contains(errorOfReadingXML(inPropertyList(kReference)), "undefined entity"));
  EXPECT_TRUE(contains(errorOfReadingXML(withDocumentType("SYSTEM \"p.dtd\"", kReference)),
                       "a reference to an entity that is not one of XML's own five in line 3"));
}

TEST(HostileXMLFile, AnUndefinedEntityInATagIsRefused) {
  const std::string document =
      "<!DOCTYPE plist SYSTEM \"p.dtd\"><plist version=\"&other;\"><true/></plist>";

  EXPECT_TRUE(contains(errorOfReadingXML(document), "a reference to an entity within a tag"));
}

TEST(HostileXMLFile, ADeclaredEntityIsRefused) {
  EXPECT_TRUE(
      contains(errorOfReadingXML(withDocumentType("[<!ENTITY other \"text\">]", kReference)),
               "a declaration of an entity in line 2"));
}

TEST(HostileXMLFile, AnExternalEntityIsRefused) {
  EXPECT_TRUE(contains(
      errorOfReadingXML(withDocumentType("[<!ENTITY other SYSTEM \"/etc/passwd\">]", kReference)),
      "a declaration of an entity"));
}

TEST(HostileXMLFile, AParameterEntityIsRefused) {
  EXPECT_TRUE(contains(errorOfReadingXML(withDocumentType(
                           "[<!ENTITY % all SYSTEM \"other.dtd\"> %all;]", "<true/>")),
                       "a declaration of an entity"));
}

TEST(HostileXMLFile, AnEntityDeclaredBehindAnUnknownPartOfTheDocumentTypeIsRefused) {
  const std::string document = withDocumentType("[%all; <!ENTITY other \"text\">]", kReference);

  EXPECT_TRUE(contains(errorOfReadingXML(document),
                       "a reference to an entity that is not one of XML's own five"));
}

TEST(HostileXMLFile, EntitiesThatMultiplyAreRefusedAtTheFirst) {
  std::string declarations = "[<!ENTITY e0 \"xxxxxxxxxx\">";
  for (int level = 1; level < 20; ++level) {
    const std::string below = "&e" + std::to_string(level - 1) + ";";
    declarations += "<!ENTITY e" + std::to_string(level) + " \"" + below + below + "\">";
  }

  EXPECT_TRUE(
      contains(errorOfReadingXML(withDocumentType(declarations + "]", "<string>&e19;</string>")),
               "a declaration of an entity"));
}

TEST(HostileXMLFile, InvalidUTF8IsRefused) {
  for (const char* bytes : {"\xFF", "a\xC3", "\xC0\x80", "\xE0\x80\x80", "\xED\xA0\xBD",
                            "\xF4\x90\x80\x80", "\x80", "\xEF\xBF\xBF"}) {
    const std::string document = inPropertyList("<string>" + std::string(bytes) + "</string>");

    EXPECT_TRUE(contains(errorOfReadingXML(document), "invalid token"));
  }
}

TEST(HostileXMLFile, CharactersThatXMLDoesNotHaveAreRefused) {
  using namespace std::string_literals;
  EXPECT_TRUE(contains(errorOfReadingXML(inPropertyList("<string>\0</string>"s)), "invalid token"));
  EXPECT_TRUE(
      contains(errorOfReadingXML(inPropertyList("<string>\x01</string>")), "invalid token"));
  EXPECT_TRUE(contains(errorOfReadingXML(inPropertyList("<string>&#0;</string>")),
                       "invalid character number"));
}

TEST(HostileXMLFile, AnEncodingThatIsNotKnownIsRefused) {
  EXPECT_TRUE(contains(
      errorOfReadingXML("<?xml version=\"1.0\" encoding=\"EBCDIC\"?><plist><true/></plist>"),
      "unknown encoding"));
}

std::string sampleDocument() {
  return withDocumentType(
      "SYSTEM \"p.dtd\"",
      "<dict><key>a</key><array><integer>1</integer><real>1.5</real><true/></array>"
      "<key>b &amp; c</key><date>2001-01-01T00:00:00Z</date>"
      "<key>d</key><data>QUJD</data><key>e</key><string>B\xC3\xBCro</string></dict>");
}

TEST(HostileXMLFile, ADocumentCutOffAnywhereIsRefused) {
  const std::string document = sampleDocument();
  ASSERT_EQ(readXML(document).kind(), PropertyKind::Dictionary);

  // Only the line feed behind the last tag may be missing.
  for (std::size_t length = 0; length + 1 < document.size(); ++length) {
    EXPECT_FALSE(errorOfReadingXML(document.substr(0, length)).empty()) << length;
  }
}

TEST(HostileXMLFile, AnyByteChangedIsReadOrRefusedButNeverCrashes) {
  const std::string document = sampleDocument();
  for (std::size_t position = 0; position < document.size(); ++position) {
    for (int change = 1; change < 256; change <<= 1) {
      std::string damaged = document;
      damaged[position] = static_cast<char>(damaged[position] ^ change);
      const auto value = readXMLPropertyList(damaged);

      EXPECT_TRUE(value || !value.error().text.empty());
    }
  }
}

}  // namespace
}  // namespace accounts
