#pragma once

#include <string_view>

// The fixed vocabulary of account settings. The values stand in files on every device, so they are
// exact to the byte; the names are exported by the plug-in, so they stand in the global namespace.

// Account types: the values of "Type" in an account dictionary, and the keys of the account-types
// configuration and of the account-creation map.
extern const std::string_view kSubscribedCalendarAccountType;
extern const std::string_view kCalDAVAccountType;
extern const std::string_view kCardDAVAccountType;
extern const std::string_view kBookmarkDAVAccountType;
extern const std::string_view kSMTPAccountType;
extern const std::string_view kExchangeAccountType;
extern const std::string_view kLDAPAccountType;
extern const std::string_view kMailAccountType;
extern const std::string_view kVelmoraAccountType;
extern const std::string_view kGmailAccountType;
extern const std::string_view kYahooAccountType;
extern const std::string_view kOnMyDeviceAccountType;
extern const std::string_view kIMAPNotesAccountType;
extern const std::string_view kQuarxAccountType;
extern const std::string_view kTolvaneIMAPAccountType;

// Dataclasses: kinds of synced data, in their canonical order.
extern const std::string_view kAccountDataclassMail;
extern const std::string_view kAccountDataclassContacts;
extern const std::string_view kAccountDataclassCalendars;
extern const std::string_view kAccountDataclassReminders;
extern const std::string_view kAccountDataclassBookmarks;
extern const std::string_view kAccountDataclassNotes;
extern const std::string_view kAccountDataclassMediaStream;
extern const std::string_view kAccountDataclassDeviceLocator;
extern const std::string_view kAccountDataclassContactsSearch;
extern const std::string_view kAccountDataclassBackup;
extern const std::string_view kAccountDataclassUbiquity;
extern const std::string_view kAccountDataclassKeyValue;
extern const std::string_view kAccountDataclassShoebox;
extern const std::string_view kAccountDataclassSharedStreams;

// Keys of an account dictionary.
/// String; unique account identifier.
extern const std::string_view kAccountIdentifier;
/// String; identifier of the account's sync store; at creation equal to the identifier.
extern const std::string_view kAccountSyncIdentifier;
/// String; one of the account types above.
extern const std::string_view kAccountType;
/// String; the name of the class that implements the full account.
extern const std::string_view kAccountClass;
/// String; name shown to the user.
extern const std::string_view kAccountDisplayName;
/// String; the account's user name.
extern const std::string_view kAccountUsername;
/// String; long human-readable name of the account's type.
extern const std::string_view kAccountTypeString;
/// String; short human-readable name of the type.
extern const std::string_view kAccountShortTypeString;
/// Array of dataclass strings switched on by the user.
extern const std::string_view kAccountEnabledDataclasses;
/// Array of dataclass strings that this account is set up for.
extern const std::string_view kAccountProvisionedDataclasses;
/// Array of dataclass strings.
extern const std::string_view kAccountSupportedDataclasses;
/// Boolean.
extern const std::string_view kAccountPreventRecentsSyncing;
/// Array describing the subscribed calendars of a calendar account.
extern const std::string_view kCalendarsAccountSubscribedCalendars;
/// Boolean marker of a done calendar migration.
extern const std::string_view kAccountCalendarsWereMigrated;
/// Array of child account dictionaries.
extern const std::string_view kAccountChildAccounts;

// Keys of one type's entry in the account-types configuration.
extern const std::string_view kPropertiesSupportedDataclasses;
extern const std::string_view kPropertiesEnableDataclassActions;
extern const std::string_view kPropertiesDisableDataclassActions;
extern const std::string_view kPropertiesDeleteAccountActions;
extern const std::string_view kPropertiesShowRemindersSeparately;

// Keys of one dataclass's entry in the dataclass configuration; all hold booleans.
extern const std::string_view kDataclassSupportsMultipleStores;
extern const std::string_view kDataclassDisplaySwitch;
extern const std::string_view kDataclassRequiresUserConfirmation;

// What may be done with existing data when a dataclass is switched on or off.
extern const std::string_view kDataclassToggleActionNone;
extern const std::string_view kDataclassToggleActionKeepLocalData;
extern const std::string_view kDataclassToggleActionMergeLocalData;
extern const std::string_view kDataclassToggleActionDeleteLocalData;
extern const std::string_view kDataclassToggleActionMergeSyncData;
extern const std::string_view kDataclassToggleActionDeleteSyncData;

// What may be done with the data of an account that is deleted.
extern const std::string_view kAccountDeleteActionMergeData;
extern const std::string_view kAccountDeleteActionDeleteData;

// Keys of the record that describes one changed account.
extern const std::string_view kASChangeAccountChangeTypeKey;
extern const std::string_view kASChangeAccountIdentifierKey;
extern const std::string_view kASChangeAccountTypeKey;
extern const std::string_view kASChangeAccountOriginallyEnabledDataclassesKey;

// The account settings file and the migration lock.
extern const std::string_view kPlistVersionKey;
extern const std::string_view kPlistAccountsKey;
extern const std::string_view kAccountsFilename;
/// A plain path for file operations: unlike all other constants a NUL-terminated character string.
extern const char kAccountMigrationLockFilename[];
