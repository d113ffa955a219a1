#pragma once

#include <cstddef>
#include <cstdint>
#include <string_view>
#include <utility>

#include "propertylist/BlockList.h"
#include "propertylist/ContentTable.h"
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
  CatalogueScalar(const CatalogueScalar&) = delete;
  CatalogueScalar& operator=(const CatalogueScalar&) = delete;
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
  /// 0 of numbers.
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

/// The distinct scalars that a writer met, numbered in the order in which it met them.
class ScalarCatalogue {
 public:
  /// What is known of a scalar before it is looked for.
  struct Announced {
    /// The number of a text or data that was met in the same memory before; `kNone` for others.
    std::uint32_t number = ContentTable::kNone;
    /// Of others, the hash of their content.
    std::uint32_t hash = 0;
  };

  /// Says that a scalar will be looked for soon. Memory is asked for what that will look at: worth
  /// it for several scalars in a row.
  [[nodiscard]] Announced announce(const PropertyValue& scalar) const;
  [[nodiscard]] Announced announce(const Text& text) const;

  /// The number of a scalar that was announced, from now on if it is new. `kNone`, with `problem`
  /// set, for one that the reader would not take back.
  std::uint32_t findOrAdd(const PropertyValue& scalar, Announced announced,
                          std::string_view& problem);
  std::uint32_t findOrAdd(const Text& text, Announced announced, std::string_view& problem);

  [[nodiscard]] const CatalogueScalar& operator[](std::uint32_t number) const {
    return scalars_[number];
  }
  [[nodiscard]] std::size_t size() const { return scalars_.size(); }

 private:
  [[nodiscard]] Announced announceBytes(ScalarKind kind, const SharedBytes& bytes) const;
  [[nodiscard]] Announced announceHash(std::uint32_t hash) const;
  std::uint32_t findOrAddBytes(ScalarKind kind, const SharedBytes& bytes, Announced announced,
                               std::string_view& problem);

  KeyedHash hash_;
  BlockList<CatalogueScalar> scalars_;
  ContentTable table_;
};

}  // namespace accounts::binaryplist
