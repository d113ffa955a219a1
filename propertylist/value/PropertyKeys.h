#pragma once

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <span>
#include <string_view>

#include "propertylist/value/SharedNode.h"
#include "propertylist/value/Text.h"

namespace accounts {

/// The keys of a dictionary, all different and in the order of their bytes. Nobody changes them, so
/// that all dictionaries with the same keys can share them. A value type: a copy is O(1).
class PropertyKeys {
 public:
  /// No keys.
  PropertyKeys() = default;
  /// Takes keys that are different and in order.
  explicit PropertyKeys(std::span<const Text> ordered);

  [[nodiscard]] std::size_t size() const { return node_ ? node()->count : 0; }
  [[nodiscard]] const Text* begin() const { return node_ ? node()->keys() : nullptr; }
  [[nodiscard]] const Text* end() const { return begin() + size(); }

  /// Where a key is, or where it would have its place in the order.
  struct Place {
    std::size_t index;
    bool isThere;
  };
  /// O(log n).
  [[nodiscard]] Place find(std::string_view key) const;

  /// These keys and one more, which has its place at an index. The same change of keys that are
  /// shared gives the same ones in memory again, unless there were many different changes.
  [[nodiscard]] PropertyKeys with(std::string_view key, std::size_t index) const;
  /// These keys without the one at an index; in memory again like those above.
  [[nodiscard]] PropertyKeys without(std::size_t index) const;

  /// True when both are the same in memory: equal without a comparison.
  [[nodiscard]] bool isSameAs(const PropertyKeys& other) const {
    return node_.get() == other.node_.get();
  }

  friend bool operator==(const PropertyKeys& left, const PropertyKeys& right);

 private:
  friend class SharedNode<PropertyKeys>;
  struct Change;
  /// The prefixes of all keys follow it in memory, and then the keys. A prefix is a number, so that
  /// most comparisons look at no text.
  struct Node : SharedNodeBase {
    Node(std::uint32_t keyCount, std::uint32_t changesBefore)
        : count(keyCount), changesInARow(changesBefore) {}
    [[nodiscard]] std::uint64_t* prefixes() { return reinterpret_cast<std::uint64_t*>(this + 1); }
    [[nodiscard]] Text* keys() { return reinterpret_cast<Text*>(prefixes() + count); }
    const std::uint32_t count;
    const std::uint32_t changesInARow;
    /// The changes that were made before: a list, to which any thread may add.
    std::atomic<const Change*> changes = nullptr;
  };

  [[nodiscard]] Node* node() const { return static_cast<Node*>(node_.get()); }
  static Node* makeNode(std::span<const Text> ordered, std::uint32_t changesBefore);
  [[nodiscard]] const PropertyKeys* knownChange(std::string_view key, std::size_t index,
                                                std::size_t newSize) const;
  [[nodiscard]] PropertyKeys changed(std::span<const Text> ordered, std::size_t index) const;
  static void destroyNode(SharedNodeBase* base);

  SharedNode<PropertyKeys> node_;
};

}  // namespace accounts
