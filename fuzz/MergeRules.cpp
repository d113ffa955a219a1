#include "fuzz/MergeRules.h"

#include <set>

namespace accounts {

namespace {

using Side = std::optional<PropertyValue>;

Side valueOn(const PlainProperties& side, const std::string& key) {
  const auto place = side.find(key);
  return place != side.end() ? Side(place->second) : std::nullopt;
}

/// One key's value after the merge, by what memory did to it.
Side mergedValue(const Side& inMemory, const Side& original, const Side& onDisk) {
  const bool isNew = inMemory && !original;
  const bool isDeleted = !inMemory && original;
  const bool isChanged = inMemory && original && *inMemory != *original;
  if (isDeleted) {
    return std::nullopt;
  }
  return isNew || isChanged ? inMemory : onDisk;
}

}  // namespace

PlainProperties mergeByTheRules(const PlainProperties& inMemory, const PlainProperties& original,
                                const PlainProperties& onDisk) {
  if (original.empty() || onDisk.empty()) {
    return inMemory;
  }
  std::set<std::string> keys;
  for (const PlainProperties* side : {&inMemory, &original, &onDisk}) {
    for (const auto& [key, value] : *side) {
      keys.insert(key);
    }
  }
  PlainProperties merged;
  for (const std::string& key : keys) {
    const Side value =
        mergedValue(valueOn(inMemory, key), valueOn(original, key), valueOn(onDisk, key));
    if (value) {
      merged.emplace(key, *value);
    }
  }
  return merged;
}

PropertyDictionary dictionaryOf(const PlainProperties& properties) {
  PropertyDictionary dictionary;
  for (const auto& [key, value] : properties) {
    dictionary.set(key, value);
  }
  return dictionary;
}

}  // namespace accounts
