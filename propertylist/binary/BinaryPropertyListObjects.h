#pragma once

#include <cstddef>
#include <cstdint>
#include <span>
#include <string_view>
#include <vector>

#include "propertylist/binary/BinaryPropertyListFormat.h"
#include "propertylist/value/ContentTable.h"
#include "propertylist/value/KeyedHash.h"
#include "propertylist/value/PropertyValue.h"

namespace accounts::binaryplist {

/// A scalar that a file holds. There may be millions: it is kept small.
struct Scalar {
  /// Every text's is ASCIIText.
  Kind kind;
  /// Of a text or data as it stands in memory; of a number, 16 for an integer from 2^63 on.
  std::uint32_t byteCount;
  union {
    /// A number's, 0 or 1 of a boolean.
    std::uint64_t bits;
    const char* bytes;
  };

  /// Of texts and data alone.
  [[nodiscard]] std::string_view view() const { return {bytes, byteCount}; }
};
static_assert(sizeof(Scalar) == 16);

/// The objects of a file: the distinct contents of one value's parts, whichever of them share
/// memory, in the order in which a walk over the value leaves them.
class Objects {
 public:
  /// A scalar's number, or a container's with this bit.
  using Reference = std::uint32_t;
  static constexpr Reference kContainerBit = Reference{1} << 31;

  struct Container {
    bool isDictionary;
    /// Those of the keys, if it is a dictionary, and then of the children are a run of these.
    std::uint32_t firstReference;
    std::uint32_t referenceCount;
  };

  /// The value must be within the limits, and outlive this.
  explicit Objects(const PropertyValue& value) { visit(value); }

  /// How many values the value stands for, as `maximumExpandedValueCount` has it.
  [[nodiscard]] std::uint64_t expandedCount() const { return expandedCount_; }
  /// How often a container is reached again, as `maximumRepeatedContainerCount` has it.
  [[nodiscard]] std::uint64_t repeatedContainerCount() const { return repeatedContainerCount_; }
  [[nodiscard]] std::size_t count() const { return scalars_.size() + containers_.size(); }
  [[nodiscard]] const std::vector<Scalar>& scalars() const { return scalars_; }
  [[nodiscard]] const std::vector<Container>& containers() const { return containers_; }
  [[nodiscard]] std::span<const Reference> referencesOf(const Container& container) const {
    return std::span(references_).subspan(container.firstReference, container.referenceCount);
  }

 private:
  void visit(const PropertyValue& value);
  void leave(const Scalar& scalar);
  void leaveContainer(bool isDictionary, std::size_t firstPending);

  KeyedHash hash_;
  std::vector<Scalar> scalars_;
  ContentTable scalarTable_;
  std::vector<Container> containers_;
  ContentTable containerTable_;
  std::vector<Reference> references_;
  /// References of the containers that are being walked, the innermost one's last.
  std::vector<Reference> pending_;
  std::uint64_t expandedCount_ = 0;
  std::uint64_t repeatedContainerCount_ = 0;
};

}  // namespace accounts::binaryplist
