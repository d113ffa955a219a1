#include <gtest/gtest.h>

#include <fstream>
#include <iterator>

#include "propertylist/PropertyListFile.h"
#include "tests/accountsettings/TestRecords.h"

// The string tables that the bundle carries, in each of its languages.

namespace accounts {
namespace {

constexpr const char* kLanguages[] = {"en", "de"};

constexpr const char* kDeviceLocalKeys[] = {"FROM_MY_COMPUTER_TYPE_DORSA",
                                            "FROM_MY_COMPUTER_TYPE_DORSA_MID_SENTENCE",
                                            "FROM_MY_COMPUTER_TYPE_PC",
                                            "FROM_MY_COMPUTER_TYPE_PC_MID_SENTENCE",
                                            "ON_MY_DEVICE_TYPE_HANDRA",
                                            "ON_MY_DEVICE_TYPE_MID_SENTENCE_HANDRA",
                                            "ON_YOUR_DEVICE_TYPE_MID_SENTENCE_HANDRA",
                                            "SYNCED_WITH_YOUR_COMPUTER_TYPE_DORSA_MID_SENTENCE",
                                            "SYNCED_WITH_YOUR_COMPUTER_TYPE_PC_MID_SENTENCE"};
constexpr const char* kManagerKeys[] = {"SUBSCRIBED_CALENDAR_GROUP_TITLE",
                                        "SUBSCRIBED_CALENDAR_GROUP_MID_SENTENCE_TITLE"};

/// The string table of a language; an empty one when the file is missing or no dictionary.
PropertyDictionary stringTable(const std::string& language, const std::string& table) {
  std::ifstream file(std::string(ACCOUNTS_RESOURCES_DIRECTORY) + "/" + language + ".lproj/" +
                     table + ".strings");
  const std::string bytes{std::istreambuf_iterator<char>(file), {}};
  const auto value = readPropertyList(bytes);
  const PropertyDictionary* texts = value ? value->asDictionary() : nullptr;
  return texts != nullptr ? *texts : PropertyDictionary();
}

template <std::size_t count>
void expectTexts(const PropertyDictionary& table, const char* const (&keys)[count]) {
  for (const char* key : keys) {
    EXPECT_FALSE(table.textForKey(key).value_or("").empty()) << key;
  }
  EXPECT_EQ(table.size(), count) << "keys that nobody asks for";
}

TEST(BundledStringTables, EveryLanguageHasEveryTextOfTheDeviceLocalAccount) {
  for (const char* language : kLanguages) {
    SCOPED_TRACE(language);
    expectTexts(stringTable(language, "DeviceLocalAccount"), kDeviceLocalKeys);
  }
}

TEST(BundledStringTables, EveryLanguageHasEveryTextOfTheStore) {
  for (const char* language : kLanguages) {
    SCOPED_TRACE(language);
    expectTexts(stringTable(language, "AccountsManager"), kManagerKeys);
  }
}

TEST(BundledStringTables, TextsWithinASentenceDifferFromThoseThatBeginOne) {
  for (const char* language : kLanguages) {
    const PropertyDictionary texts = stringTable(language, "DeviceLocalAccount");
    EXPECT_NE(texts.textForKey("ON_MY_DEVICE_TYPE_HANDRA"),
              texts.textForKey("ON_MY_DEVICE_TYPE_MID_SENTENCE_HANDRA"))
        << language;
  }
}

}  // namespace
}  // namespace accounts
