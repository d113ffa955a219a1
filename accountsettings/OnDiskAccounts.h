#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <unordered_set>
#include <vector>

#include "accountsettings/BasicAccount.h"
#include "accountsettings/IdentifierIndex.h"
#include "accountsettings/OrderedAccounts.h"
#include "accountsettings/RuntimeFixer.h"
#include "propertylist/value/PropertyValue.h"

namespace accounts {

class AccountsManager;

/// The accounts of the account settings file at the time of a save, beside those of the store that
/// is saved. It answers as another store made from the file would, but makes as little of that
/// store as the answers need: most of what a save finds on disk is what the save before wrote.
class OnDiskAccounts {
 public:
  /// What the runtime fixers just did with the accounts in memory.
  enum class InMemory : std::uint8_t { AllCanBeKept, Unknown };

  /// Takes the array of account dictionaries in the file. The accounts in memory must outlive this
  /// and stay as they are.
  OnDiskAccounts(PropertyArray onDisk, const OrderedAccounts& inMemory, InMemory state);
  OnDiskAccounts(const OnDiskAccounts&) = delete;
  OnDiskAccounts& operator=(const OnDiskAccounts&) = delete;
  ~OnDiskAccounts();

  /// Whether the properties on disk of the account in memory at an index share the memory of those
  /// that it has or had when it was saved last, so that the merge gives what it has. Never true
  /// while the log channel is enabled: merging writes lines. O(1).
  [[nodiscard]] bool isAsMemoryKnowsIt(std::size_t index) const;

  /// The properties on disk of the account with the identifier of the account in memory at an
  /// index, or of the parent of the child with it; none when the disk has no such account.
  [[nodiscard]] std::optional<PropertyDictionary> propertiesForAccountAt(std::size_t index);

 private:
  /// An index in the array.
  using Position = std::optional<std::size_t>;

  [[nodiscard]] bool hasIdentifiersOfMemory() const;
  void indexIdentifiers();
  [[nodiscard]] std::optional<PropertyDictionary> propertiesAt(std::size_t position) const;
  [[nodiscard]] std::optional<PropertyDictionary> propertiesInStore(const Text& identifier);
  [[nodiscard]] bool isIdentifierOfChild(const Text& identifier);

  PropertyArray onDisk_;
  const OrderedAccounts& inMemory_;
  InMemory state_;
  std::vector<std::unique_ptr<RuntimeFixer>> fixers_;
  /// The dictionaries have the identifiers of the accounts in memory at the same positions, all
  /// different; there is no index then.
  bool isAligned_ = false;
  /// The last position with each identifier that may make an account.
  IdentifierIndex<Position> lastPositions_;
  /// By position: the position before with the same identifier.
  std::vector<Position> previousPositions_;
  /// Those of all children's dictionaries; made when one is looked for.
  std::optional<std::unordered_set<Text, TextHash, std::equal_to<>>> childIdentifiers_;
  /// Everything; made when nothing less will do.
  std::unique_ptr<AccountsManager> store_;
};

}  // namespace accounts
