#include <algorithm>
#include <map>
#include <random>
#include <set>

#include "tests/accountsettings/StoreFixture.h"

// The rule of replacement written down once more, on plain maps and lists without any index, and
// random stores that must come out the same.

namespace accounts {
namespace {

using Record = BasicAccountReference;

std::string identifierOf(const Record& account) {
  return account->identifier()->string();
}

PropertyArray childElements(const Record& account) {
  return account->arrayPropertyForKey(kAccountChildAccounts).value_or(PropertyArray());
}

class PlainStore {
 public:
  explicit PlainStore(const std::vector<PropertyValue>& accounts) {
    for (const PropertyValue& properties : accounts) {
      const Record account = BasicAccount::initWithProperties(*properties.asDictionary());
      ordered.push_back(account);
      topLevel[identifierOf(account)] = account;
      loadChildren(account);
    }
  }

  void replace(const std::set<std::string>& types, const std::vector<Record>& accounts) {
    std::map<std::string, Record> byIdentifier;
    std::map<std::string, Record> newTopLevel;
    std::vector<Record> remaining = accounts;
    for (const Record& account : accounts) {
      byIdentifier[identifierOf(account)] = account;
    }
    for (std::size_t index = ordered.size(); index-- > 0;) {
      const std::string identifier = identifierOf(ordered[index]);
      if (byIdentifier.contains(identifier)) {
        const Record account = byIdentifier[identifier];
        ordered[index] = account;
        newTopLevel[identifier] = account;
        std::erase(remaining, account);
        loadChildren(account);
      } else if (!types.contains(ordered[index]->type()->string())) {
        newTopLevel[identifier] = ordered[index];
      } else {
        removeChildren(identifier);
        ordered.erase(ordered.begin() + static_cast<std::ptrdiff_t>(index));
      }
    }
    for (const Record& account : remaining) {
      if (!account->parentAccountIdentifier()) {
        ordered.push_back(account);
        newTopLevel[identifierOf(account)] = account;
        loadChildren(account);
      } else {
        placeChild(account, newTopLevel);
      }
    }
    topLevel = newTopLevel;
  }

  std::vector<Record> ordered;
  std::map<std::string, Record> topLevel;
  std::map<std::string, std::string> parents;

 private:
  void placeChild(const Record& child, std::map<std::string, Record>& newTopLevel) {
    const std::string identifier = identifierOf(child);
    const std::string newParent = child->parentAccountIdentifier()->string();
    const Record parent = newTopLevel.contains(newParent) ? newTopLevel[newParent] : nullptr;
    if (parents.contains(identifier) && newTopLevel.contains(parents[identifier])) {
      removeChild(identifier, newTopLevel[parents[identifier]]);
    }
    if (parent) {
      PropertyArray children = childElements(parent);
      children.append(child->properties());
      parent->setAccountProperty_forKey(children, kAccountChildAccounts);
      loadChildren(parent);
    }
  }
  void removeChild(const std::string& identifier, const Record& parent) {
    std::vector<PropertyValue> kept;
    for (const PropertyValue& element : childElements(parent)) {
      if (element.asDictionary()->textForKey(kAccountIdentifier) != Text(identifier)) {
        kept.push_back(element);
      }
    }
    if (parent->arrayPropertyForKey(kAccountChildAccounts)) {
      parent->setAccountProperty_forKey(PropertyArray(kept), kAccountChildAccounts);
    }
    loadChildren(parent);
  }
  void removeChildren(const std::string& parent) {
    std::erase_if(parents, [&](const auto& entry) { return entry.second == parent; });
  }
  void loadChildren(const Record& account) {
    removeChildren(identifierOf(account));
    for (const PropertyValue& element : childElements(account)) {
      parents[element.asDictionary()->textForKey(kAccountIdentifier)->string()] =
          identifierOf(account);
    }
  }
};

/// Draws stores and replacements from few identifiers, so that everything collides with everything.
class World {
 public:
  explicit World(unsigned seed) : random_(seed) {}

