#include "inspection/StoreDifference.h"

#include <algorithm>
#include <deque>
#include <unordered_map>
#include <utility>

namespace accounts {
namespace {

/// What accounts that are the same have in common.
std::string matchingKey(const ListedAccount& account, const StoreLayout& layout) {
  // No two of them begin alike.
  return account.identifier ? "identifier " + account.identifier->string()
                            : "title " + titleOf(account, layout);
}

PropertyDictionary ownProperties(const ListedAccount& account, const StoreLayout& layout) {
  PropertyDictionary own = account.properties.value_or(PropertyDictionary());
  if (!account.isChild && own.arrayForKey(layout.childrenKey)) {
    own.remove(layout.childrenKey);
  }
  return own;
}

bool hasOtherParent(const ListedAccount& before, const ListedAccount& after) {
  return before.isChild != after.isChild || before.parentIdentifier != after.parentIdentifier;
}

/// Compares the accounts of one array and adds what differs.
class ArrayComparison {
 public:
  ArrayComparison(const PropertyArray& before, const PropertyArray& after,
                  const StoreLayout& layout, Secrets secrets)
      : before_(listedAccounts(before, layout)),
        after_(listedAccounts(after, layout)),
        layout_(layout),
        secrets_(secrets) {}

  void addTo(StoreDifference& difference, const std::optional<Partners>& partners) {
    if (partners) {
      matchTold(*partners);
    }
    matchInOrder();
    if (!partners) {
      matchRenamed();
    }
    for (std::size_t index = 0; index < after_.size(); ++index) {
      if (partners_[index]) {
        addChange(*partners_[index], std::move(after_[index]), difference);
      } else {
        difference.accounts.emplace_back().after = std::move(after_[index]);
      }
    }
    for (std::size_t index = 0; index < before_.size(); ++index) {
      if (!isMatched_[index]) {
        difference.accounts.emplace_back().before = before_[index];
      }
    }
  }

 private:
  void match(std::size_t before, std::size_t after) {
    partners_[after] = before;
    isMatched_[before] = true;
  }

  /// The places of the top-level accounts among all.
  static std::vector<std::size_t> topLevel(const std::vector<ListedAccount>& accounts) {
    std::vector<std::size_t> places;
    for (std::size_t index = 0; index < accounts.size(); ++index) {
      if (!accounts[index].isChild) {
        places.push_back(index);
      }
    }
    return places;
  }

  void matchTold(const Partners& partners) {
    const std::vector<std::size_t> before = topLevel(before_);
    const std::vector<std::size_t> after = topLevel(after_);
    for (std::size_t index = 0; index < std::min(after.size(), partners.size()); ++index) {
      const auto partner = partners[index];
      if (partner && *partner < before.size() && !isMatched_[before[*partner]]) {
        match(before[*partner], after[index]);
      }
    }
  }

  /// Accounts with one key are the same, in their order.
  void matchInOrder() {
    std::unordered_map<std::string, std::deque<std::size_t>> unmatched;
    for (std::size_t index = 0; index < before_.size(); ++index) {
      if (!isMatched_[index]) {
        unmatched[matchingKey(before_[index], layout_)].push_back(index);
      }
    }
    for (std::size_t index = 0; index < after_.size(); ++index) {
      if (partners_[index]) {
        continue;
      }
      std::deque<std::size_t>& candidates = unmatched[matchingKey(after_[index], layout_)];
      if (!candidates.empty()) {
        match(candidates.front(), index);
        candidates.pop_front();
      }
    }
  }

  /// The type and name of an account that has both; empty for another one.
  [[nodiscard]] std::string nameIn(const ListedAccount& account) const {
    const bool hasBoth = account.properties &&
                         !wordFor(*account.properties, layout_.nameKey).empty() &&
                         !wordFor(*account.properties, layout_.typeKey).empty();
    return hasBoth ? titleOf(account, layout_) : "";
  }

  /// An account that got another identifier: what is left on both sides is the same where it alone
  /// has its type and name.
  void matchRenamed() {
    struct Namesakes {
      std::vector<std::size_t> before;
      std::vector<std::size_t> after;
    };
    std::unordered_map<std::string, Namesakes> byName;
    for (std::size_t index = 0; index < before_.size(); ++index) {
      if (!isMatched_[index]) {
        byName[nameIn(before_[index])].before.push_back(index);
      }
    }
    for (std::size_t index = 0; index < after_.size(); ++index) {
      if (!partners_[index]) {
        byName[nameIn(after_[index])].after.push_back(index);
      }
    }
    for (const auto& [name, namesakes] : byName) {
      if (!name.empty() && namesakes.before.size() == 1 && namesakes.after.size() == 1) {
        match(namesakes.before.front(), namesakes.after.front());
      }
    }
  }

  void addChange(std::size_t index, ListedAccount after, StoreDifference& difference) {
    const ListedAccount& before = before_[index];
    AccountChange change;
    change.before = before;
    change.hasMoved = hasOtherParent(before, after);
    change.properties =
        propertyChanges(ownProperties(before, layout_), ownProperties(after, layout_), secrets_);
    const bool isOtherElement = !after.properties && before.element != after.element;
    if (!change.hasMoved) {
      difference.hasOtherOrder |= index < lastIndex_;
      lastIndex_ = index;
    }
    if (change.hasMoved || isOtherElement || !change.properties.empty()) {
      change.after = std::move(after);
      difference.accounts.push_back(std::move(change));
    }
  }

  std::vector<ListedAccount> before_;
  std::vector<ListedAccount> after_;
  /// Of each account in the newer file, the same one in the older file.
  Partners partners_ = Partners(after_.size());
  std::vector<bool> isMatched_ = std::vector<bool>(before_.size());
  const StoreLayout& layout_;
  Secrets secrets_;
  /// The place of the last account that stayed where it was, in the older file.
  std::size_t lastIndex_ = 0;
};

}  // namespace

StoreDifference differenceBetween(const PropertyDictionary& before, const PropertyDictionary& after,
                                  FileKind kind, Secrets secrets,
                                  const std::optional<Partners>& partners) {
  StoreDifference difference;
  PropertyDictionary restBefore = before;
  PropertyDictionary restAfter = after;
  if (const std::optional<StoreLayout> layout = layoutOf(kind)) {
    for (const AccountArray& array : layout->arrays) {
      const std::optional<PropertyArray> left = before.arrayForKey(array.key);
      const std::optional<PropertyArray> right = after.arrayForKey(array.key);
      ArrayComparison(left.value_or(PropertyArray()), right.value_or(PropertyArray()), *layout,
                      secrets)
          .addTo(difference, partners);
      // An empty array where the other file has none is a difference of its own.
      if (left && (right || !left->empty())) {
        restBefore.remove(array.key);
      }
      if (right && (left || !right->empty())) {
        restAfter.remove(array.key);
      }
    }
  }
  difference.properties = propertyChanges(restBefore, restAfter, secrets);
  return difference;
}

}  // namespace accounts
