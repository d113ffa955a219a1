#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string_view>
#include <vector>

#include "propertylist/BinaryPropertyListFormat.h"
#include "propertylist/PropertyListError.h"
#include "propertylist/PropertyListUniquing.h"
#include "propertylist/PropertyValue.h"

namespace accounts::binaryplist {

/// The kinds of scalar that are written differently.
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

/// A scalar that a file is to hold. There may be millions: it is kept small.
struct PlannedScalar {
  union {
    /// The number, 0 or 1 of a boolean, the bits of a real or date.
    std::uint64_t bits = 0;
    /// The content of a text or data.
    const char* bytes;
  };
  std::uint32_t byteCount = 0;
  ScalarKind kind = ScalarKind::Boolean;

  /// Of texts and data alone.
  [[nodiscard]] std::string_view view() const { return {bytes, byteCount}; }
};
static_assert(sizeof(PlannedScalar) == 16);

/// A container that a file is to hold: its references are a run of the plan's. The keys of a
/// dictionary come first.
struct PlannedContainer {
  Kind kind = Kind::Array;
  std::uint32_t referenceCount = 0;
  std::size_t firstReference = 0;
  std::uint32_t expandedCount = 0;
  std::uint32_t height = 0;

  [[nodiscard]] std::uint32_t childCount() const {
    return kind == Kind::Dictionary ? referenceCount / 2 : referenceCount;
  }
};

/// What a file is to hold, found in one walk over a value. Every distinct content is in it once,
/// containers too: it depends on the value alone and not on which of its parts happen to share
/// memory. It refers to the value's bytes, so the value must outlive it.
class Plan {
 public:
  /// Scalars and containers are numbered apart, each from 0 in the order in which the walk leaves
  /// them; a container's number has this bit in a reference.
  using Reference = std::uint32_t;
  static constexpr Reference kContainerBit = Reference{1} << 31;

  explicit Plan(PropertyListError& error) : error_(error) {}

  /// Plans a value; once for each plan. False, with the error set, for a value that the reader
  /// would not take back.
  [[nodiscard]] bool make(const PropertyValue& value);

  [[nodiscard]] const std::vector<PlannedScalar>& scalars() const { return scalars_; }
  /// The outermost one comes last.
  [[nodiscard]] const std::vector<PlannedContainer>& containers() const { return containers_; }
  [[nodiscard]] std::span<const Reference> referencesOf(const PlannedContainer& container) const {
    return {references_.data() + container.firstReference, container.referenceCount};
  }
  [[nodiscard]] std::size_t objectCount() const { return scalars_.size() + containers_.size(); }

 private:
  /// What a container adds up of its children.
  struct Size {
    std::uint64_t expandedCount = 1;
    std::uint32_t height = 1;
  };

  bool fail(std::string_view what) const;
  bool visit(const PropertyValue& value, std::size_t depth, Size& parent);
  bool visitText(const Text& text, Size& parent);
  bool visitNumber(ScalarKind kind, std::uint64_t bits, Size& parent);
  bool visitData(std::string_view bytes, Size& parent);
  template <class Container>
  bool visitContainer(const Container& container, std::size_t depth, Size& parent);
  bool visitChildren(const PropertyArray& array, std::size_t depth, Size& size);
  bool visitChildren(const PropertyDictionary& dictionary, std::size_t depth, Size& size);
  template <class Container, class ValueOf>
  bool visitEach(const Container& container, std::size_t depth, Size& size, const ValueOf& valueOf);
  void announce(const PropertyValue& value) const;
  bool addBytes(ScalarKind kind, std::string_view bytes);
  bool addScalar(const PlannedScalar& scalar);
  std::optional<Reference> findOrAddContainer(Kind kind, std::size_t firstPending,
                                              const Size& size);
  bool addToParent(Reference number, std::size_t depth, Size& parent);
  [[nodiscard]] bool checkObjectCount() const;

  PropertyListError& error_;
  KeyedHash hash_;
  std::vector<PlannedScalar> scalars_;
  ContentTable numberTable_;
  ContentTable bytesTable_;
  IdentityTable texts_;
  std::vector<PlannedContainer> containers_;
  std::vector<Reference> references_;
  ContentTable containerTable_;
  IdentityTable containerIdentities_;
  /// References of the containers that are being walked, the innermost one's last.
  std::vector<Reference> pending_;
};

}  // namespace accounts::binaryplist
