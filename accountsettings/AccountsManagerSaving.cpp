#include <string>
#include <utility>

#include "accountsettings/AccountsManager.h"
#include "accountsettings/Log.h"
#include "accountsettings/Process.h"
#include "accountsettings/ThreeWayMerge.h"

namespace accounts {

namespace {

constexpr std::string_view saveOperation = "-[AccountsManager saveAllAccounts]";

/// The user and the group that the account settings file belongs to.
constexpr std::string_view fileOwner = "mobile";

/// The bytes of the account settings file, valid until the platform's property lists are used
/// again; none, with a channel line, when they cannot be made.
std::optional<std::string_view> serialize(const PropertyDictionary& root) {
  std::string_view bytes;
  const Result serialization =
      Process::current().platform.propertyLists.serializeBinary(root, bytes);
  if (!serialization || bytes.empty()) {
    logToChannel(saveOperation, "Failed to serialize account settings data: %@", [&] {
      return logArguments(serialization ? std::optional<Text>() : Text(serialization.error()));
    });
    return std::nullopt;
  }
  return bytes;
}

/// Fills the temporary file and moves it over the account settings file. False when a step fails.
bool writeThroughTemporaryFile(std::optional<std::string_view> bytes,
                               const std::string& temporaryPath, const std::string& path) {
  FileSystem& fileSystem = Process::current().platform.fileSystem;
  if (!bytes || !fileSystem.writeFile(temporaryPath, *bytes)) {
    return false;
  }
  const Result attributes = fileSystem.setOwnerAndGroup(temporaryPath, fileOwner, fileOwner);
  if (!attributes) {
    logToChannel(saveOperation,
                 "Could not set attributes on the temporary account settings plist. %@",
                 [&] { return logArguments(attributes.error()); });
    return false;
  }
  return static_cast<bool>(fileSystem.renameFile(temporaryPath, path));
}

/// Replaces the account settings file. False, with a channel line and with the file as it was, when
/// that fails.
bool writeSettingsFile(const PropertyDictionary& root) {
  FileSystem& fileSystem = Process::current().platform.fileSystem;
  const std::optional<std::string_view> bytes = serialize(root);
  const std::string path = AccountsManager::fullPathToAccountSettingsPlist();
  const std::optional<std::string> temporaryPath = fileSystem.makeTemporaryFile();
  if (temporaryPath && writeThroughTemporaryFile(bytes, *temporaryPath, path)) {
    return true;
  }
  logToChannel(saveOperation, "Failed to save accounts to filesystem.");
  if (temporaryPath) {
    // Nothing can be done about a temporary file that stays.
    (void)fileSystem.removeFile(*temporaryPath);
  }
  return false;
}

}  // namespace

PropertyDictionary AccountsManager::mergeInMemoryProperties_originalProperties_onDiskProperties(
    const PropertyDictionary& inMemory, const std::optional<PropertyDictionary>& original,
    const std::optional<PropertyDictionary>& onDisk) {
  static constexpr std::string_view operation =
      "-[AccountsManager mergeInMemoryProperties:originalProperties:onDiskProperties:]";
  logToChannel(operation, "Merging inmem %@ orig %@ onDisk %@",
               [&] { return logArguments(inMemory, original, onDisk); });
  PropertyDictionary merged = mergeThreeWays(inMemory, original.value_or(PropertyDictionary()),
                                             onDisk.value_or(PropertyDictionary()));
  logToChannel(operation, "Merged to %@", [&] { return logArguments(merged); });
  return merged;
}

void AccountsManager::saveAllAccounts() {
  logToChannel(saveOperation, "Saving all accounts");
  const bool fixersChangedAccounts = _fixAccountsBeforeSaving();
  const bool isSaved = writeSettingsFile(_mergedRoot());
  if (isSaved) {
    for (const BasicAccountReference& account : _orderedTopLevelAccounts.accounts()) {
      account->setOriginalProperties(account->propertiesToSave());
    }
  }
  if (fixersChangedAccounts) {
    // Kept on purpose: also after a failed save. What matters to the fixers is that an attempt was
    // made.
    _tellRuntimeFixers(true);
  }
  // Kept on purpose: while notifications are skipped the baseline stays, so that the next save that
  // notifies reports every change since the last one that did.
  if (isSaved && !Process::current().shouldSkipNotifications) {
    _sendNotificationsForChangedAccounts();
    _setOriginalAccountDictionaries();
  }
}

bool AccountsManager::_fixAccountsBeforeSaving() {
  bool fixersChangedAccounts = false;
  const Accounts& accounts = _orderedTopLevelAccounts.accounts();
  for (std::size_t index = accounts.size(); index-- > 0;) {
    const FixResult result = _fixAccount(*accounts[index], "saving accounts");
    fixersChangedAccounts |= result != FixResult::Unchanged;
    const std::optional<Text> identifier = accounts[index]->identifier();
    // Kept on purpose: the account leaves the indexes only. It stays in the list and is written, so
    // that what a person has set up is not lost by a save.
    if (result == FixResult::CannotBeKept && identifier) {
      _removeChildrenForAccountWithIdentifier(identifier);
      _topLevelAccountsByID.remove(*identifier);
    }
  }
  return fixersChangedAccounts;
}

std::vector<std::optional<PropertyDictionary>> AccountsManager::_onDiskProperties() const {
  // Of the accounts on disk only the top-level ones are needed, unless one is looked for that is
  // not among them. What else there is of a store could be seen in the channel's lines alone.
  const bool isWatched = _ASLogSystem()->isEnabled();
  std::unique_ptr<AccountsManager> onDisk =
      _initFromFile(isWatched ? Extent::Whole : Extent::TopLevelAccounts);
  bool hasChildren = isWatched;
  std::vector<std::optional<PropertyDictionary>> result;
  result.reserve(_orderedTopLevelAccounts.size());
  for (const BasicAccountReference& account : _orderedTopLevelAccounts.accounts()) {
    const std::optional<Text> identifier = account->identifier();
    if (!hasChildren && identifier && !onDisk->_topLevelAccountsByID.contains(*identifier)) {
      for (const BasicAccountReference& parent : onDisk->_orderedTopLevelAccounts.accounts()) {
        onDisk->_loadChildrenFromAccount(parent);
      }
      hasChildren = true;
    }
    const BasicAccountReference diskAccount =
        identifier ? onDisk->accountWithIdentifier(*identifier) : nullptr;
    result.push_back(diskAccount ? std::optional(diskAccount->propertiesToSave()) : std::nullopt);
  }
  return result;
}

PropertyDictionary AccountsManager::_mergedRoot() const {
  const std::vector<std::optional<PropertyDictionary>> onDisk = _onDiskProperties();
  const Accounts& accounts = _orderedTopLevelAccounts.accounts();
  std::vector<PropertyValue> mergedAccounts;
  mergedAccounts.reserve(accounts.size());
  for (std::size_t index = 0; index < accounts.size(); ++index) {
    const BasicAccount& account = *accounts[index];
    PropertyDictionary merged = mergeInMemoryProperties_originalProperties_onDiskProperties(
        account.propertiesToSave(), account.originalProperties(), onDisk[index]);
    logToChannel(
        saveOperation, "Calculated Properties - Type: %@, Properties: %@, Dataclasses: %@",
        [&] { return logArguments(account.type(), merged, account.enabledDataclasses()); });
    mergedAccounts.emplace_back(std::move(merged));
  }
  // Kept on purpose: the version of this code, whatever dataVersion() says, since what is written
  // has this code's layout.
  return {{kPlistAccountsKey, PropertyArray(std::move(mergedAccounts))},
          {kPlistVersionKey, currentVersion()}};
}

}  // namespace accounts
