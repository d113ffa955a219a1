#include "safetynet/EarlierRun.h"

#include <array>
#include <string_view>

#include "propertylist/value/Description.h"
#include "safetynet/ConvertedDescription.h"
#include "vocabulary/AccountVocabulary.h"

namespace accounts {
namespace {

/// What is left of an account without all keys that some rule may change.
std::string unchangedValuesOf(PropertyDictionary account) {
  static const std::array changing = {kAccountIdentifier,
                                      kAccountSyncIdentifier,
                                      kAccountType,
                                      kAccountClass,
                                      kAccountDisplayName,
                                      kAccountUsername,
                                      kAccountTypeString,
                                      kAccountShortTypeString,
                                      kAccountEnabledDataclasses,
                                      kAccountChildAccounts,
                                      kAccountProvisionedDataclasses,
                                      kCalendarsAccountSubscribedCalendars};
  for (const std::string_view key : changing) {
    account.remove(key);
  }
  return account.empty() ? std::string() : describe(PropertyValue(std::move(account)));
}

}  // namespace

AccountsOfEarlierRun::AccountsOfEarlierRun(const PropertyArray& accounts) {
  for (std::uint32_t index = 0; index < accounts.size(); ++index) {
    enter(accounts.at(index), {index});
    const PropertyDictionary* const account = accounts.at(index).asDictionary();
    const PropertyArray children =
        account != nullptr ? account->arrayForKey(kAccountChildAccounts).value_or(PropertyArray())
                           : PropertyArray();
    for (std::uint32_t child = 0; child < children.size(); ++child) {
      enter(children.at(child), {index, child});
    }
  }
}

void AccountsOfEarlierRun::enter(const PropertyValue& account, LedgerPlace place) {
  const PropertyDictionary* const properties = account.asDictionary();
  if (properties == nullptr) {
    return;
  }
  if (const auto identifier = properties->textForKey(kAccountIdentifier)) {
    byIdentifier_.emplace(identifier->string(), place);
  }
  if (std::string values = unchangedValuesOf(*properties); !values.empty()) {
    byUnchangedValues_.emplace(std::move(values), place);
  }
}

std::optional<LedgerPlace> AccountsOfEarlierRun::find(const PropertyValue& description,
                                                      AccountOrigin::Kind kind) const {
  const PropertyDictionary* const properties = description.asDictionary();
  if (properties == nullptr) {
    return std::nullopt;
  }
  const PropertyDictionary account = convertedDescription(*properties, kind).account;
  const auto identifier = account.textForKey(kAccountIdentifier);
  const auto& index = identifier ? byIdentifier_ : byUnchangedValues_;
  const auto found = index.find(identifier ? identifier->string() : unchangedValuesOf(account));
  return found != index.end() ? std::optional(found->second) : std::nullopt;
}

}  // namespace accounts
