#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string_view>
#include <utility>
#include <vector>

#include "propertylist/BinaryPropertyListFormat.h"
#include "propertylist/ContentTable.h"
#include "propertylist/PropertyListError.h"
#include "propertylist/PropertyValue.h"

namespace accounts::binaryplist {

/// The kinds of scalar that are written differently. Those that hold bytes come last.
enum class ScalarKind : std::uint8_t {
  Boolean,
  SignedInteger,
  /// From 2^63 to 2^64-1.
  LargeInteger,
  Real,
  Date,
  Data,
  ASCIIText,
  UTF16Text
};

/// A scalar that a file may hold. There may be millions: it is kept small.
class CatalogueScalar {
 public:
  /// A number: its bits, 0 or 1 of a boolean.
  CatalogueScalar(ScalarKind kind, std::uint64_t bits) : bits_(bits), kind_(kind) {}
  /// A text or data, which it keeps alive.
  CatalogueScalar(ScalarKind kind, SharedBytes bytes)
      : bytes_(std::move(bytes)),
        byteCount_(static_cast<std::uint32_t>(bytes_.view().size())),
        kind_(kind) {}
  CatalogueScalar(CatalogueScalar&& other) noexcept
      : bits_(std::exchange(other.bits_, 0)), byteCount_(other.byteCount_), kind_(other.kind_) {}
  CatalogueScalar& operator=(CatalogueScalar&&) = delete;
  ~CatalogueScalar() {
    if (holdsBytes()) {
      bytes_.~SharedBytes();
    }
  }

  [[nodiscard]] ScalarKind kind() const { return kind_; }
  [[nodiscard]] bool holdsBytes() const { return kind_ >= ScalarKind::Data; }
  /// Of numbers alone.
  [[nodiscard]] std::uint64_t bits() const { return bits_; }
  /// Of texts and data alone.
  [[nodiscard]] std::string_view view() const { return bytes_.view(); }
  [[nodiscard]] std::size_t byteCount() const { return byteCount_; }
  [[nodiscard]] bool isNode(const SharedNodeBase* node) const {
    return holdsBytes() && bytes_.sharedNode() == node;
  }
  /// Whether both are texts, both data, or both numbers of the same kind.
  [[nodiscard]] bool isAlike(ScalarKind kind) const {
    return kind_ == kind || (kind_ > ScalarKind::Data && kind > ScalarKind::Data);
  }

 private:
  union {
    std::uint64_t bits_;
    SharedBytes bytes_;
  };
  std::uint32_t byteCount_ = 0;
  ScalarKind kind_;
};
static_assert(sizeof(CatalogueScalar) == 16);

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
    return {references_.data() + container.firstReference, container.childCount};
  }
  [[nodiscard]] std::span<const Reference> referencesOf(const CatalogueKeys& keys) const {
    return {references_.data() + keys.firstReference, keys.count};
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
  /// A number as it is written.
  struct Number {
    ScalarKind kind;
    std::uint64_t bits;
  };
  /// What is known of a value before it is visited.
  struct Announced {
    /// The number of a scalar that the walk before met in the same memory; `kNone` for others.
    Reference number = ContentTable::kNone;
    /// Of other scalars, the hash of their content.
    std::uint32_t hash = 0;
  };

  bool fail(std::string_view what) const;
  template <class Element>
  bool visitAll(std::span<const Element> elements, std::size_t depth, Size& parent);
  bool visit(const PropertyValue& value, Announced announced, std::size_t depth, Size& parent);
  bool visit(const Text& text, Announced announced, std::size_t depth, Size& parent);
  bool visitNumber(Number number, Announced announced, Size& parent);
  bool visitBytes(ScalarKind kind, const SharedBytes& bytes, Announced announced, Size& parent);
  bool visitContainer(const SharedNodeBase* node, const PropertyKeys* keys,
                      std::span<const PropertyValue> children, std::size_t depth, Size& parent);
  bool findOrAddKeys(const PropertyKeys& keys, std::uint32_t& number);
  [[nodiscard]] bool isKnownContainer(const SharedNodeBase* node) const;
  [[nodiscard]] Announced announce(const PropertyValue& value) const;
  [[nodiscard]] Announced announce(const Text& text) const;
  [[nodiscard]] Announced announceBytes(ScalarKind kind, const SharedBytes& bytes) const;
  [[nodiscard]] Announced announceHash(std::uint32_t hash) const;
  static Number numberOf(const PropertyValue& value);
  bool findOrAddContainer(std::uint32_t keys, Pending pending, const Size& size, Reference& number);
  Reference findContainer(std::uint32_t keys, std::span<const Reference> content,
                          std::size_t firstNewScalar, Reference newNumber);
  bool keepReferences(std::span<const Reference> references);
  bool addToParent(Reference number, std::size_t depth, Size& parent);
  [[nodiscard]] bool checkObjectCount() const;

  /// The number of the walk under way.
  std::uint32_t walk_ = 0;
  /// Where its error goes.
  PropertyListError* error_ = nullptr;
  KeyedHash hash_;
  std::vector<CatalogueScalar> scalars_;
  ContentTable scalarTable_;
  /// By scalar: the container that it was first met in, where it was the newest scalar.
  std::vector<Reference> firstHolders_;
  std::vector<CatalogueContainer> containers_;
  ContentTable containerTable_;
  std::vector<CatalogueKeys> keys_;
  ContentTable keysTable_;
  /// Keys that several dictionaries share in memory, kept alive, with their numbers.
  std::vector<std::pair<PropertyKeys, std::uint32_t>> sharedKeys_;
  std::vector<Reference> references_;
  /// References of the containers that are being walked, the innermost one's last.
  std::vector<Reference> pending_;
};

}  // namespace accounts::binaryplist
