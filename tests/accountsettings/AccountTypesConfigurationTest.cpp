#include <gtest/gtest.h>

#include <thread>
#include <vector>

#include "tests/accountsettings/TestRecords.h"

// The account-types configuration: how it is loaded and what it answers of an account type.

namespace accounts {
namespace {

PropertyDictionary supporting(const PropertyArray& dataclasses) {
  return {{kPropertiesSupportedDataclasses, dataclasses}};
}

std::optional<PropertyArray> supportedByMail() {
  return BasicAccount::supportedDataclassesForAccountType(kMailAccountType);
}

TEST(AccountTypesLoading, UnknownDataclassesAreDropped) {
  FakeProcess device;
  configureType(device, kMailAccountType,
                supporting({kAccountDataclassMail, "X", 7, kAccountDataclassNotes}));
  EXPECT_EQ(shortNames(supportedByMail()), "Mail Notes");
}

TEST(AccountTypesLoading, TheOldestProcessorHasNoNotes) {
  FakeProcess device;
  device.deviceInfoService.answers.emplace("CPUArchitecture", "armv6");
  configureType(device, kMailAccountType,
                supporting({kAccountDataclassMail, "X", kAccountDataclassNotes}));
  EXPECT_EQ(shortNames(supportedByMail()), "Mail");
}

TEST(AccountTypesLoading, ATypeOfNotesAloneKeepsItsListOnTheOldestProcessor) {
  FakeProcess device;
  device.deviceInfoService.answers.emplace("CPUArchitecture", "armv6");
  configureType(device, kMailAccountType, supporting({kAccountDataclassNotes}));
  EXPECT_EQ(shortNames(supportedByMail()), "Notes");
}

TEST(AccountTypesLoading, ATypeOfUnknownDataclassesAloneKeepsItsList) {
  FakeProcess device;
  configureType(device, kMailAccountType, supporting({"X", "Y"}));
  EXPECT_EQ(shortNames(supportedByMail()), "X Y");
}

TEST(AccountTypesLoading, ATypeWithoutAListHasNone) {
  FakeProcess device;
  configureType(device, kMailAccountType, {{"Other", 1}});
  EXPECT_EQ(supportedByMail(), std::nullopt);
}

TEST(AccountTypesLoading, ATypeWithoutADictionaryOfPropertiesIsValidAndHasNoList) {
  FakeProcess device;
  device.bundleResources.replaced["AccountTypesProperties"] =
      PropertyDictionary{{kMailAccountType, true}};
  EXPECT_TRUE(BasicAccount::_isValidAccountType(kMailAccountType));
  EXPECT_EQ(supportedByMail(), std::nullopt);
}

TEST(AccountTypesLoading, TheResourceIsReadOnce) {
  FakeProcess device;
  BasicAccount::initialize();
  supportedByMail();
  EXPECT_EQ(device.bundleResources.reads, std::vector<std::string>{"AccountTypesProperties"});
}

TEST(AccountTypesLoading, ConcurrentFirstUsersWaitForOneLoad) {
  FakeProcess device;
  std::vector<std::thread> users;
  for (int user = 0; user < 8; ++user) {
    users.emplace_back([] { BasicAccount::initialize(); });
  }
  for (std::thread& user : users) {
    user.join();
  }
  EXPECT_EQ(device.bundleResources.reads.size(), 1U);
}

TEST(AccountTypesLoadingDeathTest, AMissingResourceEndsTheProcess) {
  FakeProcess device;
  device.bundleResources.replaced["AccountTypesProperties"] = std::nullopt;
  EXPECT_DEATH(BasicAccount::initialize(), R"(\+\[BasicAccount initialize\], BasicAccount: )"
                                           "Could not find AccountTypesProperties.plist");
}

TEST(AccountTypesLoadingDeathTest, AnUnreadableResourceEndsTheProcessNamingTheDataclasses) {
  FakeProcess device;
  device.bundleResources.unreadable.insert("AccountTypesProperties");
  EXPECT_DEATH(BasicAccount::initialize(), R"(\+\[BasicAccount initialize\], BasicAccount: )"
                                           "Could not load the dataclasses configuration file");
}

TEST(AccountTypes, AnUnknownTypeHasNoListsAndAnswersFalse) {
  FakeProcess device;
  EXPECT_EQ(BasicAccount::supportedDataclassesForAccountType("X"), std::nullopt);
  EXPECT_EQ(
      BasicAccount::userActionsToEnableDataclass_forAccountType(kAccountDataclassContacts, "X"),
      std::nullopt);
  EXPECT_EQ(
      BasicAccount::userActionsToDisableDataclass_forAccountType(kAccountDataclassContacts, "X"),
      std::nullopt);
  EXPECT_EQ(BasicAccount::deleteAccountActionsForAccountType("X"), std::nullopt);
  EXPECT_FALSE(BasicAccount::showRemindersSeparatelyForAccountType("X"));
  EXPECT_FALSE(BasicAccount::_isValidAccountType("X"));
}

TEST(AccountTypes, AConfiguredTypeIsValid) {
  FakeProcess device;
  EXPECT_TRUE(BasicAccount::_isValidAccountType(kMailAccountType));
}

TEST(AccountTypes, TypesAreComparedExactly) {
  FakeProcess device;
  EXPECT_FALSE(BasicAccount::_isValidAccountType("mail"));
}

TEST(AccountTypes, NoTextAndTheEmptyTextAreNoTypesWhateverTheConfigurationHolds) {
  FakeProcess device;
  configureType(device, "", supporting({kAccountDataclassMail}));
  EXPECT_FALSE(BasicAccount::_isValidAccountType(""));
  EXPECT_FALSE(BasicAccount::_isValidAccountType(std::nullopt));
}

TEST(AccountTypes, TheListOfATypeKeepsItsOrder) {
  FakeProcess device;
  configureType(device, kMailAccountType,
                supporting({kAccountDataclassNotes, kAccountDataclassMail}));
  EXPECT_EQ(shortNames(supportedByMail()), "Notes Mail");
}

TEST(AccountTypes, TheListOfAnAccountIsInCanonicalOrder) {
  FakeProcess device;
  configureType(device, kMailAccountType,
                supporting({kAccountDataclassNotes, kAccountDataclassMail}));
  EXPECT_EQ(shortNames(mailAccount()->supportedDataclasses()), "Mail Notes");
}

TEST(AccountTypes, DeleteActionsAndRemindersComeFromTheConfiguration) {
  FakeProcess device;
  configureType(device, kMailAccountType,
                {{kPropertiesDeleteAccountActions, PropertyArray{kAccountDeleteActionDeleteData}},
                 {kPropertiesShowRemindersSeparately, true}});
  EXPECT_EQ(shortNames(BasicAccount::deleteAccountActionsForAccountType(kMailAccountType)),
            "Delete Data");
  EXPECT_TRUE(BasicAccount::showRemindersSeparatelyForAccountType(kMailAccountType));
}

TEST(AccountTypes, ASwitchOfTheConfigurationWithoutABooleanValueIsOff) {
  FakeProcess device;
  configureType(device, kMailAccountType, {{kPropertiesShowRemindersSeparately, PropertyArray()}});
  EXPECT_FALSE(BasicAccount::showRemindersSeparatelyForAccountType(kMailAccountType));
}

TEST(Multitasking, OnlyTheOldestProcessorIsWithoutIt) {
  FakeProcess device;
  EXPECT_TRUE(BasicAccount::isMultitaskingEnabled());

  device.deviceInfoService.answers.emplace("CPUArchitecture", "armv7");
  EXPECT_TRUE(BasicAccount::isMultitaskingEnabled());

  device.deviceInfoService.answers.insert_or_assign("CPUArchitecture", "armv6");
  EXPECT_FALSE(BasicAccount::isMultitaskingEnabled());
}

TEST(CanonicalDataclasses, TheFourteenStandInTheirFixedOrder) {
  FakeProcess device;
  EXPECT_EQ(shortNames(BasicAccount::allSupportedDataclasses()),
            "Mail Contacts Calendars Reminders Bookmarks Notes MediaStream DeviceLocator "
            "ContactsSearch Backup Ubiquity KeyValue Shoebox SharedStreams");
}

TEST(CanonicalDataclasses, EveryCallGivesTheSameObject) {
  FakeProcess device;
  EXPECT_EQ(&BasicAccount::allSupportedDataclasses(), &BasicAccount::allSupportedDataclasses());
}

}  // namespace
}  // namespace accounts
