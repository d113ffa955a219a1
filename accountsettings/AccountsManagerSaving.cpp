#include <algorithm>
#include <string>
#include <utility>

#include "accountsettings/AccountsManager.h"
#include "accountsettings/Log.h"
#include "accountsettings/OnDiskAccounts.h"
#include "accountsettings/Process.h"
#include "accountsettings/ThreeWayMerge.h"
#include "vocabulary/DevicePlaces.h"

namespace accounts {

namespace {

constexpr std::string_view kSaveOperation = "-[AccountsManager saveAllAccounts]";

/// The user and the group that the account settings file belongs to.

/// The array of account dictionaries in the account settings file; empty when there is none.
PropertyArray accountsOnDisk() {
  const std::optional<PropertyDictionary> root =
      Process::current().platform.propertyLists.readDictionary(
          AccountsManager::fullPathToAccountSettingsPlist());
  return root ? root->arrayForKey(kPlistAccountsKey).value_or(PropertyArray()) : PropertyArray();
}

/// What the account settings file is to hold; none, with a channel line, when it cannot be written.
SerializedPropertyList serialize(const PropertyDictionary& root) {
  auto serialized = Process::current().platform.propertyLists.serializeBinary(root);
  if (!serialized || !*serialized) {
    logToChannel(kSaveOperation, "Failed to serialize account settings data: %@", [&] {
      return logArguments(serialized ? std::optional<Text>() : Text(serialized.error().text));
    });
  }
  return std::move(serialized).value_or(SerializedPropertyList());
}

/// Fills the temporary file and moves it over the account settings file. False when a step fails.
bool writeThroughTemporaryFile(const SerializedPropertyList& contents,
                               const std::string& temporaryPath, const std::string& path) {
  FileSystem& fileSystem = Process::current().platform.fileSystem;
  if (!contents || !fileSystem.writeFile(temporaryPath, contents)) {
    return false;
  }
  const Result attributes =
      fileSystem.setOwnerAndGroup(temporaryPath, kSettingsFileOwner, kSettingsFileOwner);
  if (!attributes) {
    logToChannel(kSaveOperation,
                 "Could not set attributes on the temporary account settings plist. %@",
                 [&] { return logArguments(attributes.error().text); });
    return false;
  }
  return static_cast<bool>(fileSystem.renameFile(temporaryPath, path));
}

/// Replaces the account settings file. False, with a channel line and with the file as it was, when
/// that fails.
bool writeSettingsFile(const PropertyDictionary& root) {
  FileSystem& fileSystem = Process::current().platform.fileSystem;
  const SerializedPropertyList contents = serialize(root);
  const std::string path = AccountsManager::fullPathToAccountSettingsPlist();
  const std::optional<std::string> temporaryPath = fileSystem.makeTemporaryFile();
  if (temporaryPath && writeThroughTemporaryFile(contents, *temporaryPath, path)) {
    return true;
  }
  logToChannel(kSaveOperation, "Failed to save accounts to filesystem.");
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
  static constexpr std::string_view kOperation =
      "-[AccountsManager mergeInMemoryProperties:originalProperties:onDiskProperties:]";
  logToChannel(kOperation, "Merging inmem %@ orig %@ onDisk %@",
               [&] { return logArguments(inMemory, original, onDisk); });
  PropertyDictionary merged = mergeThreeWays(inMemory, original.value_or(PropertyDictionary()),
                                             onDisk.value_or(PropertyDictionary()));
  logToChannel(kOperation, "Merged to %@", [&] { return logArguments(merged); });
  return merged;
}

void AccountsManager::saveAllAccounts() {
  logToChannel(kSaveOperation, "Saving all accounts");
  const FixResult fixing = _fixAccountsBeforeSaving();
  const PropertyArray merged = _mergedAccounts();
  // Kept on purpose: the version of this code, whatever dataVersion() says, since what is written
  // has this code's layout.
  const bool isSaved =
      writeSettingsFile({{kPlistAccountsKey, merged}, {kPlistVersionKey, currentVersion()}});
  if (isSaved) {
    for (const BasicAccountReference& account : _orderedTopLevelAccounts.accounts()) {
      account->setOriginalProperties(account->propertiesToSave());
    }
    _newestSave.note(merged, _orderedTopLevelAccounts, fixing);
  }
  if (fixing != FixResult::Unchanged) {
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

FixResult AccountsManager::_fixAccountsBeforeSaving() {
  FixResult gravest = FixResult::Unchanged;
  const Accounts& accounts = _orderedTopLevelAccounts.accounts();
  for (std::size_t index = accounts.size(); index-- > 0;) {
    const FixResult result = _fixAccount(*accounts[index], "saving accounts");
    gravest = std::max(gravest, result);
    if (result != FixResult::CannotBeKept) {
      continue;
    }
    // Kept on purpose: the account leaves the indexes only. It stays in the list and is written, so
    // that what a person has set up is not lost by a save.
    if (const std::optional<Text> identifier = accounts[index]->identifier()) {
      _removeChildrenForAccountWithIdentifier(identifier);
      _topLevelAccountsByID.remove(*identifier);
    }
  }
  return gravest;
}

PropertyArray AccountsManager::_mergedAccounts() const {
  const OnDiskAccounts onDisk(accountsOnDisk(), _newestSave, _orderedTopLevelAccounts);
  const Accounts& accounts = _orderedTopLevelAccounts.accounts();
  std::vector<PropertyValue> mergedAccounts;
  mergedAccounts.reserve(accounts.size());
  for (std::size_t index = 0; index < accounts.size(); ++index) {
    const BasicAccount& account = *accounts[index];
    PropertyDictionary merged = mergeInMemoryProperties_originalProperties_onDiskProperties(
        account.propertiesToSave(), account.originalProperties(),
        onDisk.propertiesForAccountAt(index));
    logToChannel(
        kSaveOperation, "Calculated Properties - Type: %@, Properties: %@, Dataclasses: %@",
        [&] { return logArguments(account.type(), merged, account.enabledDataclasses()); });
    mergedAccounts.emplace_back(std::move(merged));
  }
  return PropertyArray(std::move(mergedAccounts));
}

}  // namespace accounts
