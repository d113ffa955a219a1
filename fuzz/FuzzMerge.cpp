#include <cstddef>
#include <string>
#include <vector>

#include "accountsettings/ThreeWayMerge.h"
#include "fuzz/AnyValue.h"
#include "fuzz/FuzzInput.h"
#include "fuzz/FuzzTarget.h"
#include "fuzz/MergeRules.h"

namespace accounts {

namespace {

constexpr std::size_t kKeyCount = 12;
constexpr std::size_t kValueCount = 5;

/// Three sides over few keys and few values, so that all agreements between them are frequent.
struct Sides {
  PlainProperties inMemory, original, onDisk;
};

void choose(FuzzInput& input, const std::string& key, const std::vector<PropertyValue>& values,
            PlainProperties& side) {
  const std::size_t choice = input.below(values.size() + 1);
  if (choice > 0) {
    side.emplace(key, values[choice - 1]);
  }
}

Sides sidesFrom(FuzzInput& input) {
  std::vector<PropertyValue> values;
  while (values.size() < kValueCount) {
    values.push_back(anyValue(input));
  }
  Sides sides;
  for (std::size_t index = 0; index < kKeyCount; ++index) {
    // Keys that begin alike and keys that do not, the empty one included.
    const std::string key(index / 2, index % 2 == 0 ? 'k' : 'm');
    for (PlainProperties* side : {&sides.original, &sides.inMemory, &sides.onDisk}) {
      choose(input, key, values, *side);
    }
  }
  return sides;
}

}  // namespace

/// The three-way merge does what its rules say, key by key.
void runOneInput(std::string_view bytes) {
  FuzzInput input(bytes);
  const bool memoryIsTheOriginal = input.flag();
  Sides sides = sidesFrom(input);
  const PropertyDictionary original = dictionaryOf(sides.original);
  if (memoryIsTheOriginal) {
    sides.inMemory = sides.original;
  }
  // A record that nobody changed shares its dictionary with its snapshot.
  const PropertyDictionary inMemory = memoryIsTheOriginal ? original : dictionaryOf(sides.inMemory);
  const PropertyDictionary onDisk = dictionaryOf(sides.onDisk);

  const PropertyDictionary merged = mergeThreeWays(inMemory, original, onDisk);

  requireEqual(merged, dictionaryOf(mergeByTheRules(sides.inMemory, sides.original, sides.onDisk)),
               "the merge is what its rules say");
  requireEqual(inMemory, dictionaryOf(sides.inMemory), "memory's side is left as it was");
  requireEqual(original, dictionaryOf(sides.original), "the original is left as it was");
  requireEqual(onDisk, dictionaryOf(sides.onDisk), "the disk's side is left as it was");
}

}  // namespace accounts
