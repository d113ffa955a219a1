#include "accountsctl/SettingsFindings.h"

#include <fmt/format.h>

#include <optional>
#include <string>
#include <unordered_map>

#include "accountsctl/AccountFindings.h"
#include "accountsettings/AccountsManager.h"

namespace accounts {
namespace {

void addVersionFinding(const PropertyDictionary& root, std::vector<Finding>& findings) {
  const std::uint64_t current = AccountsManager::currentVersion();
  const PropertyValue* stored = root.find(kPlistVersionKey);
  const std::optional<std::int64_t> version = stored ? stored->integerValue() : std::nullopt;
  if (!version) {
    addFinding(findings, {}, Effect::Noted, "missingVersion",
               "The file has no version: a migration does not upgrade it");
    return;
  }
  // A negative version counts as newer than every other, as it does for the migration.
  const auto unsignedVersion = static_cast<std::uint64_t>(*version);
  if (unsignedVersion < current) {
    addFinding(findings, {}, Effect::Noted, "oldVersion",
               fmt::format("The version is {}: a migration upgrades it to {}", *version, current));
  } else if (unsignedVersion > current) {
    addFinding(findings, {}, Effect::Noted, "newVersion",
               fmt::format("The version is {}, newer than {}, which the next save writes", *version,
                           current));
  }
}

void addRootFindings(const PropertyDictionary& root, std::vector<Finding>& findings) {
  addVersionFinding(root, findings);
  if (!root.arrayForKey(kPlistAccountsKey)) {
    addFinding(findings, {}, Effect::Noted, "noAccounts",
               fmt::format("'{}' is missing or no array: the store is empty", kPlistAccountsKey));
  }
  for (const PropertyEntry& entry : root) {
    if (entry.key != kPlistVersionKey && entry.key != kPlistAccountsKey) {
      addFinding(findings, {}, Effect::Dropped, "unknownKey",
                 fmt::format("The key '{}' is not written back", entry.key.view()));
    }
  }
}

/// Tells which accounts are not found by their identifiers, since others have the same ones. In the
/// file's order the later account is found, and a top-level one before a child.
class IdentifierOwners {
 public:
  void note(const ListedAccount& account) {
    if (account.identifier) {
      const auto [owner, isNew] =
          owners_.try_emplace(account.identifier->string(), Owner{account.place, account.isChild});
      if (!isNew && (!account.isChild || owner->second.isChild)) {
        owner->second = {account.place, account.isChild};
      }
    }
  }

  /// The place of the account that is found instead of one that was noted; none when it is found
  /// itself.
  [[nodiscard]] std::optional<std::string> foundInsteadOf(const ListedAccount& account) const {
    const auto owner =
        account.identifier ? owners_.find(account.identifier->string()) : owners_.end();
    return owner == owners_.end() || owner->second.place == account.place
               ? std::nullopt
               : std::optional(owner->second.place);
  }

 private:
  struct Owner {
    std::string place;
    bool isChild;
  };
  std::unordered_map<std::string, Owner> owners_;
};

}  // namespace

std::vector<Finding> findingsInSettings(const PropertyDictionary& root) {
  std::vector<Finding> findings;
  addRootFindings(root, findings);
  const StoreLayout layout = *layoutOf(FileKind::AccountSettings);
  const std::vector<ListedAccount> accounts =
      listedAccounts(root.arrayForKey(kPlistAccountsKey).value_or(PropertyArray()), layout);

  std::vector<ExaminedAccount> examined;
  IdentifierOwners owners;
  BasicAccountReference parent;
  for (const ListedAccount& account : accounts) {
    examined.push_back(account.isChild ? examineChild(account, parent, layout)
                                       : examineAccount(account, layout, Effect::Dropped));
    if (!account.isChild) {
      parent = examined.back().record;
    }
    if (examined.back().record) {
      owners.note(account);
    }
  }
  for (std::size_t index = 0; index < accounts.size(); ++index) {
    findings.insert(findings.end(), examined[index].findings.begin(),
                    examined[index].findings.end());
    const std::optional<std::string> found =
        examined[index].record ? owners.foundInsteadOf(accounts[index]) : std::nullopt;
    if (found) {
      addFinding(findings, findingAbout(accounts[index], layout), Effect::Ignored,
                 "duplicateIdentifier",
                 fmt::format("It is not found by its identifier: {} has the same", *found));
    }
  }
  return findings;
}

}  // namespace accounts
