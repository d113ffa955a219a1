#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include "propertylist/value/PropertyValue.h"

namespace accounts {

/// The version of what frameworks and the bundle share with a program that loads them: all headers
/// of platform/ and of the values. To be raised when one of them changes its layout.
inline constexpr std::uint32_t kInterfaceVersion = 4;
/// The name under which what is loaded tells the version that it was built with.
inline constexpr const char* kInterfaceVersionFunction = "AccountsInterfaceVersion";

/// What happened to an account between two saves. The numbers are those of change records, under
/// kASChangeAccountChangeTypeKey.
enum class AccountChangeType : std::int32_t { Added = 0, Modified = 1, Deleted = 2 };

/// What a framework sees of an account: its record in the store.
class AccountRecord {
 public:
  virtual ~AccountRecord() = default;

  /// The account's identifier and type; none when the record has none.
  [[nodiscard]] virtual std::optional<Text> identifier() const = 0;
  [[nodiscard]] virtual std::optional<Text> type() const = 0;
  /// The record's live dictionary; the reference stays valid, and changes, as long as the record
  /// lives.
  [[nodiscard]] virtual const PropertyDictionary& properties() const = 0;
  /// The record's own value for a key, else its parent's; none when neither has one.
  [[nodiscard]] virtual std::optional<PropertyValue> accountPropertyForKey(
      std::string_view key) const = 0;
  /// What the user has switched on, as far as it is provisioned, in canonical order; none when no
  /// list is stored. A child whose parent has enabled dataclasses has its parent's.
  [[nodiscard]] virtual std::optional<PropertyArray> enabledDataclasses() const = 0;
  /// The record that this one is a child of; null for a top-level account.
  [[nodiscard]] virtual std::shared_ptr<AccountRecord> parentRecord() const = 0;
};
using AccountRecordReference = std::shared_ptr<AccountRecord>;

/// The object that speaks to an account's server. The record owns it: one that keeps its record
/// keeps a weak reference, or neither is ever freed.
class FullAccount {
 public:
  virtual ~FullAccount() = default;

  /// Told once, after creation, which record the account's record is a child of; null for a
  /// top-level account.
  virtual void setParentAccount(AccountRecordReference parent) = 0;
};
using FullAccountReference = std::shared_ptr<FullAccount>;

/// The object that refreshes an account's containers (mailboxes, calendars, ...). What a refresh
/// gives back is passed on to the caller unchanged. The record owns it, as it owns the full
/// account.
class SyncAccount {
 public:
  virtual ~SyncAccount() = default;

  virtual std::optional<PropertyValue> refreshContainerWithIdentifier_forDataclass_isUserRequested(
      std::string_view identifier, std::string_view dataclass, bool isUserRequested) = 0;
  virtual std::optional<PropertyValue> refreshContainerListForDataclass_isUserRequested(
      std::string_view dataclass, bool isUserRequested) = 0;
  virtual std::optional<PropertyValue> refreshContainersForDataclass_isUserRequested(
      std::string_view dataclass, bool isUserRequested) = 0;
};
using SyncAccountReference = std::shared_ptr<SyncAccount>;

/// A caller's own way of loading the framework that defines a full-account class.
class FullAccountLoader {
 public:
  virtual ~FullAccountLoader() = default;

  /// Whether the loader has itself loaded the framework for an account with these properties.
  virtual bool loadBundleForAccountWithProperties(const PropertyDictionary& properties) = 0;
};

/// A class that is found by name: a set of class operations, each of which may be absent. The
/// members have the names of the operations; a class answers an operation when its member is set.
struct AccountClass {
  /// Full accounts, first choice: the class to instantiate for an account type, null for none. An
  /// instance of it is then made with its `initWithProperties`.
  std::function<const AccountClass*(std::string_view type)> classForAccountType;
  std::function<FullAccountReference(const PropertyDictionary& properties)> initWithProperties;
  /// Full accounts, second choice: a full account made from a record, null for none.
  std::function<FullAccountReference(const AccountRecordReference& record)> accountWithBasicAccount;

  /// Sync accounts: the one of a record, null for none.
  std::function<SyncAccountReference(const AccountRecordReference& record)>
      accountToRefreshForBasicAccount;

  /// Notifiers: takes the change records of one save (array of dictionaries).
  std::function<void(const PropertyArray& changes)> noteAccountChanges;
  /// Notifiers, optional: a dataclass of one account is about to change, or did.
  std::function<void(std::string_view accountIdentifier, std::string_view dataclass)>
      accountWillChange_forDataclass;
  std::function<void(std::string_view accountIdentifier, std::string_view dataclass)>
      accountDidChange_forDataclass;
};

/// The classes of the process, by name.
class ClassRegistry {
 public:
  virtual ~ClassRegistry() = default;

  /// Makes a class known. Of two frameworks that bring a class of one name the first has it.
  virtual void registerClass(std::string name, AccountClass accountClass) = 0;
  /// The class of a name, null for none; valid as long as the process lives.
  [[nodiscard]] virtual const AccountClass* classNamed(std::string_view name) const = 0;
};

}  // namespace accounts

extern "C" {
/// What every framework exports: called once, when the framework was loaded, to make its classes
/// known.
[[gnu::visibility("default")]] void RegisterClasses(accounts::ClassRegistry& registry);

/// In whatever is built with this header, for a program that loads it.
[[gnu::used, gnu::visibility("default")]] inline std::uint32_t AccountsInterfaceVersion() {
  return accounts::kInterfaceVersion;
}
}
