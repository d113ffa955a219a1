#include <algorithm>

#include "propertylist/PropertyValue.h"

namespace accounts {

namespace {

/// The run that a handle holds, to be changed: it is shared with nobody and has room for `more`
/// elements.
template <class Element, class Owner>
SharedRun<Element>& runToChange(SharedNode<Owner>& handle, std::size_t more) {
  using Run = SharedRun<Element>;
  Run* const run = static_cast<Run*>(handle.get());
  const std::size_t size = run != nullptr ? run->size() : 0;
  const bool isOurs = run != nullptr && run->isUnshared();
  if (isOurs && run->capacity() - size >= more) {
    return *run;
  }
  // The rest of the room grows with the size, so that adding many one by one is no quadratic work.
  SharedNode<Owner> changed(Run::make(size + more + (more > 0 ? size / 4 : 0)));
  Run& changedRun = *static_cast<Run*>(changed.get());
  for (std::size_t index = 0; index < size; ++index) {
    Element& element = run->begin()[index];
    changedRun.append(isOurs ? std::move(element) : element);
  }
  handle = std::move(changed);
  return changedRun;
}

/// A handle to a run of these elements; null for none.
template <class Owner, class Element>
SharedNode<Owner> runOf(std::vector<Element> elements) {
  if (elements.empty()) {
    return {};
  }
  SharedNode<Owner> handle(SharedRun<Element>::make(elements.size()));
  for (Element& element : elements) {
    static_cast<SharedRun<Element>*>(handle.get())->append(std::move(element));
  }
  return handle;
}

}  // namespace

PropertyArray::PropertyArray(std::initializer_list<PropertyValue> values)
    : PropertyArray(std::vector<PropertyValue>(values)) {}

PropertyArray::PropertyArray(std::vector<PropertyValue> values)
    : node_(runOf<PropertyArray>(std::move(values))) {}

PropertyArray PropertyArray::withRoomFor(std::size_t count) {
  PropertyArray array;
  if (count > 0) {
    runToChange<PropertyValue>(array.node_, count);
  }
  return array;
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
  return runToChange<PropertyValue>(node_, 1).append(std::move(value));
}

void PropertyArray::replace(std::size_t index, PropertyValue value) {
  runToChange<PropertyValue>(node_, 0).begin()[index] = std::move(value);
}

void PropertyArray::removeText(std::string_view text) {
  if (!containsText(text)) {
    return;
  }
  Run& run = runToChange<PropertyValue>(node_, 0);
  run.truncate(std::remove_if(run.begin(), run.end(), [&](const PropertyValue& element) {
    return element.asText() != nullptr && *element.asText() == text;
  }));
}

bool operator==(const PropertyArray& left, const PropertyArray& right) {
  return left.isSameAs(right) || std::equal(left.begin(), left.end(), right.begin(), right.end());
}

namespace {

bool keyIsBefore(const PropertyEntry& entry, std::string_view key) {
  return entry.key.view() < key;
}

bool areInOrder(const PropertyEntry* begin, const PropertyEntry* end) {
  return std::adjacent_find(begin, end, [](const PropertyEntry& left, const PropertyEntry& right) {
           return left.key.view() >= right.key.view();
         }) == end;
}

/// Sorts by key; of entries with the same key only the last one is left.
std::vector<PropertyEntry> sortedByKey(std::vector<PropertyEntry> entries) {
  // Files of our own are written in key order: most dictionaries need no sorting.
  if (areInOrder(entries.data(), entries.data() + entries.size())) {
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
    : node_(runOf<PropertyDictionary>(sortedByKey(std::move(entries)))) {}

PropertyEntries::PropertyEntries(std::size_t count) {
  if (count > 0) {
    runToChange<PropertyEntry>(entries_.node_, count);
  }
}

const PropertyEntry& PropertyEntries::append(Text key, PropertyValue value) {
  return entries_.run()->append({std::move(key), std::move(value)});
}

bool PropertyEntries::areOrdered() const {
  return areInOrder(begin(), end());
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
  const auto index = std::lower_bound(begin(), end(), key.view(), keyIsBefore) - begin();
  if (index < end() - begin() && begin()[index].key == key) {
    runToChange<PropertyEntry>(node_, 0).begin()[index].value = std::move(value);
  } else {
    Run& run = runToChange<PropertyEntry>(node_, 1);
    run.insert(run.begin() + index, PropertyEntry{std::move(key), std::move(value)});
  }
}

void PropertyDictionary::remove(std::string_view key) {
  take(key);
}

std::optional<PropertyValue> PropertyDictionary::take(std::string_view key) {
  if (!contains(key)) {
    return std::nullopt;
  }
  Run& run = runToChange<PropertyEntry>(node_, 0);
  PropertyEntry* const place = std::lower_bound(run.begin(), run.end(), key, keyIsBefore);
  std::optional<PropertyValue> value(std::move(place->value));
  run.truncate(std::move(place + 1, run.end(), place));
  return value;
}

bool operator==(const PropertyDictionary& left, const PropertyDictionary& right) {
  return left.isSameAs(right) ||
         std::equal(left.begin(), left.end(), right.begin(), right.end(),
                    [](const PropertyEntry& leftEntry, const PropertyEntry& rightEntry) {
                      return leftEntry.key == rightEntry.key && leftEntry.value == rightEntry.value;
                    });
}

}  // namespace accounts
