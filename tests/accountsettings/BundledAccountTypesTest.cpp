#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <iterator>

#include "tests/accountsettings/TestRecords.h"

// The account-types and dataclass configurations that the bundle carries: that they are sound, and
// that they make possible what the conversions and upgrade steps switch on and off.

namespace accounts {
namespace {

constexpr std::array kToggleActions = {
    &kDataclassToggleActionNone,           &kDataclassToggleActionKeepLocalData,
    &kDataclassToggleActionMergeLocalData, &kDataclassToggleActionDeleteLocalData,
    &kDataclassToggleActionMergeSyncData,  &kDataclassToggleActionDeleteSyncData};
constexpr std::array kDeleteActions = {&kAccountDeleteActionMergeData,
                                       &kAccountDeleteActionDeleteData};

constexpr std::array kAllTypes = {&kSubscribedCalendarAccountType,
                                  &kCalDAVAccountType,
                                  &kCardDAVAccountType,
                                  &kBookmarkDAVAccountType,
                                  &kSMTPAccountType,
                                  &kExchangeAccountType,
                                  &kLDAPAccountType,
                                  &kMailAccountType,
                                  &kVelmoraAccountType,
                                  &kGmailAccountType,
                                  &kYahooAccountType,
                                  &kOnMyDeviceAccountType,
                                  &kIMAPNotesAccountType,
                                  &kQuarxAccountType,
                                  &kTolvaneIMAPAccountType};

template <std::size_t count>
void expectOnly(const PropertyDictionary& properties, std::string_view key,
                const std::array<const std::string_view*, count>& known) {
  const std::optional<PropertyArray> actions = properties.arrayForKey(key);
  ASSERT_TRUE(actions) << key;
  for (const PropertyValue& action : *actions) {
    EXPECT_TRUE(std::any_of(
        known.begin(), known.end(),
        [&](const std::string_view* candidate) { return action == PropertyValue(*candidate); }))
        << key << ": " << described(action);
  }
}

PropertyDictionary resource(FakePlatform& device, std::string_view name) {
  return device.bundleResources.readPropertyList(name).value();
}

bool supports(std::string_view type, std::string_view dataclass) {
  return BasicAccount::supportedDataclassesForAccountType(type)->containsText(dataclass);
}

TEST(BundledAccountTypes, ThereAreExactlyTheFifteen) {
  FakeProcess device;
  const PropertyDictionary types = resource(device, "AccountTypesProperties");
  for (const std::string_view* type : kAllTypes) {
    EXPECT_TRUE(types.contains(*type)) << *type;
  }
  EXPECT_EQ(types.size(), kAllTypes.size());
}

TEST(BundledAccountTypes, EveryListedDataclassIsAKnownOneAndListedOnce) {
  FakeProcess device;
  for (const auto& [type, properties] : resource(device, "AccountTypesProperties")) {
    const std::optional<PropertyArray> listed =
        properties.asDictionary()->arrayForKey(kPropertiesSupportedDataclasses);
    ASSERT_TRUE(listed) << type.view();
    EXPECT_EQ(listed, BasicAccount::_orderedDataclasses(listed)) << type.view();
    for (const PropertyValue& dataclass : *listed) {
      EXPECT_TRUE(BasicAccount::allSupportedDataclasses().containsText(*dataclass.asText()))
          << type.view();
    }
  }
}

TEST(BundledAccountTypes, EveryActionIsAKnownOne) {
  FakeProcess device;
  for (const auto& [type, value] : resource(device, "AccountTypesProperties")) {
    SCOPED_TRACE(type.view());
    const PropertyDictionary& properties = *value.asDictionary();
    expectOnly(properties, kPropertiesEnableDataclassActions, kToggleActions);
    expectOnly(properties, kPropertiesDisableDataclassActions, kToggleActions);
    expectOnly(properties, kPropertiesDeleteAccountActions, kDeleteActions);
    EXPECT_NE(properties.find(kPropertiesShowRemindersSeparately)->asBoolean(), nullptr);
  }
}

TEST(BundledAccountTypes, EveryDataclassThatCanBeSwitchedOffersAnAction) {
  FakeProcess device;
  for (const std::string_view* type : kAllTypes) {
    const PropertyArray supported = BasicAccount::supportedDataclassesForAccountType(*type).value();
    for (const PropertyValue& dataclass : supported) {
      const std::string_view name = *dataclass.asText();
      EXPECT_FALSE(BasicAccount::userActionsToEnableDataclass_forAccountType(name, *type)->empty())
          << *type << " " << name;
      EXPECT_FALSE(BasicAccount::userActionsToDisableDataclass_forAccountType(name, *type)->empty())
          << *type << " " << name;
    }
  }
}

TEST(BundledAccountTypes, RemindersAreShownSeparatelyOnlyWhereTheyAreSupported) {
  FakeProcess device;
  for (const std::string_view* type : kAllTypes) {
    if (BasicAccount::showRemindersSeparatelyForAccountType(*type)) {
      EXPECT_TRUE(supports(*type, kAccountDataclassReminders)) << *type;
    }
  }
}

TEST(BundledAccountTypes, CloudAccountsHaveWhatTheCloudStepsSwitch) {
  FakeProcess device;
  for (const std::string_view type : {kQuarxAccountType, kVelmoraAccountType}) {
    EXPECT_EQ(shortNames(BasicAccount::supportedDataclassesForAccountType(type)),
              "Mail Contacts Calendars Reminders Bookmarks Notes MediaStream DeviceLocator Backup "
              "Ubiquity KeyValue Shoebox SharedStreams");
  }
}

TEST(BundledAccountTypes, MailAccountsHaveMailAndNotes) {
  FakeProcess device;
  for (const std::string_view type : {kMailAccountType, kGmailAccountType, kYahooAccountType}) {
    EXPECT_TRUE(supports(type, kAccountDataclassMail)) << type;
    EXPECT_TRUE(supports(type, kAccountDataclassNotes)) << type;
  }
}

TEST(BundledAccountTypes, WebMailAccountsTakeTheirCalendarsIn) {
  FakeProcess device;
  EXPECT_TRUE(supports(kGmailAccountType, kAccountDataclassCalendars));
  EXPECT_TRUE(supports(kYahooAccountType, kAccountDataclassCalendars));
  EXPECT_FALSE(supports(kMailAccountType, kAccountDataclassCalendars));
}

TEST(BundledAccountTypes, ExchangeAccountsHaveEveryDataclassOfTheLegacySwitches) {
  FakeProcess device;
  for (const std::string_view dataclass :
       {kAccountDataclassCalendars, kAccountDataclassContacts, kAccountDataclassMail,
        kAccountDataclassContactsSearch}) {
    EXPECT_TRUE(supports(kExchangeAccountType, dataclass)) << dataclass;
  }
}

TEST(BundledAccountTypes, CalendarAccountsHaveRemindersThatFollowTheCalendars) {
  FakeProcess device;
  EXPECT_TRUE(supports(kCalDAVAccountType, kAccountDataclassCalendars));
  EXPECT_TRUE(supports(kCalDAVAccountType, kAccountDataclassReminders));
}

TEST(BundledAccountTypes, TheDeviceItselfHasTheFourTetheredDataclasses) {
  FakeProcess device;
  for (const std::string_view dataclass : {kAccountDataclassBookmarks, kAccountDataclassCalendars,
                                           kAccountDataclassContacts, kAccountDataclassNotes}) {
    EXPECT_TRUE(supports(kOnMyDeviceAccountType, dataclass)) << dataclass;
  }
}

TEST(BundledDataclasses, EachOfTheFourteenHasItsThreeFlagsAndThereIsNoOther) {
  FakeProcess device;
  const PropertyDictionary dataclasses = resource(device, "DataclassesProperties");
  for (const PropertyValue& dataclass : BasicAccount::allSupportedDataclasses()) {
    const auto properties = dataclasses.dictionaryForKey(*dataclass.asText());
    ASSERT_TRUE(properties) << described(dataclass);
    for (const std::string_view key : {kDataclassSupportsMultipleStores, kDataclassDisplaySwitch,
                                       kDataclassRequiresUserConfirmation}) {
      const PropertyValue* flag = properties->find(key);
      EXPECT_TRUE(flag != nullptr && flag->asBoolean() != nullptr)
          << described(dataclass) << " " << key;
    }
  }
  EXPECT_EQ(dataclasses.size(), 14U);
}

TEST(BundledDataclasses, ThereIsOneStoreOfBookmarksAndManyOfContacts) {
  FakeProcess device;
  EXPECT_FALSE(BasicAccount::multipleStoresSupportedByDataclass(kAccountDataclassBookmarks));
  EXPECT_TRUE(BasicAccount::multipleStoresSupportedByDataclass(kAccountDataclassContacts));
}

}  // namespace
}  // namespace accounts
