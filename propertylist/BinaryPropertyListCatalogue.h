#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string_view>
#include <utility>
#include <vector>

#include "propertylist/BinaryPropertyListScalarCatalogue.h"
#include "propertylist/BlockList.h"
#include "propertylist/ContentTable.h"
#include "propertylist/PropertyListError.h"
#include "propertylist/PropertyValue.h"

namespace accounts::binaryplist {

/// The keys of dictionaries that a file may hold: their references are a run of the catalogue's.
struct CatalogueKeys {
  std::uint32_t firstReference = 0;
  std::uint32_t count = 0;
  /// What the keys count beyond their values.
  std::uint32_t expandedCount = 0;
};

/// A container that a file may hold: the references of its children are a run of the catalogue's.
struct CatalogueContainer {
  /// In place of the number of the keys of a dictionary.
  static constexpr std::uint32_t kArray = UINT32_MAX;

  std::uint32_t firstReference = 0;
  std::uint32_t childCount = 0;
  std::uint32_t keys = kArray;
  std::uint32_t expandedCount = 0;
  std::uint32_t height = 0;
  /// The walk that met it last, by number, and the node that it was met in. Its node is only kept
  /// alive, and its address only tells something, until the next walk has ended.
  std::uint32_t walk = 0;
  const SharedNodeBase* node = nullptr;

  [[nodiscard]] bool isDictionary() const { return keys != kArray; }
};
static_assert(sizeof(CatalogueContainer) == 32);

/// The distinct contents of the values that a writer met, containers too. What a value refers to
/// depends on its content alone and not on which of its parts happen to share memory. A part that
/// the walk before met, in the same memory, is known by the note on its node and not walked again.
class Catalogue {
 public:
  /// Scalars and containers are numbered apart, each from 0 in the order in which a walk first left
  /// them; a container's number has this bit in a reference.
  using Reference = std::uint32_t;
  static constexpr Reference kContainerBit = Reference{1} << 31;

  /// The reference of a value, whose parts are all in the catalogue then. The value that was added
  /// before must still be alive. None, with the error set, for a value that the reader would not
  /// take back; nothing can be added after that.
  [[nodiscard]] std::optional<Reference> add(const PropertyValue& value, PropertyListError& error);

  [[nodiscard]] const CatalogueScalar& scalar(Reference number) const { return scalars_[number]; }
  [[nodiscard]] const CatalogueContainer& container(Reference number) const {
    return containers_[number];
  }
  /// Whether all that the catalogue holds are the parts of one value.
  [[nodiscard]] bool holdsOneValue() const { return walk_ == 1; }
  [[nodiscard]] std::size_t scalarCount() const { return scalars_.size(); }
  [[nodiscard]] std::size_t containerCount() const { return containers_.size(); }
  [[nodiscard]] std::size_t objectCount() const { return scalarCount() + containerCount(); }
  /// The keys of a container that is a dictionary; those with the same references have the same
  /// number.
  [[nodiscard]] const CatalogueKeys& keys(std::uint32_t number) const { return keys_[number]; }
  [[nodiscard]] std::size_t keysCount() const { return keys_.size(); }
  [[nodiscard]] std::span<const Reference> childrenOf(const CatalogueContainer& container) const {
    return references_.run(container.firstReference, container.childCount);
  }
  [[nodiscard]] std::span<const Reference> referencesOf(const CatalogueKeys& keys) const {
    return references_.run(keys.firstReference, keys.count);
  }

 private:
  /// What a container adds up of its children.
  struct Size {
    std::uint64_t expandedCount = 1;
    std::uint32_t height = 1;
  };

  /// Where a container's part of what is pending begins.
  struct Pending {
    std::size_t firstChild;
    /// How many scalars there were before its children.
    std::size_t firstNewScalar;
  };
  bool fail(std::string_view what) const;
  template <class Element>
  bool visitAll(std::span<const Element> elements, std::size_t depth, Size& parent);
  bool visit(const PropertyValue& value, ScalarCatalogue::Announced announced, std::size_t depth,
             Size& parent);
  bool visit(const Text& key, ScalarCatalogue::Announced announced, std::size_t depth,
             Size& parent);
  bool visitContainer(const SharedNodeBase* node, const PropertyKeys* keys,
                      std::span<const PropertyValue> children, std::size_t depth, Size& parent);
  bool findOrAddKeys(const PropertyKeys& keys, std::uint32_t& number);
  [[nodiscard]] bool isKnownContainer(const SharedNodeBase* node) const;
  [[nodiscard]] ScalarCatalogue::Announced announce(const PropertyValue& value) const;
  [[nodiscard]] ScalarCatalogue::Announced announce(const Text& key) const;
  bool addScalarToParent(Reference number, std::string_view problem, Size& parent);
  bool findOrAddContainer(std::uint32_t keys, Pending pending, const Size& size, Reference& number);
  Reference findContainer(std::uint32_t keys, std::span<const Reference> content,
                          std::size_t firstNewScalar, Reference newNumber);
  bool keepReferences(std::span<const Reference> references, std::uint32_t& place);
  bool addToParent(Reference number, std::size_t depth, Size& parent);
  [[nodiscard]] bool checkObjectCount() const;

  /// The number of the walk under way.
  std::uint32_t walk_ = 0;
  /// Where its error goes.
  PropertyListError* error_ = nullptr;
  ScalarCatalogue scalars_;
  KeyedHash hash_;
  /// By scalar: the container that it was first met in, where it was the newest scalar. There may
  /// be none for the newest scalars.
  BlockList<Reference> firstHolders_;
  BlockList<CatalogueContainer> containers_;
  ContentTable containerTable_;
  std::vector<CatalogueKeys> keys_;
  ContentTable keysTable_;
  /// Keys that several dictionaries share in memory, kept alive, with their numbers.
  std::vector<std::pair<PropertyKeys, std::uint32_t>> sharedKeys_;
  NumberRuns references_;
  /// References of the containers that are being walked, the innermost one's last.
  std::vector<Reference> pending_;
};

}  // namespace accounts::binaryplist
