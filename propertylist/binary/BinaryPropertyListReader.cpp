#include <algorithm>
#include <deque>
#include <string>
#include <vector>

#include "propertylist/PropertyListLimits.h"
#include "propertylist/binary/BinaryPropertyList.h"
#include "propertylist/binary/BinaryPropertyListFormat.h"
#include "propertylist/binary/BinaryPropertyListScalars.h"
#include "propertylist/value/ContentTable.h"
#include "propertylist/value/KeyList.h"
#include "propertylist/value/KeyedHash.h"
#include "propertylist/value/OrderedValues.h"

namespace accounts {

namespace binaryplist {
namespace {

/// Where the objects of a file lie.
struct Layout {
  /// The file up to its offset table.
  std::string_view objects;
  const char* table = nullptr;
  std::size_t offsetSize = 0;
  std::size_t referenceSize = 0;
  std::size_t objectCount = 0;
  std::uint32_t topObject = 0;
  /// How many values the file may stand for, and how often it may reach a container again.
  std::uint64_t mostValues = 0;
  std::uint64_t mostRepeatedContainers = 0;
};

bool readTrailer(std::string_view bytes, Layout& layout, PropertyListError& error) {
  if (!bytes.starts_with(kHeader)) {
    return failAt(error, "no \"bplist00\"", 0);
  }
  if (bytes.size() < kHeader.size() + kTrailerSize) {
    return failAt(error, "a file too short for its trailer", bytes.size());
  }
  if (bytes.size() > kMaximumFileSize) {
    return failAt(error, "a file larger than the limit", kMaximumFileSize);
  }
  const std::size_t trailerOffset = bytes.size() - kTrailerSize;
  const char* trailer = bytes.data() + trailerOffset;
  layout.offsetSize = static_cast<unsigned char>(trailer[kOffsetSizePosition]);
  layout.referenceSize = static_cast<unsigned char>(trailer[kReferenceSizePosition]);
  const std::uint64_t objectCount = load(trailer + kObjectCountPosition, 8);
  const std::uint64_t topObject = load(trailer + kTopObjectPosition, 8);
  const std::uint64_t table = load(trailer + kTablePosition, 8);
  const auto isSize = [](std::size_t size) { return size >= 1 && size <= 8; };
  if (!isSize(layout.offsetSize) || !isSize(layout.referenceSize)) {
    return failAt(error, "a trailer whose offsets or references are not of 1 to 8 bytes",
                  trailerOffset);
  }
  if (objectCount > kMaximumObjectCount) {
    return failAt(error, "a trailer with more objects than the limit", trailerOffset);
  }
  if (table < kHeader.size() || table > trailerOffset ||
      objectCount * layout.offsetSize > trailerOffset - table) {
    return failAt(error, "a trailer whose offset table lies beyond the file", trailerOffset);
  }
  if (topObject >= objectCount) {
    return failAt(error, "a trailer whose top object does not exist", trailerOffset);
  }
  layout.objects = bytes.substr(0, static_cast<std::size_t>(table));
  layout.table = bytes.data() + table;
  layout.objectCount = static_cast<std::size_t>(objectCount);
  layout.topObject = static_cast<std::uint32_t>(topObject);
  layout.mostValues = maximumExpandedValueCount(bytes.size());
  layout.mostRepeatedContainers = maximumRepeatedContainerCount(bytes.size());
  return true;
}

/// Reads the objects that the top object reaches, each once, with a stack of our own: no input
/// decides how deep the program's stack grows. A value is made in its place, within the first
/// container that refers to it; the others get copies, which share its content.
class Reader {
 public:
  Reader(const Layout& layout, PropertyListError& error)
      : layout_(layout),
        error_(error),
        scalars_(layout.objects, error),
        objects_(layout.objectCount) {}

  std::optional<PropertyValue> read() {
    // The top object's place is an array of one element that is in no file.
    openContainers_.emplace_back();
    openContainers_.back().elements = PropertyArray::withRoomFor(1);
    if (!readChild(openContainers_.back(), layout_.topObject)) {
      return std::nullopt;
    }
    while (readChildren()) {
      if (openContainers_.size() == 1) {
        return openContainers_.front().elements.at(0);
      }
      if (!close()) {
        break;
      }
    }
    return std::nullopt;
  }