  std::vector<PropertyValue> accounts() {
    std::vector<PropertyValue> result;
    for (std::size_t count = 1 + below(5); count > 0; --count) {
      result.push_back(account());
    }
    return result;
  }
  /// New accounts: some again and again, some of them children.
  std::vector<Record> newAccounts() {
    std::vector<Record> result;
    for (std::size_t count = below(9); count > 0; --count) {
      if (!result.empty() && below(8) == 0) {
        result.push_back(result[below(result.size())]);
        continue;
      }
      const bool isChild = below(3) != 0;
      result.push_back(recordOf((isChild ? calDAV(childIdentifier()) : account())));
      if (isChild) {
        result.back()->setParentAccount(recordOf(mail(topLevelIdentifier())));
      }
    }
    return result;
  }
  std::set<std::string> types() {
    std::set<std::string> result;
    for (const std::string_view type : {kMailAccountType, kExchangeAccountType}) {
      if (below(3) == 0) {
        result.emplace(type);
      }
    }
    return result;
  }

 private:
  std::size_t below(std::size_t limit) { return random_() % limit; }
  std::string topLevelIdentifier() { return std::string(1, "ABCDx"[below(5)]); }
  std::string childIdentifier() { return std::string(1, "xyzA"[below(4)]); }
  AccountDictionary account() {
    const std::string identifier = topLevelIdentifier();
    PropertyArray children;
    for (std::size_t count = below(4); count > 0; --count) {
      children.append(calDAV(childIdentifier()));
    }
    const AccountDictionary result = below(2) == 0 ? mail(identifier) : exchange(identifier);
    return children.empty() ? result : result.withChildren(children);
  }
  std::mt19937 random_;
};

using AccountsManagerReplacementComparison = StoreFixture;

TEST_F(AccountsManagerReplacementComparison, RandomReplacementsComeOutAsStepByStep) {
  for (unsigned seed = 0; seed < 200; ++seed) {
    World world(seed);
    World sameWorld(seed);
    const Store store = storeOf(world.accounts());
    PlainStore plain(sameWorld.accounts());
    for (int round = 0; round < 3; ++round) {
      const std::set<std::string> types = world.types();
      store->replaceAccountsWithTypes_withAccounts({types.begin(), types.end()},
                                                   world.newAccounts());
      const std::set<std::string> sameTypes = sameWorld.types();
      plain.replace(sameTypes, sameWorld.newAccounts());

      ASSERT_EQ(identifiersOf(store->allBasicAccounts()), identifiersOf(plain.ordered)) << seed;
      for (std::size_t index = 0; index < plain.ordered.size(); ++index) {
        ASSERT_EQ(store->allBasicAccounts()[index]->properties(),
                  plain.ordered[index]->properties())
            << seed;
      }
      for (const std::string identifier : {"A", "B", "C", "D", "x", "y", "z"}) {
        const bool isTopLevel = plain.topLevel.contains(identifier);
        const bool isChild = !isTopLevel && plain.parents.contains(identifier);
        const std::string holder = isChild ? plain.parents[identifier] : identifier;
        const Record found = store->accountWithIdentifier(identifier);
        ASSERT_EQ(found != nullptr, plain.topLevel.contains(holder)) << seed << identifier;
        if (found) {
          ASSERT_EQ(found->properties(), plain.topLevel[holder]->properties()) << seed;
        }
      }
      const AccountsManager::Accounts all = store->allBasicSyncableAccounts();
      ASSERT_EQ(all.size() - store->count(), plain.parents.size()) << seed;
      for (std::size_t index = store->count(); index < all.size(); ++index) {
        ASSERT_EQ(all[index]->parentAccountIdentifier(),
                  Text(plain.parents.at(identifierOf(all[index]))))
            << seed;
      }
    }
  }
}

}  // namespace
}  // namespace accounts
