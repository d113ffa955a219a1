#include <algorithm>

#include "propertylist/value/OrderedValues.h"
#include "propertylist/value/PropertyValue.h"

namespace accounts {

namespace {

/// The run that a handle holds, to be changed: it is shared with nobody and has room for `more`
/// elements.
template <class Run, class Owner>
Run& runToChange(SharedNode<Owner>& handle, std::size_t more) {
  Run* const run = static_cast<Run*>(handle.get());
  const std::size_t size = run != nullptr ? run->size() : 0;
  const bool isOurs = run != nullptr && run->isUnshared();
  if (isOurs && run->capacity() - size >= more) {
    return *run;
  }
  // The rest of the room grows with the size, so that adding many one by one is no quadratic work.
  // A copy of what is shared has none: as a rule it is changed once.
  SharedNode<Owner> changed(Run::make(size + more + (isOurs ? size / 4 : 0)));
  Run& changedRun = *static_cast<Run*>(changed.get());
  for (std::size_t index = 0; index < size; ++index) {
    PropertyValue& element = run->begin()[index];
    changedRun.append(isOurs ? std::move(element) : element);
  }
  if constexpr (requires { run->keys; }) {
    changedRun.keys = run != nullptr ? run->keys : PropertyKeys();
  }
  handle = std::move(changed);
  return changedRun;
}

}  // namespace

PropertyArray::PropertyArray(std::initializer_list<PropertyValue> values)
    : PropertyArray(std::vector<PropertyValue>(values)) {}

PropertyArray::PropertyArray(std::vector<PropertyValue> values)
    : PropertyArray(withRoomFor(values.size())) {
  for (PropertyValue& value : values) {
    run()->append(std::move(value));
  }
}

PropertyArray PropertyArray::withRoomFor(std::size_t count) {
  PropertyArray array;
  if (count > 0) {
    array.node_ = SharedNode<PropertyArray>(Run::make(count));
  }
  return array;
}

void PropertyArray::destroyNode(SharedNodeBase* node) {
  Run::destroy(node);
}

const PropertyValue* PropertyArray::begin() const {
  return node_ ? run()->begin() : nullptr;
}

const PropertyValue* PropertyArray::end() const {
  return node_ ? run()->end() : nullptr;
}

const PropertyValue& PropertyArray::at(std::size_t index) const {
  return begin()[index];
}

bool PropertyArray::containsText(std::string_view text) const {
  return std::any_of(begin(), end(), [&](const PropertyValue& element) {
    return element.asText() != nullptr && *element.asText() == text;
  });
}

const PropertyValue& PropertyArray::append(PropertyValue value) {
  return runToChange<Run>(node_, 1).append(std::move(value));
}

void PropertyArray::replace(std::size_t index, PropertyValue value) {
  runToChange<Run>(node_, 0).begin()[index] = std::move(value);
}

void PropertyArray::removeText(std::string_view text) {
  if (!containsText(text)) {
    return;
  }
  Run& run = runToChange<Run>(node_, 0);
  run.truncate(std::remove_if(run.begin(), run.end(), [&](const PropertyValue& element) {
    return element.asText() != nullptr && *element.asText() == text;
  }));
}

bool operator==(const PropertyArray& left, const PropertyArray& right) {
  return left.isSameAs(right) || std::equal(left.begin(), left.end(), right.begin(), right.end());
}

namespace {

bool keyIsBefore(const KeyedValue& left, const KeyedValue& right) {
  return left.key.view() < right.key.view();
}

/// Sorts by key; of values with the same key only the last one is left.
std::vector<KeyedValue> sortedByKey(std::vector<KeyedValue> values) {
  std::stable_sort(values.begin(), values.end(), keyIsBefore);
  std::vector<KeyedValue> unique;
  unique.reserve(values.size());
  for (KeyedValue& value : values) {
    if (!unique.empty() && unique.back().key == value.key) {
      unique.back() = std::move(value);
    } else {
      unique.push_back(std::move(value));
    }
  }
  return unique;
}

bool areInOrder(const std::vector<KeyedValue>& values) {
  return std::adjacent_find(values.begin(), values.end(),
                            [](const KeyedValue& left, const KeyedValue& right) {
                              return !keyIsBefore(left, right);
                            }) == values.end();
}

}  // namespace

/// A dictionary with room for the values, and none of them.
PropertyDictionary::PropertyDictionary(PropertyKeys keys, std::size_t room)
    : node_(room > 0 ? Run::make(room) : nullptr) {
  if (node_) {
    run()->keys = std::move(keys);
  }
}

PropertyDictionary::PropertyDictionary(std::initializer_list<KeyedValue> values)
    : PropertyDictionary(std::vector<KeyedValue>(values)) {}

PropertyDictionary::PropertyDictionary(std::vector<KeyedValue> values) {
  if (!areInOrder(values)) {
    values = sortedByKey(std::move(values));
  }
  std::vector<Text> keys;
  keys.reserve(values.size());
  for (KeyedValue& value : values) {
    keys.push_back(std::move(value.key));
  }
  *this = PropertyDictionary(PropertyKeys(keys), keys.size());
  for (KeyedValue& value : values) {
    run()->append(std::move(value.value));
  }
}

OrderedValues::OrderedValues(PropertyKeys keys) {
  const std::size_t count = keys.size();
  values_ = PropertyDictionary(std::move(keys), count);
}

const PropertyValue* PropertyDictionary::find(std::string_view key) const {
  if (!node_) {
    return nullptr;
  }
  const PropertyKeys::Place place = run()->keys.find(key);
  return place.isThere ? run()->begin() + place.index : nullptr;
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

void PropertyDictionary::set(std::string_view key, PropertyValue value) {
  const auto [index, isThere] = keys().find(key);
  Run& run = runToChange<Run>(node_, isThere ? 0 : 1);
  if (isThere) {
    run.begin()[index] = std::move(value);
  } else {
    run.keys = run.keys.with(key, index);
    run.insert(run.begin() + index, std::move(value));
  }
}

void PropertyDictionary::remove(std::string_view key) {
  take(key);
}

std::optional<PropertyValue> PropertyDictionary::take(std::string_view key) {
  const auto [index, isThere] = keys().find(key);
  if (!isThere) {
    return std::nullopt;
  }
  Run& run = runToChange<Run>(node_, 0);
  run.keys = run.keys.without(index);
  PropertyValue* const place = run.begin() + index;
  std::optional<PropertyValue> value(std::move(*place));
  run.truncate(std::move(place + 1, run.end(), place));
  return value;
}

void PropertyDictionary::destroyNode(SharedNodeBase* node) {
  Run::destroy(node);
}

const PropertyKeys& PropertyDictionary::keys() const {
  static const PropertyKeys kNone;
  return node_ ? run()->keys : kNone;
}

std::span<const PropertyValue> PropertyDictionary::values() const {
  return node_ ? std::span<const PropertyValue>(run()->begin(), run()->size())
               : std::span<const PropertyValue>();
}

bool operator==(const PropertyDictionary& left, const PropertyDictionary& right) {
  return left.isSameAs(right) ||
         (left.keys() == right.keys() && std::ranges::equal(left.values(), right.values()));
}

}  // namespace accounts
