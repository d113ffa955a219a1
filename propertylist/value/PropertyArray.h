#pragma once

#include <cstddef>
#include <initializer_list>
#include <string_view>
#include <vector>

#include "propertylist/value/SharedNode.h"
#include "propertylist/value/SharedRun.h"

namespace accounts {

class PropertyValue;

/// An ordered list of values. A value type: a copy is O(1), and a change to one copy is never seen
/// by another.
class PropertyArray {
 public:
  PropertyArray() = default;
  PropertyArray(std::initializer_list<PropertyValue> values);
  explicit PropertyArray(std::vector<PropertyValue> values);
  /// An empty array with room for a number of elements: as many are appended without moving those
  /// before, as long as there is no copy.
  static PropertyArray withRoomFor(std::size_t count);

  [[nodiscard]] std::size_t size() const { return node_ ? run()->size() : 0; }
  [[nodiscard]] bool empty() const { return size() == 0; }
  /// The element at an index, which must be below size().
  [[nodiscard]] const PropertyValue& at(std::size_t index) const;
  [[nodiscard]] const PropertyValue* begin() const;
  [[nodiscard]] const PropertyValue* end() const;
  /// True when an element is the given text.
  [[nodiscard]] bool containsText(std::string_view text) const;

  /// Returns the element in its place.
  const PropertyValue& append(PropertyValue value);
  /// Puts a value in the place of the one at an index, which must be below size().
  void replace(std::size_t index, PropertyValue value);
  /// Removes every element that is the given text.
  void removeText(std::string_view text);

  /// True when both share the same elements in memory: equal without a comparison.
  [[nodiscard]] bool isSameAs(const PropertyArray& other) const {
    return node_.get() == other.node_.get();
  }

  /// Deep equality, in order.
  friend bool operator==(const PropertyArray& left, const PropertyArray& right);

 private:
  friend class SharedNode<PropertyArray>;
  using Run = SharedRun<PropertyValue>;
  [[nodiscard]] Run* run() const { return static_cast<Run*>(node_.get()); }
  static void destroyNode(SharedNodeBase* node);
  SharedNode<PropertyArray> node_;
};

}  // namespace accounts
