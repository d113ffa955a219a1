#include "safetynet/AccountLedger.h"

#include <algorithm>

#include "propertylist/value/Description.h"
#include "propertylist/value/HiddenSecrets.h"
#include "vocabulary/AccountVocabulary.h"
#include "vocabulary/ElementName.h"
#include "vocabulary/LegacyStoreKeys.h"

namespace accounts {
namespace {

struct FateWords {
  std::string_view identifier;
  std::string_view words;
};
constexpr std::array<FateWords, kAccountFates.size()> kFateWords = {{
    {"kept", "kept as it was"},
    {"changed", "changed"},
    {"renamed", "renamed"},
    {"converted", "converted"},
    {"movedBelow", "moved below a new parent account"},
    {"movedToOtherParent", "moved to another parent account"},
    {"joined", "joined into another account"},
    {"rebuilt", "made anew"},
    {"carriedOverEarlier", "carried over by an earlier run"},
    {"notCarriedOver", "not carried over"},
}};

std::optional<PropertyDictionary> dictionaryAt(const PropertyArray& accounts, std::size_t index) {
  const PropertyDictionary* const found =
      index < accounts.size() ? accounts.at(index).asDictionary() : nullptr;
  return found != nullptr ? std::optional(*found) : std::nullopt;
}

std::optional<PropertyDictionary> childOf(const std::optional<PropertyDictionary>& parent,
                                          const std::optional<std::uint32_t>& child) {
  if (!parent || !child) {
    return parent;
  }
  return dictionaryAt(parent->arrayForKey(kAccountChildAccounts).value_or(PropertyArray()), *child);
}

}  // namespace

std::string_view identifierOf(AccountFate fate) {
  return kFateWords[static_cast<std::size_t>(fate)].identifier;
}

std::string_view wordsOf(AccountFate fate) {
  return kFateWords[static_cast<std::size_t>(fate)].words;
}

OriginKeys keysOf(AccountOrigin::Kind kind) {
  switch (kind) {
    case AccountOrigin::Kind::OutgoingMail:
    case AccountOrigin::Kind::IncomingMail:
      return {kLegacyMailClass, kLegacyMailDisplayName, kLegacyMailIdentifier};
    case AccountOrigin::Kind::Exchange:
      return {kLegacyExchangeClass, kLegacyExchangeDisplayName, kLegacyExchangeIdentifier};
    default:
      return {kAccountClass, kAccountDisplayName, kAccountIdentifier};
  }
}

std::string_view arrayKeyOf(AccountOrigin::Kind kind) {
  switch (kind) {
    case AccountOrigin::Kind::OutgoingMail:
      return kLegacyOutgoingAccounts;
    case AccountOrigin::Kind::IncomingMail:
      return kLegacyIncomingAccounts;
    case AccountOrigin::Kind::Exchange:
      return kLegacyExchangeAccounts;
    default:
      return kPlistAccountsKey;
  }
}

DevicePlace fileOf(AccountOrigin::Kind kind) {
  switch (kind) {
    case AccountOrigin::Kind::OutgoingMail:
    case AccountOrigin::Kind::IncomingMail:
      return DevicePlace::LegacyMail;
    case AccountOrigin::Kind::Exchange:
      return DevicePlace::LegacyExchange;
    default:
      return DevicePlace::Settings;
  }
}

bool AccountLedger::isClean() const {
  return lostFiles.empty() && unexplained.empty() && countOf(AccountFate::NotCarriedOver) == 0;
}

std::size_t AccountLedger::countOf(AccountFate fate) const {
  return static_cast<std::size_t>(std::ranges::count(entries, fate, &LedgerEntry::fate));
}

std::string AccountLedger::placeOf(const LedgerEntry& entry) {
  return elementName(arrayKeyOf(entry.account.kind), entry.account.number, entry.child);
}

std::string AccountLedger::placeOf(const LedgerPlace& place) {
  return elementName(kPlistAccountsKey, place.index, place.child);
}

DevicePlace AccountLedger::fileOf(const LedgerEntry& entry) {
  return accounts::fileOf(entry.account.kind);
}

std::optional<PropertyDictionary> AccountLedger::before(const LedgerEntry& entry) const {
  return childOf(
      dictionaryAt(inputs[static_cast<std::size_t>(entry.account.kind)], entry.account.number),
      entry.child);
}

std::optional<PropertyDictionary> AccountLedger::after(const LedgerPlace& place) const {
  return childOf(dictionaryAt(result, place.index), place.child);
}

std::vector<std::string> AccountLedger::losses() const {
  std::vector<std::string> lines;
  for (const LostFile& each : lostFiles) {
    lines.push_back(paths[indexOf(each.place)] + " " + each.reason);
  }
  for (const LedgerEntry& entry : entries) {
    if (entry.fate != AccountFate::NotCarriedOver) {
      continue;
    }
    const PropertyDictionary account = before(entry).value_or(PropertyDictionary());
    const OriginKeys keys =
        entry.child ? keysOf(AccountOrigin::Kind::Settings) : keysOf(entry.account.kind);
    std::string line = placeOf(entry);
    if (const auto name = account.textForKey(keys.displayName)) {
      line += " \"" + escapedText(textWithSecretsHidden(name->view())) + "\"";
    }
    if (const auto identifier = account.textForKey(keys.identifier)) {
      line += " (identifier " + escapedText(textWithSecretsHidden(identifier->view())) + ")";
    }
    lines.push_back(line + " of " + paths[indexOf(fileOf(entry))] + ": " + entry.reason);
  }
  for (const LedgerPlace& each : unexplained) {
    lines.push_back(placeOf(each) + " of " + paths[indexOf(DevicePlace::Settings)] +
                    ": nothing says where it comes from");
  }
  return lines;
}

}  // namespace accounts
