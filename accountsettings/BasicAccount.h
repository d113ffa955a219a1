#pragma once

#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/AccountFate.h"
#include "platform/AccountFramework.h"
#include "propertylist/value/PropertyValue.h"
#include "vocabulary/AccountVocabulary.h"

namespace accounts {

class BasicAccount;
/// A record as stores, parents and callers share it.
using BasicAccountReference = std::shared_ptr<BasicAccount>;

/// The record of one account: its account dictionary, the rules that decide which dataclasses it
/// supports, is provisioned for and has enabled, its parent, and a snapshot of the dictionary as
/// last loaded or saved. Operations whose names begin with an underscore are for this system's own
/// use. Not for use by several threads at once.
class BasicAccount : public AccountRecord, public std::enable_shared_from_this<BasicAccount> {
 public:
  BasicAccount(const BasicAccount&) = delete;
  BasicAccount& operator=(const BasicAccount&) = delete;
  ~BasicAccount() override = default;

  // Creation (BasicAccount.cpp)

  /// A record made from an account dictionary, which also becomes its snapshot. A dictionary
  /// without a text under "Identifier" gets a fresh one. Null, with a channel line, for an unknown
  /// account type or a missing class.
  static BasicAccountReference initWithProperties(const PropertyDictionary& properties);
  /// Whether that makes a record.
  static bool accepts(const PropertyDictionary& properties);
  /// A record of a type and a class with a fresh identifier. An unknown type or an empty class is a
  /// fatal assertion.
  static BasicAccountReference _initWithType_class(std::optional<std::string_view> type,
                                                   std::optional<std::string_view> accountClass);
  /// Why initWithProperties() makes no record of an element of a file, as a clause such as "it has
  /// no class". Only for an element that it makes none of.
  static std::string_view whyRefused(const PropertyValue& element);
  /// Forbidden: a fatal assertion.
  [[noreturn]] static BasicAccountReference init();
  static BasicAccountReference accountWithType_class(std::optional<std::string_view> type,
                                                     std::optional<std::string_view> accountClass);
  static BasicAccountReference accountWithProperties(const PropertyDictionary& properties);
  /// The text of a fresh random UUID; none when the platform cannot make one.
  static std::optional<Text> createNewAccountUID();

  // Account types and dataclasses in general (BasicAccountConfiguration.cpp)

  /// Loads the account-types table once. Every operation that reads the table calls it first. A
  /// missing or unreadable resource is a fatal assertion.
  static void initialize();
  /// Whether the device runs several programs at once; only then may accounts support notes.
  static bool isMultitaskingEnabled();
  /// The fourteen dataclasses in canonical order; always the same object.
  static const PropertyArray& allSupportedDataclasses();
  /// The account types that the configuration knows, in the order of their texts.
  static std::vector<Text> knownAccountTypes();
  /// The dataclasses of a type in the order its configuration lists them; none for an unknown type.
  static std::optional<PropertyArray> supportedDataclassesForAccountType(std::string_view type);
  /// The actions offered when a dataclass is switched on (off) for a type; none for an unknown
  /// type.
  static std::optional<PropertyArray> userActionsToEnableDataclass_forAccountType(
      std::string_view dataclass, std::string_view type);
  static std::optional<PropertyArray> userActionsToDisableDataclass_forAccountType(
      std::string_view dataclass, std::string_view type);
  /// The actions without the last "Keep Local Data".
  static PropertyArray removeActionsIncompatibleWithSingleStoreDataclass(
      const PropertyArray& actions);
  /// The actions offered when an account of a type is deleted; none for an unknown type.
  static std::optional<PropertyArray> deleteAccountActionsForAccountType(std::string_view type);
  /// False for an unknown type or dataclass, like the answers below.
  static bool showRemindersSeparatelyForAccountType(std::string_view type);
  static bool multipleStoresSupportedByDataclass(std::string_view dataclass);
  static bool displayToggleForDataclass(std::string_view dataclass);
  static bool userConfirmationIsRequiredByDataclass(std::string_view dataclass);
  /// Whether a text is a type that the configuration knows; false for none and for the empty text.
  static bool _isValidAccountType(std::optional<std::string_view> type);
  /// The dataclass configuration, read afresh; none when it is missing or unreadable.
  static std::optional<PropertyDictionary> _dataclassesProperties();

