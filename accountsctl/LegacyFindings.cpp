#include "accountsctl/LegacyFindings.h"

#include <fmt/format.h>

#include <functional>

#include "accountsctl/AccountFindings.h"
#include "migrator/LegacyDescriptions.h"
#include "vocabulary/AccountVocabulary.h"
#include "vocabulary/LegacyStoreKeys.h"

namespace accounts {
namespace {

/// An array of a legacy store, and how its descriptions become account dictionaries.
struct LegacyArray {
  std::string_view key;
  std::function<PropertyDictionary(const PropertyDictionary&)> converted;
};

void addFindings(const PropertyArray& descriptions, const LegacyArray& array,
                 std::vector<Finding>& findings) {
  // Converted accounts are laid out as those of a settings file.
  const StoreLayout layout = *layoutOf(FileKind::AccountSettings);
  std::size_t number = 0;
  for (const PropertyValue& description : descriptions) {
    const PropertyDictionary* properties = description.asDictionary();
    const PropertyValue element =
        properties != nullptr ? PropertyValue(array.converted(*properties)) : description;
    // Alone in its array, the account gets the first place there.
    ListedAccount account = listedAccounts(PropertyArray{element}, layout).front();
    account.place = fmt::format("{} {}", array.key, ++number);
    const ExaminedAccount examined = examineAccount(account, layout, Effect::Refused);
    findings.insert(findings.end(), examined.findings.begin(), examined.findings.end());
  }
}

std::vector<Finding> findingsIn(const PropertyDictionary& root,
                                const std::vector<LegacyArray>& arrays) {
  std::vector<Finding> findings;
  PropertyDictionary rest = root;
  for (const LegacyArray& array : arrays) {
    if (const std::optional<PropertyArray> descriptions = root.arrayForKey(array.key)) {
      addFindings(*descriptions, array, findings);
      rest.remove(array.key);
    }
  }
  for (const PropertyEntry& entry : rest) {
    addFinding(findings, {}, Effect::Dropped, "unknownKey",
               fmt::format("The key '{}' is not carried over", entry.key.view()));
  }
  return findings;
}

LegacyArray mailArray(std::string_view key, std::string_view type) {
  return {key, [type](const PropertyDictionary& description) {
            return accountPropertiesOfMailDescription(description, type);
          }};
}

}  // namespace

std::vector<Finding> findingsInMailStore(const PropertyDictionary& root) {
  return findingsIn(root, {mailArray(kLegacyOutgoingAccounts, kSMTPAccountType),
                           mailArray(kLegacyIncomingAccounts, kMailAccountType)});
}

std::vector<Finding> findingsInExchangeStore(const PropertyDictionary& root) {
  return findingsIn(root, {{kLegacyExchangeAccounts, accountPropertiesOfExchangeDescription}});
}

}  // namespace accounts
