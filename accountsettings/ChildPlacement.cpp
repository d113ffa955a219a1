#include "accountsettings/ChildPlacement.h"

#include <algorithm>
#include <utility>

namespace accounts {

std::optional<Text> identifierOfChildElement(const PropertyValue& element) {
  const PropertyDictionary* properties = element.asDictionary();
  const BasicAccountReference child =
      properties != nullptr ? BasicAccount::initWithProperties(*properties) : nullptr;
  return child ? child->identifier() : std::nullopt;
}

void ChildPlacement::indexChildrenOf(const BasicAccountReference& account) {
  noteIndexing(parentFor(account));
}

void ChildPlacement::place(const BasicAccount& child) {
  readListsOfParents();
  const std::optional<Text> newParentIdentifier = child.parentAccountIdentifier();
  const BasicAccountReference* newParent =
      newParentIdentifier ? topLevelAccounts_.find(*newParentIdentifier) : nullptr;
  const std::optional<Text> identifier = child.identifier();
  const std::optional<Text> presentIdentifier =
      identifier ? presentParentIdentifier(*identifier) : std::nullopt;
  if (presentIdentifier) {
    const bool stays = newParent != nullptr && (*newParent)->identifier() == presentIdentifier;
    const BasicAccountReference* presentParent =
        stays ? newParent : topLevelAccounts_.find(*presentIdentifier);
    if (presentParent != nullptr) {
      takeOut(parentFor(*presentParent), *identifier);
    }
  }
  if (newParent != nullptr) {
    add(parentFor(*newParent), child.properties());
  }
}

ChildPlacement::IndexingToDo ChildPlacement::finish() {
  if (!children_.empty()) {
    readListsOfParents();
  }
  // The parent indexed last is the one that a child of several parents belongs to.
  std::sort(parents_.begin(), parents_.end(), [](const auto& left, const auto& right) {
    return left->lastIndexing < right->lastIndexing;
  });
  IndexingToDo toDo;
  for (const std::unique_ptr<Parent>& parent : parents_) {
    if (parent->isListChanged) {
      std::vector<PropertyValue> list;
      for (std::optional<PropertyValue>& element : parent->elements) {
        if (element) {
          list.push_back(*std::move(element));
        }
      }
      parent->account->setAccountProperty_forKey(PropertyArray(std::move(list)),
                                                 kAccountChildAccounts);
    }
    toDo.parents.push_back(parent->account);
  }
  for (const auto& [identifier, child] : children_) {
    if (!presentParentIdentifier(identifier)) {
      toDo.lostChildren.push_back(identifier);
    }
  }
  return toDo;
}

ChildPlacement::Parent& ChildPlacement::parentFor(const BasicAccountReference& account) {
  Parent*& parent = parentsByRecord_[account.get()];
  if (parent == nullptr) {
    parents_.push_back(std::make_unique<Parent>());
    parent = parents_.back().get();
    parent->account = account;
  }
  return *parent;
}

void ChildPlacement::readListsOfParents() {
  // Not before a child is placed: making records of the elements writes lines about those that make
  // none, which has no place where no list is changed.
  for (; readCount_ < parents_.size(); ++readCount_) {
    readList(*parents_[readCount_]);
  }
}

void ChildPlacement::readList(Parent& parent) {
  if (parent.isListRead) {
    return;
  }
  parent.isListRead = true;
  const std::optional<PropertyArray> list =
      parent.account->arrayPropertyForKey(kAccountChildAccounts);
  for (const PropertyValue& element : list.value_or(PropertyArray())) {
    enter(parent, element);
  }
}

void ChildPlacement::enter(Parent& parent, const PropertyValue& element) {
  if (const std::optional<Text> identifier = identifierOfChildElement(element)) {
    std::vector<std::size_t>& places = parent.elementsByIdentifier[*identifier];
    if (places.empty()) {
      children_[*identifier].holders.push_back(&parent);
    }
    places.push_back(parent.elements.size());
  }
  parent.elements.emplace_back(element);
}

void ChildPlacement::noteIndexing(Parent& parent) {
  parent.lastIndexing = ++indexingCount_;
  if (const std::optional<Text> identifier = parent.account->identifier()) {
    lastIndexingByIdentifier_[*identifier] = indexingCount_;
  }
}

std::optional<Text> ChildPlacement::presentParentIdentifier(const Text& childIdentifier) const {
  const auto child = children_.find(childIdentifier);
  if (child == children_.end()) {
    // Indexing a parent again takes all children from its identifier that it does not hold.
    const Text* indexed = parentIdentifiers_.find(childIdentifier);
    return indexed != nullptr && !lastIndexingByIdentifier_.contains(*indexed)
               ? std::optional(*indexed)
               : std::nullopt;
  }
  // The child belongs to the parent that was the last to be indexed with it, unless it was taken
  // out there, or another record with that parent's identifier was indexed since. It does not fall
  // back to a parent that was indexed before.
  const auto& [holders, lastLoss] = child->second;
  const auto last =
      std::max_element(holders.begin(), holders.end(), [](const Parent* left, const Parent* right) {
        return left->lastIndexing < right->lastIndexing;
      });
  if (last == holders.end() || (*last)->lastIndexing < lastLoss) {
    return std::nullopt;
  }
  const std::optional<Text> identifier = (*last)->account->identifier();
  return identifier && lastIndexingByIdentifier_.at(*identifier) == (*last)->lastIndexing
             ? identifier
             : std::nullopt;
}

void ChildPlacement::takeOut(Parent& parent, const Text& childIdentifier) {
  readList(parent);
  noteIndexing(parent);
  Child& child = children_[childIdentifier];
  child.lastLoss = indexingCount_;
  std::erase(child.holders, &parent);
  const auto places = parent.elementsByIdentifier.find(childIdentifier);
  if (places == parent.elementsByIdentifier.end()) {
    return;
  }
  for (const std::size_t place : places->second) {
    parent.elements[place].reset();
  }
  parent.elementsByIdentifier.erase(places);
  parent.isListChanged = true;
}

void ChildPlacement::add(Parent& parent, const PropertyValue& element) {
  readList(parent);
  noteIndexing(parent);
  enter(parent, element);
  parent.isListChanged = true;
}

}  // namespace accounts
