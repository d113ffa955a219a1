#pragma once

#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "propertylist/PropertyListLimits.h"
#include "propertylist/value/PropertyValue.h"
#include "propertylist/xml/XMLPropertyListScalars.h"

namespace accounts::xmlplist {

/// The elements of an XML property list.
enum class Element : std::uint8_t {
  PropertyList,
  Dictionary,
  Array,
  Key,
  String,
  Integer,
  Real,
  True,
  False,
  Date,
  Data
};

/// Builds a value from the events of an XML document in their order. The document must be
/// well-formed: the builder checks that it is a property list. Every operation is false, with
/// `problem()` saying why, when it is none; the builder is then of no more use.
class ValueBuilder {
 public:
  /// The value may stand for so many values, see kMaximumExpandedValueCount.
  explicit ValueBuilder(std::uint64_t maximumExpandedCount = kMaximumExpandedValueCount)
      : maximumExpandedCount_(maximumExpandedCount) {}

  [[nodiscard]] bool start(std::string_view elementName);
  [[nodiscard]] bool addCharacters(std::string_view characters) {
    if (scalar_) {
      characters_.append(characters);
      return true;
    }
    return isBlank(characters) || fail("text outside the elements that hold text");
  }
  [[nodiscard]] bool end();

  /// What is wrong, without a place.
  [[nodiscard]] const std::string& problem() const { return problem_; }

  /// The value, once the document has ended.
  [[nodiscard]] PropertyValue take() { return std::move(values_.front()); }

 private:
  /// A container that is open; its children are the last ones of `values_` and `keys_`.
  struct Container {
    Element element;
    std::size_t firstValue;
    std::size_t firstKey;
  };

  bool fail(std::string_view what);
  bool fail(std::string_view what, Element element);
  bool checkPlace(Element element);
  bool openContainer(Element element);
  [[nodiscard]] bool hasKeyWithoutValue() const;
  bool endScalar(Element element);
  bool endContainer();
  PropertyDictionary takeDictionary(const Container& container);
  PropertyArray takeArray(const Container& container);
  void dropValuesFrom(std::size_t first);
  bool addKey();
  bool addValue(PropertyValue value, std::uint64_t expandedCount);
  bool count(std::uint64_t expandedCount);

  std::vector<Container> containers_;
  std::vector<PropertyValue> values_;
  std::vector<Text> keys_;
  /// Those met so far: records repeat the same few.
  std::map<std::string, Text> knownKeys_;
  /// The element that is open and holds characters, with what it holds so far.
  std::optional<Element> scalar_;
  std::string characters_;
  bool isInPropertyList_ = false;
  std::uint64_t maximumExpandedCount_;
  std::uint64_t expandedCount_ = 0;
  std::string problem_;
};

}  // namespace accounts::xmlplist