 private:
  using Reference = std::uint32_t;
  static_assert(kMaximumObjectCount <= std::size_t{1} << 32);

  enum class State : std::uint8_t { Unread, Open, Text, OtherValue };
  static constexpr int kBitsOfACount = 25;
  static constexpr std::uint64_t kCountMask = (std::uint64_t{1} << kBitsOfACount) - 1;
  static_assert(kMaximumExpandedValueCount + 1 <= kCountMask);
  static constexpr std::uint64_t kHeightMask = (1U << 10) - 1;
  static_assert(kMaximumNestingDepth <= kHeightMask);

  struct Object {
    /// Where the object was made: a `Text` or, of other values, a `PropertyValue`.
    const void* place = nullptr;
    /// How many values, and containers among them, the object stands for.
    std::uint64_t expandedCount : kBitsOfACount = 0;
    std::uint64_t containerCount : kBitsOfACount = 0;
    /// 0 of a scalar, of a container one more than its highest child's.
    std::uint64_t height : 10 = 0;
    State state : 2 = State::Unread;
  };
  static_assert(sizeof(Object) == 16, "there are millions of them");

  /// The keys of all dictionaries that refer to the same objects for them.
  struct DictionaryKeys {
    std::string_view references;
    KeyList list;
    /// What the keys count beyond their values.
    std::uint64_t expandedCount;
  };

  /// A container whose children are being read.
  struct Container {
    /// The values of a dictionary whose keys are in order; other containers have elements. They
    /// have their room from the beginning: what is in them keeps its place.
    OrderedValues values;
    PropertyArray elements;
    bool hasValues = false;
    /// Of a dictionary.
    const DictionaryKeys* keys = nullptr;
    Reference object = 0;
    std::uint32_t height = 1;
    std::size_t offset = 0;
    /// The references to the children that are not read yet.
    const char* nextChild = nullptr;
    const char* endOfChildren = nullptr;
    std::uint64_t expandedCount = 1;
    std::uint64_t containerCount = 1;
  };

  bool fail(std::string_view what, std::size_t offset) { return failAt(error_, what, offset); }

  /// Reads children, of containers that open on the way first, until the innermost open container
  /// has all of its own.
  bool readChildren() {
    for (;;) {
      Container& container = openContainers_.back();
      if (container.nextChild == container.endOfChildren) {
        return true;
      }
      Reference child = 0;
      if (!readReference(container.nextChild, child)) {
        return false;
      }
      container.nextChild += layout_.referenceSize;
      if (!readChild(container, child)) {
        return false;
      }
    }
  }

  bool readReference(const char* place, Reference& reference) {
    const std::uint64_t stored = load(place, layout_.referenceSize);
    if (stored >= layout_.objectCount) {
      return fail("a reference to an object that does not exist",
                  static_cast<std::size_t>(place - layout_.objects.data()));
    }
    reference = static_cast<Reference>(stored);
    return true;
  }

  /// Adds the next child to a container, or opens it if it is a container not read before.
  bool readChild(Container& container, Reference child) {
    Object& object = objects_[child];
    switch (object.state) {
      case State::Text:
        add(container, object, *static_cast<const Text*>(object.place));
        return true;
      case State::OtherValue:
        add(container, object, *static_cast<const PropertyValue*>(object.place));
        return true;
      case State::Open:
        return fail("a container that contains itself", container.offset);
      case State::Unread:
        break;
    }
    ObjectHead head;
    std::size_t offset = 0;
    if (!findObject(child, offset, head)) {
      return false;
    }
    if (head.kind == Kind::Array || head.kind == Kind::Dictionary) {
      return open(child, offset, head);
    }
    std::optional<PropertyValue> scalar = readScalar(object, offset, head);
    if (!scalar) {
      return false;
    }
    notePlace(object, add(container, object, std::move(*scalar)));
    return true;
  }

  /// Adds the next child, made of `source`, to a container and returns it in its place.
  template <class Source>
  static const PropertyValue& add(Container& container, const Object& object, Source&& source) {
    container.expandedCount += object.expandedCount;
    container.containerCount += object.containerCount;
    container.height = std::max(container.height, static_cast<std::uint32_t>(object.height) + 1);
    return container.hasValues ? container.values.append(std::forward<Source>(source))
                               : container.elements.append(std::forward<Source>(source));
  }

