#include "propertylist/BinaryPropertyListSerializer.h"

#include <algorithm>
#include <string_view>
#include <utility>

#include "propertylist/BinaryPropertyList.h"
#include "propertylist/BinaryPropertyListCatalogue.h"
#include "propertylist/GeneralisedUTF8.h"
#include "propertylist/PropertyListLimits.h"

namespace accounts {

/// A walk over one value. The accounts of a store stand in an array of its root, and from one save
/// to the next most are the same in memory and stand where they stood, or a few places off where
/// others came or went. As long as the last value is kept, nobody changes its nodes or makes others
/// at their addresses, and their depth is the same: what was found of them still holds, so that a
/// save that changed three accounts looks at three.
class BinaryPropertyListSerializer::Check {
 public:
  Check(const std::vector<Element>& lastElements, PropertyListError& error)
      : lastElements_(lastElements), error_(error) {}

  bool passes(const PropertyValue& root) {
    const PropertyDictionary* const dictionary = root.asDictionary();
    if (!(dictionary != nullptr ? passesRoot(*dictionary) : passesPart(root, 0))) {
      return false;
    }
    // Each value and each key is at most one object. Whether those of a huge value are few enough,
    // because many are equal, the writer's catalogue alone can tell.
    return 2 * expandedCount_ <= kMaximumObjectCount ||
           binaryplist::Catalogue().add(root, error_).has_value();
  }

  /// Those of the value that passed.
  [[nodiscard]] std::vector<Element> takeElements() { return std::move(elements_); }

 private:
  /// How far off its place an element is looked for.
  static constexpr std::size_t kReach = 16;

  bool passesRoot(const PropertyDictionary& root) {
    return addCount(1) && std::all_of(root.begin(), root.end(), [this](const PropertyEntry& entry) {
             const PropertyArray* const array = entry.value.asArray();
             return passesText(entry.key) &&
                    (array != nullptr ? passesArrayOfRoot(*array) : passesPart(entry.value, 1));
           });
  }

  bool passesArrayOfRoot(const PropertyArray& array) {
    return addCount(1) &&
           std::all_of(array.begin(), array.end(), [this](const PropertyValue& value) {
             const PropertyDictionary* const dictionary = value.asDictionary();
             return dictionary != nullptr && !dictionary->empty()
                        ? passesElement(value, dictionary->sharedNode())
                        : passesPart(value, 2);
           });
  }

  bool passesElement(const PropertyValue& value, const SharedNodeBase* node) {
    const std::uint64_t countBefore = expandedCount_;
    const Element* const known = findKnown(node);
    const bool isPassed = known != nullptr ? addCount(known->expandedCount) : passesPart(value, 2);
    elements_.push_back({.node = node, .expandedCount = expandedCount_ - countBefore});
    return isPassed;
  }

  /// The element of the last value with a node, null for none near its place.
  const Element* findKnown(const SharedNodeBase* node) {
    const std::size_t count = lastElements_.size();
    const std::size_t place = next_++;
    if (place < count && lastElements_[place].node == node) {
      return &lastElements_[place];
    }
    const Element* const first = lastElements_.data();
    const Element* const begin = first + std::min(count, place - std::min(place, kReach));
    const Element* const end = first + std::min(count, place + kReach);
    const Element* const found =
        std::find_if(begin, end, [node](const Element& element) { return element.node == node; });
    if (found == end) {
      return nullptr;
    }
    next_ = static_cast<std::size_t>(found - first) + 1;
    return found;
  }

  /// `depth` is the number of containers around the value; it bounds the recursion.
  bool passesPart(const PropertyValue& value, std::size_t depth) {
    if (const Text* text = value.asText()) {
      return addCount(1) && passesText(*text);
    }
    if (const PropertyData* data = value.asData()) {
      return addCount(1 + expandedCountOfBytes(data->bytes.view().size()));
    }
    const PropertyDictionary* const dictionary = value.asDictionary();
    const PropertyArray* const array = value.asArray();
    if (dictionary == nullptr && array == nullptr) {
      return addCount(1);
    }
    if (depth == kMaximumNestingDepth) {
      return fail("containers nested deeper than the limit");
    }
    if (array != nullptr) {
      return addCount(1) &&
             std::all_of(array->begin(), array->end(),
                         [&](const PropertyValue& child) { return passesPart(child, depth + 1); });
    }
    return addCount(1) &&
           std::all_of(dictionary->begin(), dictionary->end(), [&](const PropertyEntry& entry) {
             return passesText(entry.key) && passesPart(entry.value, depth + 1);
           });
  }

  bool passesText(const Text& text) {
    const std::string_view view = text.view();
    return (isASCII(view) || isGeneralisedUTF8(view) ||
            fail("a text that is not well-formed UTF-8")) &&
           addCount(expandedCountOfBytes(view.size()));
  }

  /// Ends the walk as soon as it can: a value of a few parts can stand for billions.
  bool addCount(std::uint64_t count) {
    expandedCount_ += count;
    return expandedCount_ <= kMaximumExpandedValueCount ||
           fail("a container that stands for more values than the limit");
  }

  bool fail(std::string_view what) {
    error_.text = "binary property list: cannot write ";
    error_.text.append(what);
    return false;
  }

  const std::vector<Element>& lastElements_;
  PropertyListError& error_;
  std::uint64_t expandedCount_ = 0;
  std::vector<Element> elements_;
  /// Where among the last elements the next one is looked for first.
  std::size_t next_ = 0;
};

SerializedPropertyList BinaryPropertyListSerializer::serialize(const PropertyValue& value,
                                                               PropertyListError& error) {
  Check check(lastElements_, error);
  if (!check.passes(value)) {
    return {};
  }
  lastElements_ = check.takeElements();
  lastValue_ = value;
  return {value, &giveBinaryPropertyList};
}

}  // namespace accounts
