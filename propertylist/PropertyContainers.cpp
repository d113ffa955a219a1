#include <algorithm>

#include "propertylist/PropertyValue.h"

namespace accounts {

struct PropertyArray::Node : SharedNodeBase {
  explicit Node(std::vector<PropertyValue> values) : elements(std::move(values)) {}
  std::vector<PropertyValue> elements;
};

struct PropertyDictionary::Node : SharedNodeBase {
  explicit Node(std::vector<PropertyEntry> sortedEntries) : entries(std::move(sortedEntries)) {}
  std::vector<PropertyEntry> entries;
};

PropertyArray::PropertyArray(std::initializer_list<PropertyValue> values)
    : PropertyArray(std::vector<PropertyValue>(values)) {}

PropertyArray::PropertyArray(std::vector<PropertyValue> values)
    : node_(values.empty() ? nullptr : new Node(std::move(values))) {}

PropertyArray::Node* PropertyArray::node() const {
  return static_cast<Node*>(node_.get());
}

void PropertyArray::destroyNode(SharedNodeBase* node) {
  delete static_cast<Node*>(node);
}

std::size_t PropertyArray::size() const {
  return node_ ? node()->elements.size() : 0;
}

const PropertyValue& PropertyArray::at(std::size_t index) const {
  return node()->elements.at(index);
}

const PropertyValue* PropertyArray::begin() const {
  return node_ ? node()->elements.data() : nullptr;
}

const PropertyValue* PropertyArray::end() const {
  return begin() + size();
}

bool PropertyArray::containsText(std::string_view text) const {
  return std::any_of(begin(), end(), [&](const PropertyValue& element) {
    return element.asText() != nullptr && *element.asText() == text;
  });
}

void PropertyArray::append(PropertyValue value) {
  elementsToChange().push_back(std::move(value));
}

void PropertyArray::replace(std::size_t index, PropertyValue value) {
  elementsToChange().at(index) = std::move(value);
}

void PropertyArray::removeText(std::string_view text) {
  if (!containsText(text)) {
    return;
  }
  std::erase_if(elementsToChange(), [&](const PropertyValue& element) {
    return element.asText() != nullptr && *element.asText() == text;
  });
}

std::vector<PropertyValue>& PropertyArray::elementsToChange() {
  if (!node_) {
    node_ = SharedNode<PropertyArray>(new Node({}));
  } else if (!node()->isUnshared()) {
    node_ = SharedNode<PropertyArray>(new Node(node()->elements));
  }
  return node()->elements;
}

bool operator==(const PropertyArray& left, const PropertyArray& right) {
  return left.isSameAs(right) || std::equal(left.begin(), left.end(), right.begin(), right.end());
}

namespace {

bool keyIsBefore(const PropertyEntry& entry, std::string_view key) {
  return entry.key.view() < key;
}

/// Sorts by key; of entries with the same key only the last one is left.
std::vector<PropertyEntry> sortedByKey(std::vector<PropertyEntry> entries) {
  // Files of our own are written in key order: most dictionaries need no sorting.
  if (PropertyDictionary::areOrdered(entries)) {
    return entries;
  }
  std::stable_sort(entries.begin(), entries.end(),
                   [](const PropertyEntry& left, const PropertyEntry& right) {
                     return left.key.view() < right.key.view();
                   });
  std::vector<PropertyEntry> unique;
  unique.reserve(entries.size());
  for (PropertyEntry& entry : entries) {
    if (!unique.empty() && unique.back().key == entry.key) {
      unique.back() = std::move(entry);
    } else {
      unique.push_back(std::move(entry));
    }
  }
  return unique;
}

}  // namespace

PropertyDictionary::PropertyDictionary(std::initializer_list<PropertyEntry> entries)
    : PropertyDictionary(std::vector<PropertyEntry>(entries)) {}

PropertyDictionary::PropertyDictionary(std::vector<PropertyEntry> entries)
    : node_(entries.empty() ? nullptr : new Node(sortedByKey(std::move(entries)))) {}

PropertyDictionary PropertyDictionary::ofOrderedEntries(std::vector<PropertyEntry> entries) {
  PropertyDictionary dictionary;
  if (!entries.empty()) {
    dictionary.node_ = SharedNode<PropertyDictionary>(new Node(std::move(entries)));
  }
  return dictionary;
}

bool PropertyDictionary::areOrdered(const std::vector<PropertyEntry>& entries) {
  return std::adjacent_find(entries.begin(), entries.end(),
                            [](const PropertyEntry& left, const PropertyEntry& right) {
                              return left.key.view() >= right.key.view();
                            }) == entries.end();
}

PropertyDictionary::Node* PropertyDictionary::node() const {
  return static_cast<Node*>(node_.get());
}

void PropertyDictionary::destroyNode(SharedNodeBase* node) {
  delete static_cast<Node*>(node);
}

std::size_t PropertyDictionary::size() const {
  return node_ ? node()->entries.size() : 0;
}

const PropertyEntry* PropertyDictionary::begin() const {
  return node_ ? node()->entries.data() : nullptr;
}

const PropertyEntry* PropertyDictionary::end() const {
  return begin() + size();
}

const PropertyValue* PropertyDictionary::find(std::string_view key) const {
  const PropertyEntry* place = std::lower_bound(begin(), end(), key, keyIsBefore);
  return place != end() && place->key == key ? &place->value : nullptr;
}

std::optional<Text> PropertyDictionary::textForKey(std::string_view key) const {
  const PropertyValue* value = find(key);
  const Text* text = value != nullptr ? value->asText() : nullptr;
  return text != nullptr ? std::optional(*text) : std::nullopt;
}

std::optional<PropertyArray> PropertyDictionary::arrayForKey(std::string_view key) const {
  const PropertyValue* value = find(key);
  const PropertyArray* array = value != nullptr ? value->asArray() : nullptr;
  return array != nullptr ? std::optional(*array) : std::nullopt;
}

std::optional<PropertyDictionary> PropertyDictionary::dictionaryForKey(std::string_view key) const {
  const PropertyValue* value = find(key);
  const PropertyDictionary* dictionary = value != nullptr ? value->asDictionary() : nullptr;
  return dictionary != nullptr ? std::optional(*dictionary) : std::nullopt;
}

void PropertyDictionary::set(Text key, PropertyValue value) {
  std::vector<PropertyEntry>& entries = entriesToChange();
  const auto place = std::lower_bound(entries.begin(), entries.end(), key.view(), keyIsBefore);
  if (place != entries.end() && place->key == key) {
    place->value = std::move(value);
  } else {
    entries.insert(place, PropertyEntry{std::move(key), std::move(value)});
  }
}

void PropertyDictionary::remove(std::string_view key) {
  take(key);
}

std::optional<PropertyValue> PropertyDictionary::take(std::string_view key) {
  if (!contains(key)) {
    return std::nullopt;
  }
  std::vector<PropertyEntry>& entries = entriesToChange();
  const auto place = std::lower_bound(entries.begin(), entries.end(), key, keyIsBefore);
  std::optional<PropertyValue> value(std::move(place->value));
  entries.erase(place);
  return value;
}

std::vector<PropertyEntry>& PropertyDictionary::entriesToChange() {
  if (!node_) {
    node_ = SharedNode<PropertyDictionary>(new Node({}));
  } else if (!node()->isUnshared()) {
    node_ = SharedNode<PropertyDictionary>(new Node(node()->entries));
  }
  return node()->entries;
}

bool operator==(const PropertyDictionary& left, const PropertyDictionary& right) {
  return left.isSameAs(right) ||
         std::equal(left.begin(), left.end(), right.begin(), right.end(),
                    [](const PropertyEntry& leftEntry, const PropertyEntry& rightEntry) {
                      return leftEntry.key == rightEntry.key && leftEntry.value == rightEntry.value;
                    });
}

}  // namespace accounts
