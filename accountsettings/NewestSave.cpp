#include "accountsettings/NewestSave.h"

#include <algorithm>
#include <utility>

#include "accountsettings/AccountsManager.h"
#include "accountsettings/IdentifierIndex.h"

namespace accounts {

namespace {

/// Whether loading makes a record of an account dictionary, or of a child's, without adding an
/// identifier to it.
bool makesRecordAsItIs(const PropertyValue& element) {
  const PropertyDictionary* const properties = element.asDictionary();
  return properties != nullptr && BasicAccount::accepts(*properties) &&
         properties->textForKey(kAccountIdentifier);
}

bool isLoadedAsItIs(const PropertyValue& element) {
  return makesRecordAsItIs(element) &&
         std::ranges::all_of(
             element.asDictionary()->arrayForKey(kAccountChildAccounts).value_or(PropertyArray()),
             makesRecordAsItIs);
}

/// Whether the runtime fixers of a store would do something with the record of an account
/// dictionary that is accepted.
bool needsFixing(const PropertyDictionary& properties) {
  const BasicAccountReference account = BasicAccount::initWithProperties(properties);
  return std::ranges::any_of(AccountsManager::_createRuntimeFixers(), [&](const auto& fixer) {
    return fixer->fixBasicAccountIfNeeded_loggingMessage(*account, "loading accounts") !=
           FixResult::Unchanged;
  });
}

}  // namespace

void NewestSave::note(const PropertyArray& written, const OrderedAccounts& inMemory,
                      FixResult fixing) {
  const PropertyArray before = std::exchange(written_, PropertyArray());
  std::vector<Text> identifiers;
  // Empty beside an empty array, which others may write, too.
  identifiers_.clear();
  if (fixing == FixResult::CannotBeKept) {
    return;
  }
  IdentifierIndex<bool> known;
  for (std::size_t index = 0; index < written.size(); ++index) {
    const PropertyValue& element = written.at(index);
    const PropertyDictionary& properties = *element.asDictionary();
    const BasicAccount& account = *inMemory.accounts()[index];
    // The fixers have seen what is in memory, not what the disk contributed.
    const bool isMemory = properties.isSameAs(account.propertiesToSave());
    // Most dictionaries are those of the save before, and looking into each takes a sixth of a run.
    const bool wasThere =
        index < before.size() && properties.isSameAs(*before.at(index).asDictionary());
    if (!wasThere && (!isLoadedAsItIs(element) || (!isMemory && needsFixing(properties)))) {
      return;
    }
    const std::optional<Text> identifier =
        isMemory ? account.identifierProperty() : properties.textForKey(kAccountIdentifier);
    if (std::exchange(known[*identifier], true)) {
      return;
    }
    identifiers.push_back(*identifier);
  }
  written_ = written;
  identifiers_ = std::move(identifiers);
}

bool NewestSave::isThere(const PropertyArray& onDisk, const OrderedAccounts& inMemory) const {
  return onDisk.isSameAs(written_) &&
         std::ranges::equal(identifiers_, inMemory.accounts(),
                            [](const Text& identifier, const BasicAccountReference& account) {
                              return account->identifier() == identifier;
                            });
}

}  // namespace accounts