  // Properties (BasicAccountProperties.cpp)

  /// The account's own value for a key, else its parent's; none when neither has one.
  [[nodiscard]] std::optional<PropertyValue> accountPropertyForKey(
      std::string_view key) const override;
  /// The same, if the value found is a text (an array, a dictionary); none otherwise.
  [[nodiscard]] std::optional<Text> textPropertyForKey(std::string_view key) const;
  [[nodiscard]] std::optional<PropertyArray> arrayPropertyForKey(std::string_view key) const;
  [[nodiscard]] std::optional<PropertyDictionary> dictionaryPropertyForKey(
      std::string_view key) const;
  /// The value found for a key, read as a boolean (an integer); none when there is none or it
  /// cannot be read so.
  [[nodiscard]] std::optional<bool> booleanPropertyForKey(std::string_view key) const;
  [[nodiscard]] std::optional<std::int64_t> integerPropertyForKey(std::string_view key) const;

  /// Stores an own value; none removes the key. "Class" and "Type" cannot be changed so: they are
  /// silently left.
  void setAccountProperty_forKey(std::optional<PropertyValue> value, std::string_view key);
  /// Stores an own value under any key, "Class" and "Type" included; none removes the key.
  void _forcedSetAccountProperty_forKey(std::optional<PropertyValue> value, std::string_view key);
  void removeAccountPropertyForKey(std::string_view key);

  /// The live own dictionary; the reference stays valid, and changes, as long as the record lives.
  [[nodiscard]] const PropertyDictionary& properties() const override { return _properties; }
  /// The dictionary that the store writes; valid as long as properties().
  [[nodiscard]] virtual const PropertyDictionary& propertiesToSave() const { return _properties; }
  [[nodiscard]] const std::optional<PropertyDictionary>& originalProperties() const {
    return _originalProperties;
  }
  /// Takes a new snapshot.
  void setOriginalProperties(std::optional<PropertyDictionary> properties);

  /// The texts under "Type", "Identifier", "Sync Identifier", "Class", "DisplayName", "Type String"
  /// and "Short Type String", own or inherited; none when there is no text.
  [[nodiscard]] std::optional<Text> type() const override;
  [[nodiscard]] std::optional<Text> identifier() const override;
  /// The text under "Identifier", whatever a record of another class answers above.
  [[nodiscard]] std::optional<Text> identifierProperty() const;
  [[nodiscard]] virtual std::optional<Text> syncStoreIdentifier() const;
  [[nodiscard]] std::optional<Text> accountClass() const;
  [[nodiscard]] virtual std::optional<Text> displayName() const;
  [[nodiscard]] std::optional<Text> typeString() const;
  [[nodiscard]] std::optional<Text> shortTypeString() const;

  /// Changes "Class"; the class that the account already has changes nothing.
  void setAccountClass(std::string_view newClass);
  /// Changes the own "DisplayName"; the name already stored there changes nothing.
  void setDisplayName(std::optional<Text> newName);

  [[nodiscard]] const BasicAccountReference& parentAccount() const { return _parentAccount; }
  [[nodiscard]] AccountRecordReference parentRecord() const override { return _parentAccount; }
  void setParentAccount(BasicAccountReference parent);
  /// The parent's identifier; none without a parent.
  [[nodiscard]] std::optional<Text> parentAccountIdentifier() const;

  /// Which account this is for whoever observes a migration.
  [[nodiscard]] AccountOrigin origin() const { return _origin; }
  void setOrigin(AccountOrigin origin) { _origin = origin; }

  // Dataclasses of this account, in canonical order (BasicAccountDataclasses.cpp)

  /// What the account's type supports; empty for an unknown type.
  [[nodiscard]] PropertyArray supportedDataclasses() const;
  /// What the account is set up for, as far as it is supported and no profile hides it.
  [[nodiscard]] PropertyArray provisionedDataclasses() const;
  [[nodiscard]] std::optional<PropertyArray> enabledDataclasses() const override;
  [[nodiscard]] bool isEnabledForDataclass(std::string_view dataclass) const;
  /// Switches a dataclass on or off; one that the type does not support is silently left.
  void setEnabled_forDataclass(bool enabled, std::string_view dataclass);
  /// Switches exactly these dataclasses on, unsupported ones dropped. An empty list leaves no list
  /// stored.
  void setEnabledForDataclasses(const PropertyArray& dataclasses);
  /// Switches a dataclass on or off, supported or not.
  void _forcedSetEnabled_forDataclass(bool enabled, std::string_view dataclass);
  /// The texts of a list with the canonical dataclasses first, in their order and once each, then
  /// all others in theirs.
  static PropertyArray _orderedDataclasses(const std::optional<PropertyArray>& dataclasses);
  /// The dataclasses that configuration profiles hide, asked afresh on every call.
  static PropertyArray _profileRestrictedDataclasses();

