#include "propertylist/binary/BinaryPropertyListSerializer.h"

#include <algorithm>
#include <string_view>
#include <utility>

#include "propertylist/PropertyListLimits.h"
#include "propertylist/binary/BinaryPropertyList.h"
#include "propertylist/binary/BinaryPropertyListFile.h"
#include "propertylist/value/GeneralisedUTF8.h"

namespace accounts {

/// A walk over one value. The accounts of a store stand in an array of its root, and from one save
/// to the next most are the same in memory and stand where they stood, or a few places off where
/// others came or went. As long as the last value is kept, nobody changes its nodes or makes others
/// at their addresses, and their depth is the same: what was found of them still holds, so that a
/// save that changed three accounts looks at three.
class BinaryPropertyListSerializer::Check {
 public:
  /// The error stands elsewhere: beside it, in here, the compiler inlines less, and a write takes a
  /// fifth longer.
  Check(const std::vector<Element>& lastElements, PropertyListError& error)
      : lastElements_(lastElements), error_(error) {}

  bool passes(const PropertyValue& root) {
    const PropertyDictionary* const dictionary = root.asDictionary();
    if (!(dictionary != nullptr ? passesRoot(*dictionary) : passesPart(root, 0))) {
      return false;
    }
    // Each value and each key is at most one object. Whether those of a huge value are few and
    // small enough, because many are equal, is seen when they are put down.
    return (2 * whole_.expandedCount <= kMaximumObjectCount && whole_.size <= kMaximumFileSize) ||
           binaryplist::giveFile(root, [](std::string_view) { return true; }) ||
           fail("more objects or bytes than the limit");
  }

  /// Those of the value that passed.
  [[nodiscard]] std::vector<Element> takeElements() { return std::move(elements_); }

 private:
  /// How far off its place an element is looked for.
  static constexpr std::size_t kReach = 16;

  // The most that an object takes beside its content: its head, its place in the table, and, for
  // each time that it is reached, a reference.
  static constexpr std::uint64_t kSizeOfText = 6 + 4 + 4;
  static constexpr std::uint64_t kSizeOfContainer = kSizeOfText;
  static constexpr std::uint64_t kSizeOfNumber = 17 + 4 + 4;
  /// More than header and trailer.
  static constexpr std::uint64_t kSizeOfFrame = 64;

  bool passesRoot(const PropertyDictionary& root) {
    return add({1, kSizeOfContainer}) &&
           std::all_of(root.begin(), root.end(), [this](const PropertyEntry& entry) {
             const PropertyArray* const array = entry.value.asArray();
             return passesText(entry.key, 0) &&
                    (array != nullptr ? passesArrayOfRoot(*array) : passesPart(entry.value, 1));
           });
  }

  bool passesArrayOfRoot(const PropertyArray& array) {
    return add({1, kSizeOfContainer}) &&
           std::all_of(array.begin(), array.end(), [this](const PropertyValue& value) {
             const PropertyDictionary* const dictionary = value.asDictionary();
             return dictionary != nullptr && !dictionary->empty()
                        ? passesElement(value, dictionary->sharedNode())
                        : passesPart(value, 2);
           });
  }

  bool passesElement(const PropertyValue& value, const SharedNodeBase* node) {
    const Extent before = whole_;
    const Element* const known = findKnown(node);
    const bool isPassed = known != nullptr ? add(known->extent) : passesPart(value, 2);
    elements_.push_back({.node = node,
                         .extent = {.expandedCount = whole_.expandedCount - before.expandedCount,
                                    .size = whole_.size - before.size}});
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
      return passesText(*text, 1);
    }
    if (const PropertyData* data = value.asData()) {
      const std::size_t size = data->bytes.view().size();
      return add({1 + expandedCountOfBytes(size), kSizeOfText + size});
    }
    const PropertyDictionary* const dictionary = value.asDictionary();
    const PropertyArray* const array = value.asArray();
    if (dictionary == nullptr && array == nullptr) {
      return add({1, kSizeOfNumber});
    }
    if (depth == kMaximumNestingDepth) {
      return fail("containers nested deeper than the limit");
    }
    if (array != nullptr) {
      return add({1, kSizeOfContainer}) &&
             std::all_of(array->begin(), array->end(),
                         [&](const PropertyValue& child) { return passesPart(child, depth + 1); });
    }
    return add({1, kSizeOfContainer}) &&
           std::all_of(dictionary->begin(), dictionary->end(), [&](const PropertyEntry& entry) {
             return passesText(entry.key, 0) && passesPart(entry.value, depth + 1);
           });
  }

  /// `valueCount` is 1 for a text that is a value, 0 for a key, which counts its bytes alone.
  bool passesText(const Text& text, std::uint64_t valueCount) {
    const std::string_view view = text.view();
    const bool isWideInFile = !isASCII(view);
    if (isWideInFile && !isGeneralisedUTF8(view)) {
      return fail("a text that is not well-formed UTF-8");
    }
    return add({valueCount + expandedCountOfBytes(view.size()),
                kSizeOfText + (isWideInFile ? 2 : 1) * view.size()});
  }

  /// Ends the walk as soon as it can: a value of a few parts can stand for billions.
  bool add(Extent extent) {
    whole_.expandedCount += extent.expandedCount;
    whole_.size += extent.size;
    return whole_.expandedCount <= kMaximumExpandedValueCount ||
           fail("a container that stands for more values than the limit");
  }

  bool fail(std::string_view what) {
    error_.text = "binary property list: cannot write ";
    error_.text.append(what);
    return false;
  }

  const std::vector<Element>& lastElements_;
  PropertyListError& error_;
  Extent whole_ = {.expandedCount = 0, .size = kSizeOfFrame};
  std::vector<Element> elements_;
  /// Where among the last elements the next one is looked for first.
  std::size_t next_ = 0;
};

OrPropertyListError<SerializedPropertyList> BinaryPropertyListSerializer::serialize(
    const PropertyValue& value) {
  PropertyListError error;
  Check check(lastElements_, error);
  if (!check.passes(value)) {
    return error;
  }
  lastElements_ = check.takeElements();
  lastValue_ = value;
  return SerializedPropertyList(value, &binaryplist::giveFile);
}

OrPropertyListError<std::string> writeBinaryPropertyList(const PropertyValue& value) {
  const auto serialized = BinaryPropertyListSerializer().serialize(value);
  if (!serialized) {
    return serialized.error();
  }
  std::string bytes;
  const bool isWhole = serialized->giveTo([&bytes](std::string_view piece) {
    bytes.append(piece);
    return true;
  });
  if (!isWhole) {
    return PropertyListError{
        "binary property list: cannot write more values than a file of its size may stand for"};
  }
  return bytes;
}

}  // namespace accounts
