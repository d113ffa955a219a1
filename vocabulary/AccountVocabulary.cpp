#include "vocabulary/AccountVocabulary.h"

#include "vocabulary/DevicePlaces.h"

// Nothing but definitions: vocabulary/AccountVocabulary.h says what each is for.

constinit const std::string_view kSubscribedCalendarAccountType = "Subscribed Calendar";
constinit const std::string_view kCalDAVAccountType = "CalDAV";
constinit const std::string_view kCardDAVAccountType = "CardDAV";
constinit const std::string_view kBookmarkDAVAccountType = "BookmarkDAV";
constinit const std::string_view kSMTPAccountType = "SMTP";
constinit const std::string_view kExchangeAccountType = "Exchange";
constinit const std::string_view kLDAPAccountType = "LDAP";
constinit const std::string_view kMailAccountType = "Mail";
constinit const std::string_view kVelmoraAccountType = "Velmora";
constinit const std::string_view kGmailAccountType = "Gmail";
constinit const std::string_view kYahooAccountType = "Yahoo";
constinit const std::string_view kOnMyDeviceAccountType = "OnMyDevice";
constinit const std::string_view kIMAPNotesAccountType = "IMAPNotes";
constinit const std::string_view kQuarxAccountType = "QuarxAccount";
constinit const std::string_view kTolvaneIMAPAccountType = "TolvaneIMAP";

constinit const std::string_view kAccountDataclassMail = "com.quarx.Dataclass.Mail";
constinit const std::string_view kAccountDataclassContacts = "com.quarx.Dataclass.Contacts";
constinit const std::string_view kAccountDataclassCalendars = "com.quarx.Dataclass.Calendars";
constinit const std::string_view kAccountDataclassReminders = "com.quarx.Dataclass.Reminders";
constinit const std::string_view kAccountDataclassBookmarks = "com.quarx.Dataclass.Bookmarks";
constinit const std::string_view kAccountDataclassNotes = "com.quarx.Dataclass.Notes";
constinit const std::string_view kAccountDataclassMediaStream = "com.quarx.Dataclass.MediaStream";
constinit const std::string_view kAccountDataclassDeviceLocator =
    "com.quarx.Dataclass.DeviceLocator";
constinit const std::string_view kAccountDataclassContactsSearch =
    "com.quarx.Dataclass.ContactsSearch";
constinit const std::string_view kAccountDataclassBackup = "com.quarx.Dataclass.Backup";
constinit const std::string_view kAccountDataclassUbiquity = "com.quarx.Dataclass.Ubiquity";
constinit const std::string_view kAccountDataclassKeyValue = "com.quarx.Dataclass.KeyValue";
constinit const std::string_view kAccountDataclassShoebox = "com.quarx.Dataclass.Shoebox";
constinit const std::string_view kAccountDataclassSharedStreams =
    "com.quarx.Dataclass.SharedStreams";

constinit const std::string_view kAccountIdentifier = "Identifier";
constinit const std::string_view kAccountSyncIdentifier = "Sync Identifier";
constinit const std::string_view kAccountType = "Type";
constinit const std::string_view kAccountClass = "Class";
constinit const std::string_view kAccountDisplayName = "DisplayName";
constinit const std::string_view kAccountUsername = "Username";
constinit const std::string_view kAccountTypeString = "Type String";
constinit const std::string_view kAccountShortTypeString = "Short Type String";
constinit const std::string_view kAccountEnabledDataclasses = "Enabled Dataclasses";
constinit const std::string_view kAccountProvisionedDataclasses = "Provisioned Dataclasses";
constinit const std::string_view kAccountSupportedDataclasses = "Supported Dataclasses";
constinit const std::string_view kAccountPreventRecentsSyncing = "Prevent Recents Syncing";
constinit const std::string_view kCalendarsAccountSubscribedCalendars = "Subscribed Calendars";
constinit const std::string_view kAccountCalendarsWereMigrated = "CalendarsWereMigrated";
constinit const std::string_view kAccountChildAccounts = "ChildAccounts";

constinit const std::string_view kPropertiesSupportedDataclasses = "Supported Dataclasses";
constinit const std::string_view kPropertiesEnableDataclassActions = "Enable Actions";
constinit const std::string_view kPropertiesDisableDataclassActions = "Disable Actions";
constinit const std::string_view kPropertiesDeleteAccountActions = "Delete Account Actions";
constinit const std::string_view kPropertiesShowRemindersSeparately = "Show Reminders Separately";

constinit const std::string_view kDataclassSupportsMultipleStores = "Supports Multiple Stores";
constinit const std::string_view kDataclassDisplaySwitch = "Display Dataclass Switch";
constinit const std::string_view kDataclassRequiresUserConfirmation = "Requires User Confirmation";

constinit const std::string_view kDataclassToggleActionNone = "None";
constinit const std::string_view kDataclassToggleActionKeepLocalData = "Keep Local Data";
constinit const std::string_view kDataclassToggleActionMergeLocalData = "Merge Local Data";
constinit const std::string_view kDataclassToggleActionDeleteLocalData = "Delete Local Data";
constinit const std::string_view kDataclassToggleActionMergeSyncData = "Merge Sync Data";
constinit const std::string_view kDataclassToggleActionDeleteSyncData = "Delete Sync Data";

constinit const std::string_view kAccountDeleteActionMergeData = "Merge Data";
constinit const std::string_view kAccountDeleteActionDeleteData = "Delete Data";

constinit const std::string_view kASChangeAccountChangeTypeKey = "ChangeType";
constinit const std::string_view kASChangeAccountIdentifierKey = "AccountID";
constinit const std::string_view kASChangeAccountTypeKey = "AccountType";
constinit const std::string_view kASChangeAccountOriginallyEnabledDataclassesKey =
    "OriginalDataclasses";

constinit const std::string_view kPlistVersionKey = "Version";
constinit const std::string_view kPlistAccountsKey = "Accounts";
constinit const std::string_view kAccountsFilename = "com.quarx.accountsettings.plist";
constexpr char kAccountMigrationLockFilename[] = "/tmp/AccountMigrationInProgress";

static_assert(accounts::listed(accounts::DevicePlace::Settings)
                  .path.ends_with("/com.quarx.accountsettings.plist"));
static_assert(
    std::string_view(kAccountMigrationLockFilename).ends_with(accounts::kMigrationLockName));
