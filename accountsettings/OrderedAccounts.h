#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <set>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "accountsettings/BasicAccount.h"
#include "accountsettings/IdentifierIndex.h"

namespace accounts {

/// The top-level accounts of a store in file order. An identifier or a record may stand in several
/// places. Places are found by an index, so that removing or replacing many accounts one by one is
/// O(log n) for each. The identifiers that count are those that the records have at the time of the
/// call, not those that they had when they were put in.
class OrderedAccounts {
 public:
  /// The accounts in order. The reference stays valid and changes with the list; accounts that were
  /// removed leave it at the next call.
  [[nodiscard]] const std::vector<BasicAccountReference>& accounts() const;
  /// The number of accounts; O(1).
  [[nodiscard]] std::size_t size() const { return accounts_.size() - removedCount_; }

  void append(BasicAccountReference account);
  /// Puts other accounts in the place of all.
  void assign(std::vector<BasicAccountReference> accounts);
  /// Puts a record in every place whose account has the identifier; gives the number of places.
  std::size_t replaceAll(std::string_view identifier, const BasicAccountReference& account);
  /// Puts a record in the first place of another one. False when that is not in the list.
  bool replaceFirst(const BasicAccountReference& oldAccount,
                    const BasicAccountReference& newAccount);
  /// Removes the last record with the identifier from every place that it has. Gives the record;
  /// null when there is none.
  BasicAccountReference removeLast(std::string_view identifier);

 private:
  // A place keeps its number as long as it exists, so that the indexes outlive the removal of other
  // places. Numbers increase along the list.
  using PlaceNumber = std::uint64_t;
  /// Numbers in order. Nearly always there is one, which needs no memory of its own.
  class PlaceNumbers {
   public:
    void insert(PlaceNumber number);
    void erase(PlaceNumber number);
    [[nodiscard]] bool empty() const { return first_ == kNone; }
    /// The smallest and the largest; there must be one.
    [[nodiscard]] PlaceNumber first() const { return first_; }
    [[nodiscard]] PlaceNumber last() const;
    [[nodiscard]] std::vector<PlaceNumber> all() const;

   private:
    static constexpr PlaceNumber kNone = UINT64_MAX;
    PlaceNumber first_ = kNone;
    /// The others; null for none.
    std::unique_ptr<std::set<PlaceNumber>> others_;
  };
  struct Place {
    PlaceNumber number;
    bool isRemoved;
  };

  [[nodiscard]] std::size_t positionOf(PlaceNumber number) const;
  void addPlace();
  void replaceAt(PlaceNumber number, const BasicAccountReference& account);
  void remove(PlaceNumber number);
  void dropRemovedPlaces() const;
  void bringIndexesUpToDate();
  void enterInIndexes(PlaceNumber number, const BasicAccount& account);
  void takeFromIndexes(PlaceNumber number, const BasicAccount& account);

  // Removed accounts stay in the list until somebody looks at it: dropping each at once would make
  // the removal of many quadratic. Both lists always have the same length.
  mutable std::vector<BasicAccountReference> accounts_;
  mutable std::vector<Place> places_;
  mutable std::size_t removedCount_ = 0;
  PlaceNumber nextNumber_ = 0;

  // Made when first needed, and again when a record's identifier has changed since.
  bool hasIndexes_ = false;
  std::uint64_t identifierChangesAtIndexing_ = 0;
  std::unordered_map<const BasicAccount*, PlaceNumbers> placesByRecord_;
  IdentifierIndex<PlaceNumbers> placesByIdentifier_;
};

}  // namespace accounts
