#include "inspection/StoreDifference.h"

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

  void addTo(StoreDifference& difference) {
    std::unordered_map<std::string, std::deque<std::size_t>> unmatched;
    for (std::size_t index = 0; index < before_.size(); ++index) {
      unmatched[matchingKey(before_[index], layout_)].push_back(index);
    }
    std::vector<bool> isMatched(before_.size());
    for (ListedAccount& account : after_) {
      std::deque<std::size_t>& candidates = unmatched[matchingKey(account, layout_)];
      if (candidates.empty()) {
        difference.accounts.emplace_back().after = std::move(account);
        continue;
      }
      const std::size_t index = candidates.front();
      candidates.pop_front();
      isMatched[index] = true;
      addChange(index, std::move(account), difference);
    }
    for (std::size_t index = 0; index < before_.size(); ++index) {
      if (!isMatched[index]) {
        difference.accounts.emplace_back().before = before_[index];
      }
    }
  }

 private:
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
  const StoreLayout& layout_;
  Secrets secrets_;
  /// The place of the last account that stayed where it was, in the older file.
  std::size_t lastIndex_ = 0;
};

}  // namespace

StoreDifference differenceBetween(const PropertyDictionary& before, const PropertyDictionary& after,
                                  FileKind kind, Secrets secrets) {
  StoreDifference difference;
  PropertyDictionary restBefore = before;
  PropertyDictionary restAfter = after;
  if (const std::optional<StoreLayout> layout = layoutOf(kind)) {
    for (const AccountArray& array : layout->arrays) {
      const std::optional<PropertyArray> left = before.arrayForKey(array.key);
      const std::optional<PropertyArray> right = after.arrayForKey(array.key);
      ArrayComparison(left.value_or(PropertyArray()), right.value_or(PropertyArray()), *layout,
                      secrets)
          .addTo(difference);
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
