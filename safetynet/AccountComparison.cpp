#include "safetynet/AccountComparison.h"

#include <array>

#include "vocabulary/AccountClasses.h"
#include "vocabulary/AccountVocabulary.h"

namespace accounts {
namespace {

using Kind = AccountOrigin::Kind;

/// What a hosted mail account gives to the parent that is made from it.
const std::array kMovedToParent = {kAccountEnabledDataclasses, kAccountChildAccounts,
                                   kCalendarsAccountSubscribedCalendars,
                                   std::string_view(kExoSubscribedCalendarsKey)};

std::string quotedKey(std::string_view key) {
  return "\"" + std::string(key) + "\"";
}

/// How two dictionaries differ, keys that may differ left out.
struct Difference {
  /// A clause; empty when nothing was lost.
  std::string loss;
  bool isChanged = false;
};

/// Walks through both at once, since they are in the order of their keys.
template <class MayDiffer>
Difference differenceBetween(const PropertyDictionary& before, const PropertyDictionary& after,
                             MayDiffer&& mayDiffer) {
  Difference difference;
  const auto note = [&](std::string_view key, auto&& clause) {
    difference.isChanged = true;
    if (difference.loss.empty() && !mayDiffer(key)) {
      difference.loss = clause(quotedKey(key));
    }
  };
  auto old = before.begin();
  auto now = after.begin();
  while (old != before.end() || now != after.end()) {
    const int order = old == before.end()  ? 1
                      : now == after.end() ? -1
                                           : old->key.view().compare(now->key.view());
    if (order < 0) {
      note(old->key.view(), [](const std::string& key) { return "its " + key + " is gone"; });
    } else if (order > 0) {
      note(now->key.view(),
           [](const std::string& key) { return "it has a " + key + " that it did not have"; });
    } else if (!(old->value == now->value)) {
      note(old->key.view(),
           [](const std::string& key) { return "its " + key + " gave way to another value"; });
    }
    if (order <= 0) {
      ++old;
    }
    if (order >= 0) {
      ++now;
    }
  }
  return difference;
}

PropertyArray childrenOf(const PropertyDictionary& account) {
  return account.arrayForKey(kAccountChildAccounts).value_or(PropertyArray());
}

}  // namespace

void AccountComparison::compare(LedgerEntry& entry, const PropertyDictionary& before,
                                const PropertyDictionary& after, bool isAfterConversion,
                                std::vector<LedgerEntry>& children) const {
  if (before.isSameAs(after)) {
    entry.fate = AccountFate::Kept;
    keepChildren(entry, childrenOf(before), children);
    return;
  }
  const Kind kind = entry.account.kind;
  const bool hasChildren = before.arrayForKey(kAccountChildAccounts).has_value() &&
                           after.arrayForKey(kAccountChildAccounts).has_value();
  const Difference difference = differenceBetween(before, after, [&](std::string_view key) {
    return (hasChildren && key == kAccountChildAccounts) ||
           keys_.mayDiffer(key, kind, before, after) ||
           // What a conversion sets afterwards holds in the account that it took the place of.
           (key == kAccountSyncIdentifier && isAfterConversion);
  });
  if (entry.reason.empty()) {
    entry.reason = difference.loss;
  }
  const auto identifier = before.textForKey(kAccountIdentifier);
  entry.fate = !difference.isChanged ? AccountFate::Kept
               : identifier && identifier != after.textForKey(kAccountIdentifier)
                   ? AccountFate::Renamed
                   : AccountFate::Changed;
  if (hasChildren) {
    compareChildren(entry, before, after, children);
  }
}

void AccountComparison::keepChildren(const LedgerEntry& parent, const PropertyArray& accounts,
                                     std::vector<LedgerEntry>& children) {
  for (std::uint32_t child = 0; child < accounts.size(); ++child) {
    children.push_back({.account = parent.account,
                        .child = child,
                        .fate = AccountFate::Kept,
                        .now = {{parent.now.front().index, child}}});
  }
}

void AccountComparison::compareChildren(LedgerEntry& parent, const PropertyDictionary& before,
                                        const PropertyDictionary& after,
                                        std::vector<LedgerEntry>& children) const {
  const PropertyArray old = childrenOf(before);
  const PropertyArray now = childrenOf(after);
  if (now.size() > old.size() && parent.reason.empty()) {
    parent.reason = "it has children that it did not have";
  }
  for (std::uint32_t index = 0; index < old.size(); ++index) {
    LedgerEntry entry = {.account = parent.account, .child = index};
    if (index >= now.size()) {
      entry.reason = "it is not among the children of its parent any more";
    } else {
      entry.now.push_back({parent.now.front().index, index});
      compareChild(entry, before, old.at(index), now.at(index));
    }
    children.push_back(std::move(entry));
  }
}

void AccountComparison::compareChild(LedgerEntry& entry, const PropertyDictionary& parent,
                                     const PropertyValue& old, const PropertyValue& now) const {
  const PropertyDictionary* const before = old.asDictionary();
  const PropertyDictionary* const after = now.asDictionary();
  if (before == nullptr || after == nullptr) {
    entry.fate = old == now ? AccountFate::Kept : AccountFate::NotCarriedOver;
    entry.reason = old == now ? "" : "something else stands in its place";
    return;
  }
  const Difference difference = differenceBetween(*before, *after, [&](std::string_view key) {
    return keys_.mayDifferInChild(key, parent, *before);
  });
  entry.reason = difference.loss;
  entry.fate = !entry.reason.empty()  ? AccountFate::NotCarriedOver
               : difference.isChanged ? AccountFate::Changed
                                      : AccountFate::Kept;
}

void AccountComparison::compareMoved(LedgerEntry& entry, const PropertyDictionary& before,
                                     const PropertyDictionary& parent,
                                     const PropertyDictionary& now,
                                     std::vector<LedgerEntry>& children) const {
  const Kind kind = entry.account.kind;
  PropertyDictionary staying = before;
  for (const std::string_view key : kMovedToParent) {
    const std::optional<PropertyValue> value = staying.take(key);
    const PropertyValue* const moved = parent.find(key);
    const bool isArrayOfChildren = key == kAccountChildAccounts && value && value->asArray();
    if (value && !isArrayOfChildren && entry.reason.empty() &&
        (moved == nullptr || !(*moved == *value)) && !keys_.mayDiffer(key, kind, before, now) &&
        !(key == kAccountEnabledDataclasses && mayEnableOnParent(parent))) {
      entry.reason = "its " + quotedKey(key) + " did not go to the parent account made from it";
    }
  }
  const Difference difference = differenceBetween(
      staying, now, [&](std::string_view key) { return keys_.mayDiffer(key, kind, before, now); });
  if (entry.reason.empty()) {
    entry.reason = difference.loss;
  }
  const PropertyArray old = childrenOf(before);
  const PropertyArray siblings = childrenOf(parent);
  children.clear();
  for (std::uint32_t index = 0; index < old.size(); ++index) {
    LedgerEntry child = {.account = entry.account, .child = index};
    if (index + 1 < siblings.size() && old.at(index) == siblings.at(index)) {
      child.fate = AccountFate::MovedToOtherParent;
      child.now.push_back({entry.now.front().index, index});
    } else {
      child.reason = "it did not go to the parent account that was made from its own";
    }
    children.push_back(std::move(child));
  }
}

/// The new parent is active, so mail is switched on in it.
bool AccountComparison::mayEnableOnParent(const PropertyDictionary& parent) {
  return parent.textForKey(kAccountType) == std::optional<Text>(kQuarxAccountType);
}

}  // namespace accounts
