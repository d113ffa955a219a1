#include "propertylist/value/KeyList.h"

#include <algorithm>
#include <numeric>

#include "propertylist/value/OrderedValues.h"

namespace accounts {

KeyList::KeyList(std::span<const Text> keys) {
  const auto isOutOfOrder = [](const Text& left, const Text& right) { return left >= right; };
  if (std::adjacent_find(keys.begin(), keys.end(), isOutOfOrder) == keys.end()) {
    keys_ = PropertyKeys(keys);
    return;
  }
  std::vector<std::uint32_t> sorted(keys.size());
  std::iota(sorted.begin(), sorted.end(), 0U);
  std::stable_sort(sorted.begin(), sorted.end(), [&](std::uint32_t left, std::uint32_t right) {
    return keys[left] < keys[right];
  });
  std::vector<Text> ordered;
  for (const std::uint32_t source : sorted) {
    if (!ordered.empty() && ordered.back() == keys[source]) {
      sources_.back() = source;
    } else {
      ordered.push_back(keys[source]);
      sources_.push_back(source);
    }
  }
  keys_ = PropertyKeys(ordered);
}

PropertyDictionary KeyList::dictionaryOf(std::span<const PropertyValue> values) const {
  OrderedValues ordered(keys_);
  for (const std::uint32_t source : sources_) {
    ordered.append(values[source]);
  }
  return ordered.take();
}

}  // namespace accounts
