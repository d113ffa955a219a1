#include <gtest/gtest.h>

#include "accountsettings/DeviceLocalAccount.h"
#include "tests/accountsettings/TestRecords.h"

// With which computer the data of the device-local account is synced, and how that is worded.

namespace accounts {
namespace {

constexpr const char* kDomain = "com.quarx.mobile.tethered_sync";

/// Makes a key of the pairing service name a source; the key "" is the domain as a whole.
void syncWith(FakePlatform& device, const std::string& key, const PropertyValue& source) {
  device.pairingValueStore.values.insert_or_assign({kDomain, key},
                                                   PropertyDictionary{{"SyncingOS", source}});
}

std::string sourceOfContacts() {
  return DeviceLocalAccount::tetheredSourceForDataClass(kAccountDataclassContacts);
}

class TetheredSyncKeys
    : public testing::TestWithParam<std::pair<std::string_view, std::optional<std::string>>> {};

TEST_P(TetheredSyncKeys, EachDataclassIsAskedForUnderItsKey) {
  FakeProcess device;
  DeviceLocalAccount::tetheredSourceForDataClass(GetParam().first);
  ASSERT_EQ(device.pairingValueStore.requests.size(), 1U);
  EXPECT_EQ(device.pairingValueStore.requests[0],
            std::pair(std::string(kDomain), GetParam().second));
}

INSTANTIATE_TEST_SUITE_P(EachDataclass, TetheredSyncKeys,
                         testing::Values(std::pair("com.quarx.Dataclass.Mail", "Mail Accounts"),
                                         std::pair("com.quarx.Dataclass.Contacts", "Contacts"),
                                         std::pair("com.quarx.Dataclass.Calendars", "Calendars"),
                                         std::pair("com.quarx.Dataclass.Reminders", "Calendars"),
                                         std::pair("com.quarx.Dataclass.Bookmarks", "Bookmarks"),
                                         std::pair("com.quarx.Dataclass.Notes", "Notes"),
                                         std::pair("com.quarx.Dataclass.MediaStream",
                                                   std::nullopt)));

TEST(TetheredSource, ItIsTheSystemThatThePairingServiceNames) {
  FakeProcess device;
  syncWith(device, "Contacts", "Windows");
  EXPECT_EQ(sourceOfContacts(), "Windows");
}

TEST(TetheredSource, AnyOtherTextIsPassedOn) {
  FakeProcess device;
  syncWith(device, "Contacts", "Another");
  EXPECT_EQ(sourceOfContacts(), "Another");
}

TEST(TetheredSource, WithoutAConnectionTheDataIsOnTheDevice) {
  FakeProcess device;
  syncWith(device, "Contacts", "Windows");
  device.pairingValueStore.canConnect = false;
  EXPECT_EQ(sourceOfContacts(), "Handra");
}

TEST(TetheredSource, WithoutAValueTheDataIsOnTheDevice) {
  FakeProcess device;
  EXPECT_EQ(sourceOfContacts(), "Handra");
}

TEST(TetheredSource, AValueWithoutASystemsNameCountsAsNone) {
  FakeProcess device;
  device.pairingValueStore.values.insert_or_assign({kDomain, "Contacts"}, "Windows");
  EXPECT_EQ(sourceOfContacts(), "Handra");
  device.pairingValueStore.values.insert_or_assign({kDomain, "Contacts"}, PropertyDictionary());
  EXPECT_EQ(sourceOfContacts(), "Handra");
  syncWith(device, "Contacts", 7);
  EXPECT_EQ(sourceOfContacts(), "Handra");
}

TEST(TetheredSource, ADataclassWithoutKeyHasTheSourceOfTheWholeDomain) {
  FakeProcess device;
  EXPECT_EQ(DeviceLocalAccount::tetheredSourceForDataClass(kAccountDataclassMediaStream), "Handra");
  syncWith(device, "", "Veskar");
  EXPECT_EQ(DeviceLocalAccount::tetheredSourceForDataClass(kAccountDataclassMediaStream), "Veskar");
}

TEST(TetheredSource, NoConnectionStaysOpen) {
  FakeProcess device;
  syncWith(device, "Contacts", "Windows");
  sourceOfContacts();
  DeviceLocalAccount::tetheredSourceForDataClass(kAccountDataclassNotes);
  EXPECT_EQ(device.pairingValueStore.openConnections, 0);
}

TEST(TetheredSyncing, RemindersComeWithTheCalendars) {
  FakeProcess device;
  syncWith(device, "Calendars", "Windows");
  EXPECT_TRUE(DeviceLocalAccount::isTetheredSyncingDataclass(kAccountDataclassReminders));
  EXPECT_TRUE(DeviceLocalAccount::isTetheredSyncingDataclass(kAccountDataclassCalendars));
}

TEST(TetheredSyncing, OnlyComputersCount) {
  FakeProcess device;
  syncWith(device, "Contacts", "Veskar");
  syncWith(device, "Notes", "Handra");
  syncWith(device, "Bookmarks", "Another");
  EXPECT_TRUE(DeviceLocalAccount::isTetheredSyncingDataclass(kAccountDataclassContacts));
  EXPECT_FALSE(DeviceLocalAccount::isTetheredSyncingDataclass(kAccountDataclassNotes));
  EXPECT_FALSE(DeviceLocalAccount::isTetheredSyncingDataclass(kAccountDataclassBookmarks));
  EXPECT_FALSE(DeviceLocalAccount::isTetheredSyncingDataclass(kAccountDataclassMail));
}

struct Wording {
  const char* source;
  std::string_view beginning;
  std::string_view midSentence;
  std::string_view reference;
};

class SyncSourceTexts : public testing::TestWithParam<Wording> {};

// The table has no texts, so that each text is its key.
TEST_P(SyncSourceTexts, EachSourceHasItsKeys) {
  FakeProcess device;
  syncWith(device, "Contacts", GetParam().source);
  EXPECT_EQ(DeviceLocalAccount::localizedSyncSourceStringForDataClass_forBeginningOfSentence(
                kAccountDataclassContacts, /*beginningOfSentence=*/true),
            GetParam().beginning);
  EXPECT_EQ(DeviceLocalAccount::localizedSyncSourceStringForDataClass_forBeginningOfSentence(
                kAccountDataclassContacts, /*beginningOfSentence=*/false),
            GetParam().midSentence);
  EXPECT_EQ(DeviceLocalAccount::localizedReferenceToSyncSourceStringForDataClass(
                kAccountDataclassContacts),
            GetParam().reference);
}

INSTANTIATE_TEST_SUITE_P(
    EachSource, SyncSourceTexts,
    testing::Values(
        Wording{"Veskar", "FROM_MY_COMPUTER_TYPE_DORSA", "FROM_MY_COMPUTER_TYPE_DORSA_MID_SENTENCE",
                "SYNCED_WITH_YOUR_COMPUTER_TYPE_DORSA_MID_SENTENCE"},
        Wording{"Windows", "FROM_MY_COMPUTER_TYPE_PC", "FROM_MY_COMPUTER_TYPE_PC_MID_SENTENCE",
                "SYNCED_WITH_YOUR_COMPUTER_TYPE_PC_MID_SENTENCE"},
        Wording{"Another", "ON_MY_DEVICE_TYPE_HANDRA", "ON_MY_DEVICE_TYPE_MID_SENTENCE_HANDRA",
                "ON_YOUR_DEVICE_TYPE_MID_SENTENCE_HANDRA"}));

TEST(SyncSourceText, TheDeviceClassStandsBehindTheMidSentenceMark) {
  FakeProcess device;
  device.deviceInfoService.answers.emplace("DeviceClass", "Two words");
  EXPECT_EQ(DeviceLocalAccount::localizedReferenceToSyncSourceStringForDataClass(
                kAccountDataclassContacts),
            "ON_YOUR_DEVICE_TYPE_MID_SENTENCE_TWO_WORDS");
}

}  // namespace
}  // namespace accounts
