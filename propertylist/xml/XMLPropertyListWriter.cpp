#include <algorithm>
#include <string>
#include <string_view>
#include <vector>

#include "propertylist/PropertyListLimits.h"
#include "propertylist/xml/XMLPropertyList.h"
#include "propertylist/xml/XMLPropertyListScalars.h"

namespace accounts {

namespace xmlplist {
namespace {

constexpr std::string_view kHead =
    "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<plist version=\"1.0\">\n";
constexpr std::string_view kTail = "</plist>\n";
constexpr std::string_view kIndentation = "  ";
/// Deeper containers are not indented further: the file's size must not be the product of its depth
/// and its length.
constexpr std::size_t kDeepestIndentation = 16;

/// Writes one value, with a stack of its own for the containers that are open.
class Writer {
 public:
  OrPropertyListError<std::string> write(const PropertyValue& value) {
    output_ = kHead;
    bool isGood = count(1) && put(value);
    while (isGood && !open_.empty()) {
      isGood = putNextChild();
    }
    if (!isGood) {
      return std::move(error_);
    }
    output_ += kTail;
    return std::move(output_);
  }

 private:
  /// A container whose children up to an index are written. One of the two is null.
  struct Container {
    const PropertyDictionary* dictionary;
    const PropertyArray* array;
    std::size_t next = 0;

    [[nodiscard]] std::size_t size() const {
      return dictionary != nullptr ? dictionary->size() : array->size();
    }
    [[nodiscard]] std::string_view element() const {
      return dictionary != nullptr ? "dict" : "array";
    }
  };

  bool putNextChild() {
    Container& container = open_.back();
    if (container.next == container.size()) {
      const std::string_view element = container.element();
      open_.pop_back();
      indent();
      putTag("</", element, ">\n");
      return true;
    }
    const std::size_t index = container.next++;
    if (container.array != nullptr) {
      return put(container.array->at(index));
    }
    const PropertyDictionary& dictionary = *container.dictionary;
    return putCharacters("key", dictionary.keys().begin()[index]) &&
           put(dictionary.values()[index]);
  }

  bool put(const PropertyValue& value) {
    switch (value.kind()) {
      case PropertyKind::Dictionary:
        return begin({value.asDictionary(), nullptr});
      case PropertyKind::Array:
        return begin({nullptr, value.asArray()});
      case PropertyKind::String:
        return putCharacters("string", *value.asText());
      case PropertyKind::Data:
        return count(expandedCountOfBytes(value.asData()->bytes.view().size())) &&
               putScalar("data", dataText(value.asData()->bytes.view()));
      case PropertyKind::Integer:
        return putScalar("integer", integerText(value));
      case PropertyKind::Real:
        return putScalar("real", realText(*value.asReal()),
                         "a NaN with bits that XML does not keep");
      case PropertyKind::Date:
        return putScalar("date", dateText(*value.asDate()),
                         "a date that is not a whole second of the years 0 to 9999");
      case PropertyKind::Boolean:
        indent();
        putTag("<", *value.asBoolean() ? "true" : "false", "/>\n");
        return true;
    }
    return false;
  }

  bool begin(Container container) {
    if (open_.size() == kMaximumNestingDepth) {
      return fail("containers nested deeper than the limit");
    }
    // All children at once, so that a list that is too long is refused before it is written.
    if (!count(container.size())) {
      return false;
    }
    indent();
    if (container.size() == 0) {
      putTag("<", container.element(), "/>\n");
      return true;
    }
    putTag("<", container.element(), ">\n");
    open_.push_back(container);
    return true;
  }

  bool putScalar(std::string_view element, const std::optional<std::string>& content,
                 std::string_view whatItCannotBe = {}) {
    if (!content) {
      return fail(whatItCannotBe);
    }
    indent();
    putTag("<", element, ">");
    output_ += *content;
    putTag("</", element, ">\n");
    return true;
  }

  bool putCharacters(std::string_view element, std::string_view text) {
    if (!count(expandedCountOfBytes(text.size()))) {
      return false;
    }
    indent();
    putTag("<", element, ">");
    if (!appendCharacters(output_, text)) {
      return fail("a text with a character that XML cannot hold");
    }
    putTag("</", element, ">\n");
    return true;
  }

  void indent() {
    const std::size_t levels = std::min(open_.size(), kDeepestIndentation);
    for (std::size_t level = 0; level < levels; ++level) {
      output_ += kIndentation;
    }
  }

  void putTag(std::string_view opening, std::string_view element, std::string_view closing) {
    output_.append(opening).append(element).append(closing);
  }

  bool count(std::uint64_t expandedCount) {
    expandedCount_ += expandedCount;
    return expandedCount_ <= kMaximumExpandedValueCount || fail("more values than the limit");
  }

  bool fail(std::string_view what) {
    error_.text = "XML property list: cannot write ";
    error_.text.append(what).append(" at ").append(place());
    return false;
  }

  /// The keys and indexes that lead to the value that is being written.
  [[nodiscard]] std::string place() const {
    std::string path;
    for (const Container& container : open_) {
      path += '/';
      const std::size_t index = container.next - 1;
      if (container.dictionary != nullptr) {
        path += container.dictionary->keys().begin()[index].view();
      } else {
        path += std::to_string(index);
      }
    }
    return path.empty() ? "/" : path;
  }

  PropertyListError error_;
  std::string output_;
  std::vector<Container> open_;
  std::uint64_t expandedCount_ = 0;
};

}  // namespace
}  // namespace xmlplist

OrPropertyListError<std::string> writeXMLPropertyList(const PropertyValue& value) {
  return xmlplist::Writer().write(value);
}

}  // namespace accounts