  static void notePlace(Object& object, const PropertyValue& place) {
    const Text* const text = place.asText();
    object.state = text != nullptr ? State::Text : State::OtherValue;
    object.place = text != nullptr ? static_cast<const void*>(text) : &place;
  }

  /// The keys of the dictionary at an offset, of which the references are given; null when one is
  /// no text. Most dictionaries have the same as others: only the first of those looks at each key.
  const DictionaryKeys* keysOf(std::string_view references, std::size_t dictionary) {
    const auto newNumber = static_cast<std::uint32_t>(keys_.size());
    const std::uint32_t number = keyTable_.findOrAdd(
        hash_(references), newNumber,
        [&](std::uint32_t candidate) { return keys_[candidate].references == references; });
    if (number != newNumber) {
      return &keys_[number];
    }
    std::vector<Text> keys;
    std::uint64_t expandedCount = 0;
    for (std::size_t place = 0; place < references.size(); place += layout_.referenceSize) {
      Reference key = 0;
      if (!readReference(references.data() + place, key) || !readKey(key, dictionary)) {
        return nullptr;
      }
      keys.push_back(*static_cast<const Text*>(objects_[key].place));
      expandedCount += objects_[key].expandedCount - 1;
    }
    return &keys_.emplace_back(DictionaryKeys{references, KeyList(keys), expandedCount});
  }

  /// Reads a key of the dictionary at an offset, unless it was read before; false when it is no
  /// text.
  bool readKey(Reference key, std::size_t dictionary) {
    constexpr std::string_view kError = "a dictionary with a key that is no text";
    Object& object = objects_[key];
    if (object.state != State::Unread) {
      return object.state == State::Text || fail(kError, dictionary);
    }
    ObjectHead head;
    std::size_t offset = 0;
    if (!findObject(key, offset, head)) {
      return false;
    }
    if (head.kind != Kind::ASCIIText && head.kind != Kind::UTF16Text) {
      return fail(kError, dictionary);
    }
    std::optional<PropertyValue> text = readScalar(object, offset, head);
    if (!text) {
      return false;
    }
    notePlace(object, keyTexts_.emplace_back(*std::move(text)));
    return true;
  }

  /// Reads the head of an object.
  bool findObject(Reference reference, std::size_t& offset, ObjectHead& head) {
    const char* const entry = layout_.table + reference * layout_.offsetSize;
    const std::uint64_t stored = load(entry, layout_.offsetSize);
    if (stored < kHeader.size() || stored >= layout_.objects.size()) {
      return fail("an offset that lies outside the objects",
                  static_cast<std::size_t>(entry - layout_.objects.data()));
    }
    offset = static_cast<std::size_t>(stored);
    return readHead(layout_.objects, offset, head, error_);
  }

  std::optional<PropertyValue> readScalar(Object& object, std::size_t offset,
                                          const ObjectHead& head) {
    std::size_t end = 0;
    std::optional<PropertyValue> value = scalars_.read(offset, head, end);
    if (!value || !countBytes(offset, end)) {
      return std::nullopt;
    }
    // Long enough encodings alone stand for more values than one.
    object.expandedCount =
        std::min(kMaximumExpandedValueCount + 1, 1 + expandedCountOf(*value)) & kCountMask;
    return value;
  }

  static std::uint64_t expandedCountOf(const PropertyValue& scalar) {
    if (const Text* text = scalar.asText()) {
      return expandedCountOfBytes(text->view().size());
    }
    const PropertyData* data = scalar.asData();
    return data != nullptr ? expandedCountOfBytes(data->bytes.view().size()) : 0;
  }

  /// Refuses objects that lie across each other: with them a small file could make the reader
  /// allocate any amount of memory.
  bool countBytes(std::size_t begin, std::size_t end) {
    bytesRead_ += end - begin;
    return bytesRead_ <= layout_.objects.size() - kHeader.size() ||
           fail("an object that overlaps others", begin);
  }

