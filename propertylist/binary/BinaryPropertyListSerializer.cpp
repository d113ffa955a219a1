#include "propertylist/binary/BinaryPropertyListSerializer.h"

#include <algorithm>
#include <string_view>

#include "propertylist/PropertyListLimits.h"
#include "propertylist/binary/BinaryPropertyList.h"
#include "propertylist/binary/BinaryPropertyListFile.h"
#include "propertylist/value/GeneralisedUTF8.h"

namespace accounts {

namespace {

/// What a part adds to what the limits are for.
struct Extent {
  std::uint64_t expandedCount = 0;
  /// The most bytes that it can take in a file.
  std::uint64_t size = 0;
};

/// A walk over one value.
class Check {
 public:
  explicit Check(PropertyListError& error) : error_(error) {}

  bool passes(const PropertyValue& root) {
    // Each value and each key is at most one object. Whether those of a huge value are few and
    // small enough, because many are equal, is seen when they are put down.
    return passesPart(root, 0) &&
           ((2 * whole_.expandedCount <= kMaximumObjectCount && whole_.size <= kMaximumFileSize) ||
            binaryplist::giveFile(root, [](std::string_view) { return true; }) ||
            fail("more objects or bytes than the limit"));
  }

 private:
  // The most that an object takes beside its content: its head, its place in the table, and, for
  // each time that it is reached, a reference.
  static constexpr std::uint64_t kSizeOfText = 6 + 4 + 4;
  static constexpr std::uint64_t kSizeOfContainer = kSizeOfText;
  static constexpr std::uint64_t kSizeOfNumber = 17 + 4 + 4;
  /// More than header and trailer.
  static constexpr std::uint64_t kSizeOfFrame = 64;

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

  PropertyListError& error_;
  Extent whole_ = {.expandedCount = 0, .size = kSizeOfFrame};
};

}  // namespace

SerializedPropertyList serializeBinaryPropertyList(const PropertyValue& value,
                                                   PropertyListError& error) {
  return Check(error).passes(value) ? SerializedPropertyList(value, &binaryplist::giveFile)
                                    : SerializedPropertyList();
}

std::optional<std::string> writeBinaryPropertyList(const PropertyValue& value,
                                                   PropertyListError& error) {
  const SerializedPropertyList serialized = serializeBinaryPropertyList(value, error);
  return serialized ? std::optional(bytesOf(serialized)) : std::nullopt;
}

}  // namespace accounts
