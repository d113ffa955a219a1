#include "accountsettings/ThreeWayMerge.h"

#include <vector>

namespace accounts {

namespace {

/// What memory did to one key since loading. No value means that it removed the key.
struct Change {
  const Text* key;
  const PropertyValue* value;
};

/// The changes that lead from the original to memory, in key order. Both dictionaries must outlive
/// the result.
std::vector<Change> changesSince(const PropertyDictionary& original,
                                 const PropertyDictionary& inMemory) {
  std::vector<Change> changes;
  if (inMemory.isSameAs(original)) {
    return changes;
  }
  auto before = original.begin();
  for (const PropertyEntry& entry : inMemory) {
    for (; before != original.end() && before->key < entry.key; ++before) {
      changes.push_back({&before->key, nullptr});
    }
    const bool wasThere = before != original.end() && before->key == entry.key;
    if (!wasThere || before->value != entry.value) {
      changes.push_back({&entry.key, &entry.value});
    }
    before += wasThere ? 1 : 0;
  }
  for (; before != original.end(); ++before) {
    changes.push_back({&before->key, nullptr});
  }
  return changes;
}

PropertyDictionary applyChanges(const std::vector<Change>& changes,
                                const PropertyDictionary& onDisk) {
  std::vector<KeyedValue> result;
  result.reserve(onDisk.size() + changes.size());
  auto disk = onDisk.begin();
  for (const Change& change : changes) {
    for (; disk != onDisk.end() && disk->key < *change.key; ++disk) {
      result.push_back({disk->key, disk->value});
    }
    if (change.value != nullptr) {
      result.push_back({*change.key, *change.value});
    }
    disk += disk != onDisk.end() && disk->key == *change.key ? 1 : 0;
  }
  for (; disk != onDisk.end(); ++disk) {
    result.push_back({disk->key, disk->value});
  }
  return PropertyDictionary(std::move(result));
}

}  // namespace

PropertyDictionary mergeThreeWays(const PropertyDictionary& inMemory,
                                  const PropertyDictionary& original,
                                  const PropertyDictionary& onDisk) {
  if (original.empty() || onDisk.empty()) {
    return inMemory;
  }
  // Memory's changes of what the disk holds lead to what memory holds. To say so keeps one
  // dictionary for both.
  if (onDisk.isSameAs(original) || onDisk.isSameAs(inMemory)) {
    return inMemory;
  }
  const std::vector<Change> changes = changesSince(original, inMemory);
  return changes.empty() ? onDisk : applyChanges(changes, onDisk);
}

}  // namespace accounts
