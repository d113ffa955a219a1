#include "propertylist/xml/XMLPropertyListBuilder.h"

#include <algorithm>
#include <iterator>
#include <utility>

#include "propertylist/PropertyListLimits.h"

namespace accounts::xmlplist {

namespace {

struct NamedElement {
  std::string_view name;
  Element element;
};

// The most frequent ones first: a name is looked for from the front.
constexpr NamedElement kElements[] = {
    {"key", Element::Key},     {"string", Element::String},     {"integer", Element::Integer},
    {"true", Element::True},   {"false", Element::False},       {"dict", Element::Dictionary},
    {"array", Element::Array}, {"date", Element::Date},         {"data", Element::Data},
    {"real", Element::Real},   {"plist", Element::PropertyList}};

std::optional<Element> elementNamed(std::string_view name) {
  for (const NamedElement& named : kElements) {
    if (named.name == name) {
      return named.element;
    }
  }
  return std::nullopt;
}

std::string_view nameOf(Element element) {
  return std::find_if(std::begin(kElements), std::end(kElements),
                      [&](const NamedElement& named) { return named.element == element; })
      ->name;
}

/// The value of an element that holds characters but no text, none when they are not in its form.
std::optional<PropertyValue> valueOf(Element element, std::string_view characters) {
  switch (element) {
    case Element::Integer:
      return parseInteger(characters);
    case Element::Real:
      return parseReal(characters);
    case Element::Date:
      return parseDate(characters);
    case Element::Data:
      return parseData(characters);
    case Element::True:
    case Element::False:
      return isBlank(characters) ? std::optional<PropertyValue>(element == Element::True)
                                 : std::nullopt;
    default:
      return std::nullopt;
  }
}

}  // namespace

bool ValueBuilder::fail(std::string_view what) {
  problem_ = what;
  return false;
}

bool ValueBuilder::fail(std::string_view what, Element element) {
  problem_.assign(what).append(" <").append(nameOf(element)).append(">");
  return false;
}

bool ValueBuilder::start(std::string_view elementName) {
  const std::optional<Element> element = elementNamed(elementName);
  if (!element) {
    return fail("an element that property lists do not have");
  }
  if (!checkPlace(*element)) {
    return false;
  }
  switch (*element) {
    case Element::PropertyList:
      isInPropertyList_ = true;
      return true;
    case Element::Dictionary:
    case Element::Array:
      return openContainer(*element);
    default:
      scalar_ = element;
      characters_.clear();
      return true;
  }
}

bool ValueBuilder::checkPlace(Element element) {
  if (scalar_) {
    return fail("an element inside", *scalar_);
  }
  if (element == Element::PropertyList) {
    return !isInPropertyList_ || fail("a <plist> inside another");
  }
  if (!isInPropertyList_) {
    return fail("a document whose outermost element is not <plist> but", element);
  }
  const bool isInDictionary =
      !containers_.empty() && containers_.back().element == Element::Dictionary;
  if (element == Element::Key) {
    if (!isInDictionary) {
      return fail("a <key> outside a dictionary");
    }
    return !hasKeyWithoutValue() || fail("a key without a value");
  }
  if (isInDictionary) {
    return hasKeyWithoutValue() || fail("a value without a key:", element);
  }
  return !containers_.empty() || values_.empty() || fail("a second value in <plist>:", element);
}

bool ValueBuilder::hasKeyWithoutValue() const {
  const Container& dictionary = containers_.back();
  return keys_.size() - dictionary.firstKey != values_.size() - dictionary.firstValue;
}

bool ValueBuilder::openContainer(Element element) {
  if (containers_.size() == kMaximumNestingDepth) {
    return fail("containers nested deeper than the limit");
  }
  containers_.push_back({element, values_.size(), keys_.size()});
  return true;
}

bool ValueBuilder::end() {
  if (scalar_) {
    return endScalar(*std::exchange(scalar_, std::nullopt));
  }
  if (!containers_.empty()) {
    return endContainer();
  }
  return !values_.empty() || fail("a <plist> without a value");
}

bool ValueBuilder::endScalar(Element element) {
  if (element == Element::Key) {
    return addKey();
  }
  const bool holdsBytes = element == Element::String || element == Element::Data;
  std::optional<PropertyValue> value =
      element == Element::String ? Text(characters_) : valueOf(element, characters_);
  if (!value) {
    return fail("a content that does not fit its element", element);
  }
  return addValue(std::move(*value),
                  1 + (holdsBytes ? expandedCountOfBytes(characters_.size()) : 0));
}

bool ValueBuilder::endContainer() {
  const Container container = containers_.back();
  if (container.element == Element::Dictionary && hasKeyWithoutValue()) {
    return fail("a key without a value");
  }
  containers_.pop_back();
  return addValue(container.element == Element::Dictionary
                      ? PropertyValue(takeDictionary(container))
                      : PropertyValue(takeArray(container)),
                  1);
}

PropertyDictionary ValueBuilder::takeDictionary(const Container& container) {
  std::vector<KeyedValue> entries;
  entries.reserve(values_.size() - container.firstValue);
  for (std::size_t index = 0; container.firstValue + index < values_.size(); ++index) {
    entries.push_back({std::move(keys_[container.firstKey + index]),
                       std::move(values_[container.firstValue + index])});
  }
  keys_.resize(container.firstKey);
  dropValuesFrom(container.firstValue);
  return PropertyDictionary(std::move(entries));
}

PropertyArray ValueBuilder::takeArray(const Container& container) {
  const auto first = values_.begin() + static_cast<std::ptrdiff_t>(container.firstValue);
  PropertyArray array(std::vector<PropertyValue>(std::make_move_iterator(first),
                                                 std::make_move_iterator(values_.end())));
  dropValuesFrom(container.firstValue);
  return array;
}

void ValueBuilder::dropValuesFrom(std::size_t first) {
  values_.erase(values_.begin() + static_cast<std::ptrdiff_t>(first), values_.end());
}

bool ValueBuilder::addKey() {
  keys_.push_back(knownKeys_.try_emplace(characters_, characters_).first->second);
  return count(expandedCountOfBytes(characters_.size()));
}

bool ValueBuilder::addValue(PropertyValue value, std::uint64_t expandedCount) {
  values_.push_back(std::move(value));
  return count(expandedCount);
}

bool ValueBuilder::count(std::uint64_t expandedCount) {
  expandedCount_ += expandedCount;
  return expandedCount_ <= maximumExpandedCount_ || fail("more values than the limit");
}

}  // namespace accounts::xmlplist
