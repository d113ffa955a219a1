#include <algorithm>
#include <array>
#include <deque>
#include <string>
#include <vector>

#include "propertylist/BinaryPropertyList.h"
#include "propertylist/BinaryPropertyListFormat.h"
#include "propertylist/BinaryPropertyListScalars.h"
#include "propertylist/PropertyListLimits.h"

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
};

bool readTrailer(std::string_view bytes, Layout& layout, PropertyListError& error) {
  if (!bytes.starts_with(kHeader)) {
    return failAt(error, "no \"bplist00\"", 0);
  }
  if (bytes.size() < kHeader.size() + kTrailerSize) {
    return failAt(error, "a file too short for its trailer", bytes.size());
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
    references_.push_back(layout_.topObject);
    openContainers_.emplace_back();
    openContainers_.back().elements = PropertyArray::withRoomFor(1);
    openContainers_.back().childCount = 1;
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

  struct Object {
    /// Where the object was made: a `Text` or, of other values, a `PropertyValue`.
    const void* place = nullptr;
    std::uint32_t expandedCount = 0;
    /// 0 of a scalar, of a container one more than its highest child's.
    std::uint16_t height = 0;
    State state = State::Unread;
  };

  /// A container whose children are being read.
  struct Container {
    /// One of the two, by kind. It has its room from the beginning: what is in it keeps its place.
    PropertyArray elements;
    PropertyEntries entries;
    Kind kind = Kind::Array;
    std::uint16_t height = 1;
    Reference object = 0;
    std::size_t offset = 0;
    /// In `references_`: the keys of a dictionary, then the children.
    std::size_t firstReference = 0;
    std::size_t childCount = 0;
    std::size_t nextChild = 0;
    std::uint64_t expandedCount = 1;
  };

  bool fail(std::string_view what, std::size_t offset) { return failAt(error_, what, offset); }

  /// Reads children, of containers that open on the way first, until the innermost open container
  /// has all of its own.
  bool readChildren() {
    for (;;) {
      Container& container = openContainers_.back();
      if (container.nextChild == container.childCount) {
        return true;
      }
      const std::size_t place = container.firstReference + container.nextChild;
      const bool isDictionary = container.kind == Kind::Dictionary;
      if (isDictionary && !readKey(references_[place], container)) {
        return false;
      }
      const Reference child = references_[isDictionary ? place + container.childCount : place];
      if (!readChild(container, child)) {
        return false;
      }
    }
  }

  /// Adds the next child to a container, or opens it if it is a container not read before.
  bool readChild(Container& container, Reference child) {
    const Object& object = objects_[child];
    switch (object.state) {
      case State::Text:
        add(container, child, *static_cast<const Text*>(object.place));
        return true;
      case State::OtherValue:
        add(container, child, *static_cast<const PropertyValue*>(object.place));
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
    std::optional<PropertyValue> scalar = readScalar(child, offset, head);
    if (!scalar) {
      return false;
    }
    add(container, child, std::move(*scalar));
    return true;
  }

  /// Adds the next child to a container, under its key.
  void add(Container& container, Reference child, PropertyValue value) {
    const PropertyValue* place = nullptr;
    if (container.kind == Kind::Dictionary) {
      const Object& key = objects_[references_[container.firstReference + container.nextChild]];
      container.expandedCount += key.expandedCount - 1;
      place =
          &container.entries.append(*static_cast<const Text*>(key.place), std::move(value)).value;
    } else {
      place = &container.elements.append(std::move(value));
    }
    ++container.nextChild;
    Object& object = objects_[child];
    if (object.place == nullptr) {
      const Text* text = place->asText();
      object.state = text != nullptr ? State::Text : State::OtherValue;
      object.place = text != nullptr ? static_cast<const void*>(text) : place;
    }
    container.expandedCount += object.expandedCount;
    container.height = std::max(container.height, static_cast<std::uint16_t>(object.height + 1));
  }

  /// Reads a dictionary's next key, unless it was read before; false when it is no text.
  bool readKey(Reference key, const Container& dictionary) {
    constexpr std::string_view kError = "a dictionary with a key that is no text";
    const State state = objects_[key].state;
    if (state != State::Unread) {
      return state == State::Text || fail(kError, dictionary.offset);
    }
    ObjectHead head;
    std::size_t offset = 0;
    if (!findObject(key, offset, head)) {
      return false;
    }
    if (head.kind != Kind::ASCIIText && head.kind != Kind::UTF16Text) {
      return fail(kError, dictionary.offset);
    }
    const std::optional<PropertyValue> text = readScalar(key, offset, head);
    if (!text) {
      return false;
    }
    keys_.push_back(*text->asText());
    objects_[key].place = &keys_.back();
    objects_[key].state = State::Text;
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

  std::optional<PropertyValue> readScalar(Reference reference, std::size_t offset,
                                          const ObjectHead& head) {
    std::size_t end = 0;
    std::optional<PropertyValue> value = scalars_.read(offset, head, end);
    if (!value || !countBytes(offset, end)) {
      return std::nullopt;
    }
    // Long enough encodings alone stand for more values than one.
    objects_[reference].expandedCount = static_cast<std::uint32_t>(
        std::min(kMaximumExpandedValueCount + 1, 1 + expandedCountOf(*value)));
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
    const std::size_t firstReference = references_.size();
    const std::size_t referenceCount = childCount * referencesPerChild;
    if (!countBytes(offset, head.content + referenceCount * layout_.referenceSize) ||
        !readReferences(head.content, referenceCount)) {
      return false;
    }
    objects_[reference].state = State::Open;
    Container& container = openContainers_.emplace_back();
    if (isDictionary) {
      container.entries = PropertyEntries(childCount);
    } else {
      container.elements = PropertyArray::withRoomFor(childCount);
    }
    container.kind = head.kind;
    container.object = reference;
    container.offset = offset;
    container.firstReference = firstReference;
    container.childCount = childCount;
    return true;
  }

  bool readReferences(std::size_t begin, std::size_t count) {
    const std::size_t first = references_.size();
    references_.resize(first + count);
    const char* place = layout_.objects.data() + begin;
    for (std::size_t index = 0; index < count; ++index, place += layout_.referenceSize) {
      const std::uint64_t reference = load(place, layout_.referenceSize);
      if (reference >= layout_.objectCount) {
        return fail("a reference to an object that does not exist",
                    begin + index * layout_.referenceSize);
      }
      references_[first + index] = static_cast<Reference>(reference);
    }
    return true;
  }

  /// Makes the value of the innermost open container and adds it to the one around.
  bool close() {
    Container closed = std::move(openContainers_.back());
    openContainers_.pop_back();
    if (closed.expandedCount > kMaximumExpandedValueCount) {
      return fail("a container that stands for more values than the limit", closed.offset);
    }
    // A child that was read before, at a lower level, may be too high for this one.
    if (closed.height > kMaximumNestingDepth) {
      return fail("containers nested deeper than the limit", closed.offset);
    }
    objects_[closed.object].expandedCount = static_cast<std::uint32_t>(closed.expandedCount);
    objects_[closed.object].height = closed.height;
    PropertyValue value = closed.kind == Kind::Dictionary
                              ? PropertyValue(makeDictionary(closed))
                              : PropertyValue(std::move(closed.elements));
    references_.resize(closed.firstReference);
    add(openContainers_.back(), closed.object, std::move(value));
    return true;
  }

  PropertyDictionary makeDictionary(Container& container) {
    if (areOrdered(container)) {
      return container.entries.takeOrdered();
    }
    // What was made in these entries must keep its place, which sorting would change.
    const PropertyEntries& entries = unorderedEntries_.emplace_back(std::move(container.entries));
    return PropertyDictionary(std::vector<PropertyEntry>(entries.begin(), entries.end()));
  }

  /// Whether a dictionary's keys are in order. Most dictionaries have the same keys as others: only
  /// the first of those compares texts.
  bool areOrdered(const Container& container) {
    const auto begin = references_.begin() + static_cast<std::ptrdiff_t>(container.firstReference);
    const auto end = begin + static_cast<std::ptrdiff_t>(container.childCount);
    std::vector<Reference>& known = orderedKeys_[container.childCount % orderedKeys_.size()];
    if (std::equal(begin, end, known.begin(), known.end())) {
      return true;
    }
    if (!container.entries.areOrdered()) {
      return false;
    }
    known.assign(begin, end);
    return true;
  }

  const Layout& layout_;
  PropertyListError& error_;
  ScalarReader scalars_;
  std::size_t bytesRead_ = 0;
  std::vector<Object> objects_;
  std::vector<Container> openContainers_;
  /// Those of the open containers, the innermost one's last.
  std::vector<Reference> references_;
  /// Texts that were first met as keys.
  std::deque<Text> keys_;
  std::vector<PropertyEntries> unorderedEntries_;
  /// The keys of dictionaries that were in order, one for each remainder of their number.
  std::array<std::vector<Reference>, 32> orderedKeys_;
};

}  // namespace
}  // namespace binaryplist

bool isBinaryPropertyList(std::string_view bytes) {
  return bytes.starts_with(binaryplist::kSignature);
}

std::optional<PropertyValue> readBinaryPropertyList(std::string_view bytes,
                                                    PropertyListError& error) {
  binaryplist::Layout layout;
  if (!binaryplist::readTrailer(bytes, layout, error)) {
    return std::nullopt;
  }
  return binaryplist::Reader(layout, error).read();
}

}  // namespace accounts
