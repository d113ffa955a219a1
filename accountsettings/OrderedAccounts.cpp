#include "accountsettings/OrderedAccounts.h"

#include <algorithm>
#include <utility>

#include "accountsettings/Process.h"

namespace accounts {

void OrderedAccounts::PlaceNumbers::insert(PlaceNumber number) {
  if (empty()) {
    first_ = number;
    return;
  }
  if (number == first_) {
    return;
  }
  if (others_ == nullptr) {
    others_ = std::make_unique<std::set<PlaceNumber>>();
  }
  others_->insert(std::max(first_, number));
  first_ = std::min(first_, number);
}

void OrderedAccounts::PlaceNumbers::erase(PlaceNumber number) {
  if (others_ != nullptr) {
    if (number == first_) {
      first_ = *others_->begin();
    }
    others_->erase(std::max(first_, number));
    if (others_->empty()) {
      others_.reset();
    }
  } else if (number == first_) {
    first_ = kNone;
  }
}

OrderedAccounts::PlaceNumber OrderedAccounts::PlaceNumbers::last() const {
  return others_ != nullptr ? *others_->rbegin() : first_;
}

std::vector<OrderedAccounts::PlaceNumber> OrderedAccounts::PlaceNumbers::all() const {
  std::vector<PlaceNumber> numbers;
  if (!empty()) {
    numbers.push_back(first_);
  }
  if (others_ != nullptr) {
    numbers.insert(numbers.end(), others_->begin(), others_->end());
  }
  return numbers;
}

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

std::size_t OrderedAccounts::replaceAll(std::string_view identifier,
                                        const BasicAccountReference& account) {
  bringIndexesUpToDate();
  const PlaceNumbers* places = placesByIdentifier_.find(identifier);
  if (places == nullptr) {
    return 0;
  }
  const std::vector<PlaceNumber> numbers = places->all();
  for (const PlaceNumber number : numbers) {
    replaceAt(number, account);
  }
  return numbers.size();
}

bool OrderedAccounts::replaceFirst(const BasicAccountReference& oldAccount,
                                   const BasicAccountReference& newAccount) {
  bringIndexesUpToDate();
  const auto entry = placesByRecord_.find(oldAccount.get());
  if (entry == placesByRecord_.end()) {
    return false;
  }
  replaceAt(entry->second.first(), newAccount);
  return true;
}

BasicAccountReference OrderedAccounts::removeLast(std::string_view identifier) {
  bringIndexesUpToDate();
  const PlaceNumbers* places = placesByIdentifier_.find(identifier);
  if (places == nullptr) {
    return nullptr;
  }
  BasicAccountReference account = accounts_[positionOf(places->last())];
  for (const PlaceNumber number : placesByRecord_.at(account.get()).all()) {
    remove(number);
  }
  if (removedCount_ * 2 > accounts_.size()) {
    dropRemovedPlaces();
  }
  return account;
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
  if (const auto entry = placesByRecord_.find(&account); entry != placesByRecord_.end()) {
    entry->second.erase(number);
    if (entry->second.empty()) {
      placesByRecord_.erase(entry);
    }
  }
  if (const std::optional<Text> identifier = account.identifier()) {
    PlaceNumbers& numbers = placesByIdentifier_[*identifier];
    numbers.erase(number);
    if (numbers.empty()) {
      placesByIdentifier_.remove(*identifier);
    }
  }
}

}  // namespace accounts
