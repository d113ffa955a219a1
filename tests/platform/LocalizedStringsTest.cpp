#include <gtest/gtest.h>

#include <map>

#include "platform/linux/LinuxLocalizedStrings.h"
#include "platform/linux/UserLanguages.h"
#include "tests/platform/DeviceFixture.h"

namespace accounts {
namespace {

using Languages = std::vector<std::string>;

TEST(UserLanguagesTest, ALocaleGivesItsRegionItsLanguageAndEnglish) {
  EXPECT_EQ(languagesForLocale("de_DE.UTF-8"), (Languages{"de_DE", "de", "en"}));
  EXPECT_EQ(languagesForLocale("de_DE@euro"), (Languages{"de_DE", "de", "en"}));
  EXPECT_EQ(languagesForLocale("de"), (Languages{"de", "en"}));
  EXPECT_EQ(languagesForLocale("en_GB.UTF-8"), (Languages{"en_GB", "en"}));
}

TEST(UserLanguagesTest, ALocaleWithoutLanguageGivesEnglishAlone) {
  for (const std::string_view locale : {"", "C", "POSIX", "C.UTF-8", ".UTF-8"}) {
    EXPECT_EQ(languagesForLocale(locale), Languages{"en"}) << locale;
  }
}

TEST(UserLanguagesTest, ANameThatCouldLeadElsewhereIsNoLanguage) {
  EXPECT_EQ(languagesForLocale("/usr/share/locale"), Languages{"en"});
  EXPECT_EQ(languagesForLocale("de/../../fr"), Languages{"en"});
}

Languages languagesIn(const std::map<std::string, const char*>& environment) {
  return userLanguages([&](const char* variable) {
    const auto found = environment.find(variable);
    return found != environment.end() ? found->second : nullptr;
  });
}

TEST(UserLanguagesTest, TheFirstVariableThatIsSetDecides) {
  EXPECT_EQ(languagesIn({{"LC_ALL", "fr"}, {"LC_MESSAGES", "de"}, {"LANG", "it"}}),
            (Languages{"fr", "en"}));
  EXPECT_EQ(languagesIn({{"LC_MESSAGES", "de"}, {"LANG", "it"}}), (Languages{"de", "en"}));
  EXPECT_EQ(languagesIn({{"LANG", "it"}}), (Languages{"it", "en"}));
  EXPECT_EQ(languagesIn({}), Languages{"en"});
}

TEST(UserLanguagesTest, AnEmptyVariableCountsAsNotSetAndPlainLocaleCountsAsSet) {
  EXPECT_EQ(languagesIn({{"LC_ALL", ""}, {"LANG", "it"}}), (Languages{"it", "en"}));
  EXPECT_EQ(languagesIn({{"LC_ALL", "C"}, {"LANG", "it"}}), Languages{"en"});
}

class LocalizedStringsTest : public DeviceFixture {
 protected:
  LocalizedStringsTest() {
    addTable("de_AT", "Table", "<key>REGION</key><string>Jänner</string>");
    addTable("de", "Table",
             "<key>REGION</key><string>Januar</string><key>LANGUAGE</key><string>Konto</string>"
             "<key>NUMBER</key><integer>1</integer>");
    addTable("en", "Table",
             "<key>LANGUAGE</key><string>Account</string><key>ENGLISH</key><string>Mail</string>"
             "<key>NUMBER</key><string>One</string>");
  }

  void addTable(std::string_view language, std::string_view table, std::string_view entries) {
    const auto directory = outside() / (std::string(language) + ".lproj");
    std::filesystem::create_directories(directory);
    makeHostFile(directory / (std::string(table) + ".strings"), xmlDictionary(entries));
  }

  std::string text(std::string_view key, std::string_view defaultValue = "") {
    return strings.localizedString(key, defaultValue, "Table");
  }

  BundleFiles files{outside().string()};
  LinuxLocalizedStrings strings{files, languagesForLocale("de_AT.UTF-8")};
};

TEST_F(LocalizedStringsTest, TheRegionsTextIsBest) {
  EXPECT_EQ(text("REGION"), "Jänner");
}

TEST_F(LocalizedStringsTest, TheLanguagesTextIsNext) {
  EXPECT_EQ(text("LANGUAGE"), "Konto");
}

TEST_F(LocalizedStringsTest, EnglishStandsInForAMissingText) {
  EXPECT_EQ(text("ENGLISH"), "Mail");
}

TEST_F(LocalizedStringsTest, AValueThatIsNoTextIsMissing) {
  EXPECT_EQ(text("NUMBER"), "One");
}

TEST_F(LocalizedStringsTest, AKeyThatNoTableHasGivesTheDefaultOrElseTheKey) {
  EXPECT_EQ(text("NONE", "Default"), "Default");
  EXPECT_EQ(text("NONE"), "NONE");
}

TEST_F(LocalizedStringsTest, AMissingTableTranslatesNothing) {
  EXPECT_EQ(strings.localizedString("LANGUAGE", "", "Other"), "LANGUAGE");
}

TEST_F(LocalizedStringsTest, AnUnreadableTableTranslatesNothingButEnglishStillDoes) {
  makeHostFile(outside() / "de.lproj" / "Table.strings", "no property list");
  EXPECT_EQ(text("LANGUAGE"), "Account");
}

TEST_F(LocalizedStringsTest, ATableIsReadOnce) {
  ASSERT_EQ(text("LANGUAGE"), "Konto");
  addTable("de", "Table", "");
  EXPECT_EQ(text("LANGUAGE"), "Konto");
}

}  // namespace
}  // namespace accounts
