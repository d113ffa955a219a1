#pragma once

#include <cstddef>
#include <initializer_list>
#include <optional>
#include <span>
#include <string_view>
#include <vector>

#include "propertylist/value/PropertyArray.h"
#include "propertylist/value/PropertyKeys.h"
#include "propertylist/value/SharedNode.h"
#include "propertylist/value/SharedRun.h"
#include "propertylist/value/Text.h"

namespace accounts {

class PropertyEntryIterator;
struct KeyedValue;

/// Values by text key, in the order of the keys' bytes. A value type: a copy is O(1), and a change
/// to one copy is never seen by another. Looking a key up is O(log n).
class PropertyDictionary {
 public:
  PropertyDictionary() = default;
  PropertyDictionary(std::initializer_list<KeyedValue> values);
  /// Takes values in any order, in O(n log n); of those with the same key the last one holds.
  explicit PropertyDictionary(std::vector<KeyedValue> values);
  [[nodiscard]] std::size_t size() const { return node_ ? run()->size() : 0; }
  [[nodiscard]] bool empty() const { return size() == 0; }
  /// The entries in key order.
  [[nodiscard]] PropertyEntryIterator begin() const;
  [[nodiscard]] PropertyEntryIterator end() const;
  /// The keys alone, and the values alone, in the same order.
  [[nodiscard]] const PropertyKeys& keys() const;
  [[nodiscard]] std::span<const PropertyValue> values() const;

  /// The value under a key, null for none; valid until the dictionary changes or goes.
  [[nodiscard]] const PropertyValue* find(std::string_view key) const;
  [[nodiscard]] bool contains(std::string_view key) const { return find(key) != nullptr; }
  /// The text, array or dictionary under a key; none when there is no value or one of another kind.
  [[nodiscard]] std::optional<Text> textForKey(std::string_view key) const;
  [[nodiscard]] std::optional<PropertyArray> arrayForKey(std::string_view key) const;
  [[nodiscard]] std::optional<PropertyDictionary> dictionaryForKey(std::string_view key) const;

  void set(std::string_view key, PropertyValue value);
  void remove(std::string_view key);
  /// Removes the value under a key and returns it; none when there was none.
  std::optional<PropertyValue> take(std::string_view key);

  /// True when both share the same keys and values in memory: equal without a comparison.
  [[nodiscard]] bool isSameAs(const PropertyDictionary& other) const {
    return node_.get() == other.node_.get();
  }
  /// The node, null for an empty one: as long as a handle to it lives, its address names the
  /// content.
  [[nodiscard]] const SharedNodeBase* sharedNode() const { return node_.get(); }

  /// Deep equality.
  friend bool operator==(const PropertyDictionary& left, const PropertyDictionary& right);

 private:
  friend class SharedNode<PropertyDictionary>;
  friend class OrderedValues;
  struct Head : SharedNodeBase {
    PropertyKeys keys;
  };
  using Run = SharedRun<PropertyValue, Head>;
  PropertyDictionary(PropertyKeys keys, std::size_t room);
  [[nodiscard]] Run* run() const { return static_cast<Run*>(node_.get()); }
  static void destroyNode(SharedNodeBase* node);
  SharedNode<PropertyDictionary> node_;
};

}  // namespace accounts