  bool open(Reference reference, std::size_t offset, const ObjectHead& head) {
    const std::size_t depth = openContainers_.size() - 1;
    if (depth == kMaximumNestingDepth) {
      return fail("containers nested deeper than the limit", offset);
    }
    const bool isDictionary = head.kind == Kind::Dictionary;
    const std::size_t referencesPerChild = isDictionary ? 2 : 1;
    const std::size_t room = (layout_.objects.size() - head.content) / layout_.referenceSize;
    if (head.length > room / referencesPerChild) {
      return fail("a container that ends beyond the objects", offset);
    }
    const auto childCount = static_cast<std::size_t>(head.length);
    const std::size_t size = childCount * layout_.referenceSize;
    const std::size_t firstChild = head.content + (isDictionary ? size : 0);
    if (!countBytes(offset, firstChild + size)) {
      return false;
    }
    const DictionaryKeys* keys = nullptr;
    if (isDictionary) {
      keys = keysOf(layout_.objects.substr(head.content, size), offset);
      if (keys == nullptr) {
        return false;
      }
    }
    ++distinctContainers_;
    objects_[reference].state = State::Open;
    Container& container = openContainers_.emplace_back();
    container.hasValues = isDictionary && keys->list.isOrdered();
    if (container.hasValues) {
      container.values = OrderedValues(keys->list.keys());
    } else {
      container.elements = PropertyArray::withRoomFor(childCount);
    }
    container.keys = keys;
    container.object = reference;
    container.offset = offset;
    container.nextChild = layout_.objects.data() + firstChild;
    container.endOfChildren = container.nextChild + size;
    container.expandedCount += isDictionary ? keys->expandedCount : 0;
    return true;
  }

  /// Makes the value of the innermost open container and adds it to the one around.
  bool close() {
    Container closed = std::move(openContainers_.back());
    openContainers_.pop_back();
    if (closed.expandedCount > layout_.mostValues) {
      return fail("a container that stands for more values than a file of this size may",
                  closed.offset);
    }
    if (closed.containerCount > layout_.mostRepeatedContainers + distinctContainers_) {
      return fail("a container that repeats more containers than a file of this size may",
                  closed.offset);
    }
    // A child that was read before, at a lower level, may be too high for this one.
    if (closed.height > kMaximumNestingDepth) {
      return fail("containers nested deeper than the limit", closed.offset);
    }
    Object& object = objects_[closed.object];
    object.expandedCount = closed.expandedCount & kCountMask;
    object.containerCount = closed.containerCount & kCountMask;
    object.height = closed.height & kHeightMask;
    notePlace(object, add(openContainers_.back(), object, valueOf(closed)));
    return true;
  }

  PropertyValue valueOf(Container& container) {
    if (container.hasValues) {
      return PropertyDictionary(container.values.take());
    }
    if (container.keys == nullptr) {
      return PropertyArray(std::move(container.elements));
    }
    // What was made in these elements must keep its place, which sorting would change.
    const PropertyArray& values = unsortedValues_.emplace_back(std::move(container.elements));
    return container.keys->list.dictionaryOf({values.begin(), values.end()});
  }

  const Layout& layout_;
  PropertyListError& error_;
  ScalarReader scalars_;
  std::size_t bytesRead_ = 0;
  std::uint64_t distinctContainers_ = 0;
  std::vector<Object> objects_;
  std::vector<Container> openContainers_;
  std::deque<DictionaryKeys> keys_;
  KeyedHash hash_;
  ContentTable keyTable_;
  /// Texts that were first met as keys.
  std::deque<PropertyValue> keyTexts_;
  std::vector<PropertyArray> unsortedValues_;
};

}  // namespace
}  // namespace binaryplist

bool isBinaryPropertyList(std::string_view bytes) {
  return bytes.starts_with(binaryplist::kSignature);
}

OrPropertyListError<PropertyValue> readBinaryPropertyList(std::string_view bytes) {
  binaryplist::Layout layout;
  PropertyListError error;
  std::optional<PropertyValue> value;
  if (binaryplist::readTrailer(bytes, layout, error)) {
    value = binaryplist::Reader(layout, error).read();
  }
  return value ? OrPropertyListError<PropertyValue>(*std::move(value)) : std::move(error);
}

}  // namespace accounts
