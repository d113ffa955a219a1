#include "accountsettings/OrderedAccounts.h"

#include <algorithm>
#include <utility>

#include "accountsettings/Process.h"

namespace accounts {

namespace {

/// Takes a number out of the set under a key; a set that becomes empty goes with its key.
template <class Index, class Key, class Number>
void takeFromIndex(Index& index, const Key& key, Number number) {
  const auto entry = index.find(key);
  if (entry == index.end()) {
    return;
  }
  entry->second.erase(number);
  if (entry->second.empty()) {
    index.erase(entry);
  }
}

}  // namespace

const std::vector<BasicAccountReference>& OrderedAccounts::accounts() const {
  dropRemovedPlaces();
  return accounts_;
}

void OrderedAccounts::append(BasicAccountReference account) {
  accounts_.push_back(std::move(account));
  addPlace();
  if (hasIndexes_) {
    enterInIndexes(places_.back().number, *accounts_.back());
  }
}

void OrderedAccounts::assign(std::vector<BasicAccountReference> accounts) {
  hasIndexes_ = false;
  accounts_ = std::move(accounts);
  places_.clear();
  removedCount_ = 0;
  for (std::size_t count = accounts_.size(); count > 0; --count) {
    addPlace();
  }
}

bool OrderedAccounts::replaceAll(std::string_view identifier,
                                 const BasicAccountReference& account) {
  bringIndexesUpToDate();
  const auto entry = placesByIdentifier_.find(identifier);
  if (entry == placesByIdentifier_.end()) {
    return false;
  }
  const PlaceNumbers numbers = entry->second;
  for (const PlaceNumber number : numbers) {
    replaceAt(number, account);
  }
  return true;
}

bool OrderedAccounts::replaceFirst(const BasicAccountReference& oldAccount,
                                   const BasicAccountReference& newAccount) {
  bringIndexesUpToDate();
  const auto entry = placesByRecord_.find(oldAccount.get());
  if (entry == placesByRecord_.end()) {
    return false;
  }
  replaceAt(*entry->second.begin(), newAccount);
  return true;
}

bool OrderedAccounts::removeLast(std::string_view identifier) {
  bringIndexesUpToDate();
  const auto entry = placesByIdentifier_.find(identifier);
  if (entry == placesByIdentifier_.end()) {
    return false;
  }
  const BasicAccountReference account = accounts_[positionOf(*entry->second.rbegin())];
  const PlaceNumbers numbers = placesByRecord_.at(account.get());
  for (const PlaceNumber number : numbers) {
    remove(number);
  }
  if (removedCount_ * 2 > accounts_.size()) {
    dropRemovedPlaces();
  }
  return true;
}

std::size_t OrderedAccounts::positionOf(PlaceNumber number) const {
  const auto place = std::lower_bound(
      places_.begin(), places_.end(), number,
      [](const Place& candidate, PlaceNumber sought) { return candidate.number < sought; });
  return static_cast<std::size_t>(place - places_.begin());
}

void OrderedAccounts::addPlace() {
  places_.push_back({.number = nextNumber_++, .isRemoved = false});
}

void OrderedAccounts::replaceAt(PlaceNumber number, const BasicAccountReference& account) {
  BasicAccountReference& occupant = accounts_[positionOf(number)];
  if (occupant != account) {
    takeFromIndexes(number, *occupant);
    occupant = account;
    enterInIndexes(number, *occupant);
  }
}

void OrderedAccounts::remove(PlaceNumber number) {
  const std::size_t position = positionOf(number);
  takeFromIndexes(number, *accounts_[position]);
  places_[position].isRemoved = true;
  ++removedCount_;
}

void OrderedAccounts::dropRemovedPlaces() const {
  if (removedCount_ == 0) {
    return;
  }
  std::size_t kept = 0;
  for (std::size_t position = 0; position < accounts_.size(); ++position) {
    if (!places_[position].isRemoved) {
      std::swap(accounts_[kept], accounts_[position]);
      places_[kept] = places_[position];
      ++kept;
    }
  }
  accounts_.resize(kept);
  places_.resize(kept);
  removedCount_ = 0;
}

void OrderedAccounts::bringIndexesUpToDate() {
  const std::uint64_t identifierChanges = Process::current().identifierChanges;
  if (hasIndexes_ && identifierChangesAtIndexing_ == identifierChanges) {
    return;
  }
  dropRemovedPlaces();
  placesByRecord_.clear();
  placesByIdentifier_.clear();
  for (std::size_t position = 0; position < accounts_.size(); ++position) {
    enterInIndexes(places_[position].number, *accounts_[position]);
  }
  hasIndexes_ = true;
  identifierChangesAtIndexing_ = identifierChanges;
}

void OrderedAccounts::enterInIndexes(PlaceNumber number, const BasicAccount& account) {
  placesByRecord_[&account].insert(number);
  if (const std::optional<Text> identifier = account.identifier()) {
    placesByIdentifier_[*identifier].insert(number);
  }
}

void OrderedAccounts::takeFromIndexes(PlaceNumber number, const BasicAccount& account) {
  takeFromIndex(placesByRecord_, &account, number);
  if (const std::optional<Text> identifier = account.identifier()) {
    takeFromIndex(placesByIdentifier_, *identifier, number);
  }
}

}  // namespace accounts
