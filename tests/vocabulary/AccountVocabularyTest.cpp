#include "vocabulary/AccountVocabulary.h"

#include <gtest/gtest.h>

#include <cstring>
#include <set>
#include <type_traits>

namespace {

TEST(Vocabulary, AccountTypesHaveTheirExactNames) {
  EXPECT_EQ(kCalDAVAccountType, "CalDAV");
  EXPECT_EQ(kOnMyDeviceAccountType, "OnMyDevice");
  EXPECT_EQ(kIMAPNotesAccountType, "IMAPNotes");
  EXPECT_EQ(kTolvaneIMAPAccountType, "TolvaneIMAP");
}

TEST(Vocabulary, TheSubscribedCalendarTypeIsTwoWords) {
  EXPECT_EQ(kSubscribedCalendarAccountType, "Subscribed Calendar");
}

TEST(Vocabulary, OnlyTheMakersOwnTypeCarriesTheWordAccount) {
  EXPECT_EQ(kQuarxAccountType, "QuarxAccount");
  EXPECT_EQ(kVelmoraAccountType, "Velmora");
}

TEST(Vocabulary, TheFifteenAccountTypesDiffer) {
  const std::set<std::string_view> types = {kSubscribedCalendarAccountType,
                                            kCalDAVAccountType,
                                            kCardDAVAccountType,
                                            kBookmarkDAVAccountType,
                                            kSMTPAccountType,
                                            kExchangeAccountType,
                                            kLDAPAccountType,
                                            kMailAccountType,
                                            kVelmoraAccountType,
                                            kGmailAccountType,
                                            kYahooAccountType,
                                            kOnMyDeviceAccountType,
                                            kIMAPNotesAccountType,
                                            kQuarxAccountType,
                                            kTolvaneIMAPAccountType};
  EXPECT_EQ(types.size(), 15U);
}

TEST(Vocabulary, DataclassesAreReverseDomainNames) {
  EXPECT_EQ(kAccountDataclassMail, "com.quarx.Dataclass.Mail");
  EXPECT_EQ(kAccountDataclassContactsSearch, "com.quarx.Dataclass.ContactsSearch");
  EXPECT_EQ(kAccountDataclassSharedStreams, "com.quarx.Dataclass.SharedStreams");
}

TEST(Vocabulary, KeysOfAnAccountDictionaryAreExact) {
  EXPECT_EQ(kAccountIdentifier, "Identifier");
  EXPECT_EQ(kAccountSyncIdentifier, "Sync Identifier");
  EXPECT_EQ(kAccountType, "Type");
  EXPECT_EQ(kAccountClass, "Class");
  EXPECT_EQ(kAccountDisplayName, "DisplayName");
  EXPECT_EQ(kAccountUsername, "Username");
  EXPECT_EQ(kAccountTypeString, "Type String");
  EXPECT_EQ(kAccountShortTypeString, "Short Type String");
  EXPECT_EQ(kAccountEnabledDataclasses, "Enabled Dataclasses");
  EXPECT_EQ(kAccountProvisionedDataclasses, "Provisioned Dataclasses");
  EXPECT_EQ(kAccountPreventRecentsSyncing, "Prevent Recents Syncing");
  EXPECT_EQ(kCalendarsAccountSubscribedCalendars, "Subscribed Calendars");
  EXPECT_EQ(kAccountCalendarsWereMigrated, "CalendarsWereMigrated");
  EXPECT_EQ(kAccountChildAccounts, "ChildAccounts");
}

TEST(Vocabulary, SupportedDataclassesIsOneTextUnderTwoNames) {
  EXPECT_EQ(kAccountSupportedDataclasses, "Supported Dataclasses");
  EXPECT_EQ(kPropertiesSupportedDataclasses, kAccountSupportedDataclasses);
}

TEST(Vocabulary, KeysOfTheConfigurationAreExact) {
  EXPECT_EQ(kPropertiesEnableDataclassActions, "Enable Actions");
  EXPECT_EQ(kPropertiesDisableDataclassActions, "Disable Actions");
  EXPECT_EQ(kPropertiesDeleteAccountActions, "Delete Account Actions");
  EXPECT_EQ(kPropertiesShowRemindersSeparately, "Show Reminders Separately");
  EXPECT_EQ(kDataclassSupportsMultipleStores, "Supports Multiple Stores");
  EXPECT_EQ(kDataclassDisplaySwitch, "Display Dataclass Switch");
  EXPECT_EQ(kDataclassRequiresUserConfirmation, "Requires User Confirmation");
}

TEST(Vocabulary, ActionsAreExact) {
  EXPECT_EQ(kDataclassToggleActionNone, "None");
  EXPECT_EQ(kDataclassToggleActionKeepLocalData, "Keep Local Data");
  EXPECT_EQ(kDataclassToggleActionMergeLocalData, "Merge Local Data");
  EXPECT_EQ(kDataclassToggleActionDeleteLocalData, "Delete Local Data");
  EXPECT_EQ(kDataclassToggleActionMergeSyncData, "Merge Sync Data");
  EXPECT_EQ(kDataclassToggleActionDeleteSyncData, "Delete Sync Data");
  EXPECT_EQ(kAccountDeleteActionMergeData, "Merge Data");
  EXPECT_EQ(kAccountDeleteActionDeleteData, "Delete Data");
}

TEST(Vocabulary, KeysOfAChangeRecordAreExact) {
  EXPECT_EQ(kASChangeAccountChangeTypeKey, "ChangeType");
  EXPECT_EQ(kASChangeAccountIdentifierKey, "AccountID");
  EXPECT_EQ(kASChangeAccountTypeKey, "AccountType");
  EXPECT_EQ(kASChangeAccountOriginallyEnabledDataclassesKey, "OriginalDataclasses");
}

TEST(Vocabulary, KeysAndNameOfTheSettingsFileAreExact) {
  EXPECT_EQ(kPlistVersionKey, "Version");
  EXPECT_EQ(kPlistAccountsKey, "Accounts");
  EXPECT_EQ(kAccountsFilename, "com.quarx.accountsettings.plist");
}

TEST(Vocabulary, TheMigrationLockIsACharacterStringThatFileOperationsTake) {
  static_assert(std::is_convertible_v<decltype(kAccountMigrationLockFilename), const char*>);
  EXPECT_EQ(std::strcmp(kAccountMigrationLockFilename, "/tmp/AccountMigrationInProgress"), 0);
}

}  // namespace
