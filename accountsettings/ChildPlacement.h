#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <unordered_map>
#include <vector>

#include "accountsettings/BasicAccount.h"
#include "accountsettings/IdentifierIndex.h"

namespace accounts {

/// The identifier of the account that an element of a "ChildAccounts" array makes; none when it
/// makes no account. An element without an identifier of its own makes an account with a fresh one
/// each time.
std::optional<Text> identifierOfChildElement(const PropertyValue& element);

/// Moves child accounts to their parents in bulk. The outcome is that of taking each child out of
/// its present parent and adding it to its new one, one after the other, each time with the
/// parent's children indexed anew; but each parent's list is read, written and indexed once,
/// however many children come and go.
class ChildPlacement {
 public:
  /// Both indexes must outlive the placement: the parent identifier of each indexed child, which
  /// must not change before finish(), and the top-level accounts that may be parents.
  ChildPlacement(const IdentifierIndex<Text>& parentIdentifiers,
                 const IdentifierIndex<BasicAccountReference>& topLevelAccounts)
      : parentIdentifiers_(parentIdentifiers), topLevelAccounts_(topLevelAccounts) {}

  /// Takes a child out of the parent that holds it now, if any, and adds it at the end of the
  /// children of the account with its parent's identifier; of none when there is no such account.
  void place(const BasicAccount& child);

  /// Has the children of a top-level account indexed anew at this point of the order.
  void indexChildrenOf(const BasicAccountReference& account);

  /// What is left to do for the indexes when all children are in their places.
  struct IndexingToDo {
    /// The parents whose children have to be indexed anew, in this order.
    std::vector<BasicAccountReference> parents;
    /// The children that have to leave the indexes after that, in any order. A parent may still
    /// hold them, but they had gone on to another one and were taken out there.
    std::vector<Text> lostChildren;
  };
  /// Stores the changed lists in their parents.
  IndexingToDo finish();

 private:
  /// A parent whose children are to be indexed anew.
  struct Parent {
    BasicAccountReference account;
    /// When its children would last have been indexed: grows from change to change.
    std::uint64_t lastIndexing = 0;
    bool isListRead = false;
    bool isListChanged = false;
    /// The elements of its list, none in the place of one that was taken out.
    std::vector<std::optional<PropertyValue>> elements;
    std::unordered_map<Text, std::vector<std::size_t>, TextHash, std::equal_to<>>
        elementsByIdentifier;
  };

  /// What became of a child that a changed parent holds or held.
  struct Child {
    std::vector<Parent*> holders;
    /// When it was last taken out of the parent that it belonged to.
    std::uint64_t lastLoss = 0;
  };

  Parent& parentFor(const BasicAccountReference& account);
  void readListsOfParents();
  void readList(Parent& parent);
  void enter(Parent& parent, const PropertyValue& element);
  void noteIndexing(Parent& parent);
  [[nodiscard]] std::optional<Text> presentParentIdentifier(const Text& childIdentifier) const;
  void takeOut(Parent& parent, const Text& childIdentifier);
  void add(Parent& parent, const PropertyValue& element);

  const IdentifierIndex<Text>& parentIdentifiers_;
  const IdentifierIndex<BasicAccountReference>& topLevelAccounts_;
  std::vector<std::unique_ptr<Parent>> parents_;
  /// So many of the parents were looked at by readListsOfParents().
  std::size_t readCount_ = 0;
  std::unordered_map<const BasicAccount*, Parent*> parentsByRecord_;
  std::unordered_map<Text, Child, TextHash, std::equal_to<>> children_;
  std::unordered_map<Text, std::uint64_t, TextHash, std::equal_to<>> lastIndexingByIdentifier_;
  std::uint64_t indexingCount_ = 0;
};

}  // namespace accounts