  // Full and sync accounts, made by the classes that the account-creation map names
  // (BasicAccountCreators.cpp). An error in the map, a framework that cannot be loaded and a full
  // account that cannot be made are fatal assertions.

  /// The account-creation map, read once; none when the resource is missing or unreadable.
  static const std::optional<PropertyDictionary>& _accountCreationMap();
  /// The account-creation map, read afresh.
  static std::optional<PropertyDictionary> _creatorsInfo();
  /// The name of the class that makes companions of a kind ("FullAccount", "SyncAccount") for a
  /// type, its framework being loaded; none when the type has no creator of the kind. A loader,
  /// null for none, may load the framework of a full account itself. No type is an error in the
  /// map.
  std::optional<Text> _creatorClassNameForAccountType_creatorType_loader(
      const std::optional<Text>& type, std::string_view creatorType,
      FullAccountLoader* loader) const;
  std::optional<Text> fullAccountCreatorClassNameForAccountType_loader(
      const std::optional<Text>& type, FullAccountLoader* loader) const;
  std::optional<Text> syncAccountCreatorClassNameForAccountType(
      const std::optional<Text>& type) const;

  /// The full account, made on the first call and then always the same; never null.
  FullAccountReference fullAccountUsingLoader(FullAccountLoader* loader);
  void setFullAccount(FullAccountReference account);
  /// The sync account, made on the first call that succeeds; null, with a channel line unless the
  /// type has no sync accounts, when it cannot be made.
  SyncAccountReference _cachedSyncAccount();

  /// Forwarded to the sync account, whose answer is the result; none without a sync account.
  std::optional<PropertyValue> refreshContainerWithIdentifier_forDataclass_isUserRequested(
      std::string_view identifier, std::string_view dataclass, bool isUserRequested);
  std::optional<PropertyValue> refreshContainerListForDataclass_isUserRequested(
      std::string_view dataclass, bool isUserRequested);
  std::optional<PropertyValue> refreshContainersForDataclass_isUserRequested(
      std::string_view dataclass, bool isUserRequested);
  /// The same, not requested by the user.
  std::optional<PropertyValue> refreshContainerWithIdentifier_forDataclass(
      std::string_view identifier, std::string_view dataclass);
  std::optional<PropertyValue> refreshContainerListForDataclass(std::string_view dataclass);
  std::optional<PropertyValue> refreshContainersForDataclass(std::string_view dataclass);
  /// Renews nothing: calls the handler at once, once, with the result code 3.
  static void renewAccountCredentialsWithHandler(
      const std::function<void(int resultCode)>& handler);

 protected:
  BasicAccount() = default;
  /// Does the work of initWithProperties() on a new record. False when the dictionary is not
  /// accepted.
  [[nodiscard]] bool acceptProperties(const PropertyDictionary& properties);

 private:
  [[nodiscard]] std::optional<Text> ownTextOrProperty(const Text& own, std::string_view key) const;
  /// The account's own value for a key, else its parent's; null when neither has one.
  [[nodiscard]] const PropertyValue* valueForKey(std::string_view key) const;
  /// Told after every change of an own value.
  void noteChangeOfKey(std::string_view key);

  std::optional<PropertyDictionary> _originalProperties;
  PropertyDictionary _properties;
  // The own texts under "Type", "Class" and "Identifier", at hand because every walk through a
  // store asks for them: its accounts' dictionaries are more than the processor's caches hold.
  // Empty for none, too: then, and only then, the dictionary is asked.
  Text _ownType;
  Text _ownClass;
  Text _ownIdentifier;
  AccountOrigin _origin;
  FullAccountReference _fullAccount;
  SyncAccountReference _syncAccount;
  BasicAccountReference _parentAccount;
};

}  // namespace accounts
