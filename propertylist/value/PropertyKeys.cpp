#include "propertylist/value/PropertyKeys.h"

#include <algorithm>
#include <bit>
#include <cstring>
#include <memory>
#include <new>
#include <vector>

namespace accounts {

namespace {

// Changes are remembered for the sake of thousands of dictionaries that all change in the same way.
// Keys that change in many ways, or one after the other without end, are not remembered.
constexpr std::uint32_t kMostChanges = 16;
constexpr std::uint32_t kMostChangesInARow = 64;

template <class Word>
std::uint64_t wordAt(const char* place) {
  Word word;
  std::memcpy(&word, place, sizeof word);
  return word;
}

/// The first eight bytes as a number, so that numbers are in the order of the texts as far as they
/// tell.
std::uint64_t prefixOf(std::string_view text) {
  static_assert(std::endian::native == std::endian::little);
  const char* const bytes = text.data();
  const std::size_t size = text.size();
  std::uint64_t prefix = 0;
  if (size >= 8) {
    prefix = wordAt<std::uint64_t>(bytes);
  } else if (size >= 4) {
    // The two words may overlap: what they share is the same.
    prefix = wordAt<std::uint32_t>(bytes) | wordAt<std::uint32_t>(bytes + size - 4)
                                                << 8 * (size - 4);
  } else {
    for (std::size_t index = 0; index < size; ++index) {
      prefix |= wordAt<std::uint8_t>(bytes + index) << 8 * index;
    }
  }
  return __builtin_bswap64(prefix);
}

/// The first of ordered numbers that is not below another one. Each of its steps is the same
/// whichever half it goes to, so that the processor has nothing to guess.
const std::uint64_t* lowerBound(const std::uint64_t* first, std::size_t count,
                                std::uint64_t sought) {
  for (; count > 1; count -= count / 2) {
    const std::size_t half = count / 2;
    first += first[half - 1] < sought ? half : 0;
  }
  return first + (*first < sought ? 1 : 0);
}

}  // namespace

/// A way from keys to others that was taken before.
struct PropertyKeys::Change {
  std::size_t index;
  PropertyKeys result;
  const Change* next;
};

PropertyKeys::Node* PropertyKeys::makeNode(std::span<const Text> ordered,
                                           std::uint32_t changesBefore) {
  static_assert(sizeof(Node) % alignof(std::uint64_t) == 0);
  void* const memory =
      ::operator new(sizeof(Node) + ordered.size() * (sizeof(std::uint64_t) + sizeof(Text)));
  Node* const node = new (memory) Node(static_cast<std::uint32_t>(ordered.size()), changesBefore);
  std::transform(ordered.begin(), ordered.end(), node->prefixes(), prefixOf);
  std::uninitialized_copy(ordered.begin(), ordered.end(), node->keys());
  return node;
}

void PropertyKeys::destroyNode(SharedNodeBase* base) {
  Node* const node = static_cast<Node*>(base);
  for (const Change* change = node->changes.load(std::memory_order_relaxed); change != nullptr;) {
    delete std::exchange(change, change->next);
  }
  std::destroy_n(node->keys(), node->count);
  node->~Node();
  ::operator delete(node);
}

PropertyKeys::PropertyKeys(std::span<const Text> ordered) {
  if (!ordered.empty()) {
    node_ = SharedNode<PropertyKeys>(makeNode(ordered, 0));
  }
}

PropertyKeys::Place PropertyKeys::find(std::string_view key) const {
  if (!node_) {
    return {0, false};
  }
  const std::uint64_t* const prefixes = node()->prefixes();
  const std::uint64_t* const end = prefixes + node()->count;
  const std::uint64_t prefix = prefixOf(key);
  const std::uint64_t* const first = lowerBound(prefixes, node()->count, prefix);
  auto index = static_cast<std::size_t>(first - prefixes);
  if (first == end || *first != prefix) {
    return {index, false};
  }
  const Text* place = begin() + index;
  if (*place == key) {
    return {index, true};
  }
  if (place->view() < key) {
    const auto count = std::upper_bound(first, end, prefix) - first;
    place = std::lower_bound(
        place, place + count, key,
        [](const Text& text, std::string_view other) { return text.view() < other; });
    index = static_cast<std::size_t>(place - begin());
  }
  return {index, index < size() && *place == key};
}

/// What a change at an index led to before, null if it is not known. A key is added if the size
/// grows, and else the one at the index is removed.
const PropertyKeys* PropertyKeys::knownChange(std::string_view key, std::size_t index,
                                              std::size_t newSize) const {
  const Change* change = node_ ? node()->changes.load(std::memory_order_acquire) : nullptr;
  for (; change != nullptr; change = change->next) {
    const PropertyKeys& result = change->result;
    if (change->index == index && result.size() == newSize &&
        (newSize < size() || result.begin()[index] == key)) {
      return &result;
    }
  }
  return nullptr;
}

/// New keys, remembered as what the change at an index leads to if there may be another dictionary
/// to change in the same way.
PropertyKeys PropertyKeys::changed(std::span<const Text> ordered, std::size_t index) const {
  if (ordered.empty() || !node_ || node()->isUnshared() ||
      node()->changesInARow == kMostChangesInARow) {
    return PropertyKeys(ordered);
  }
  PropertyKeys result;
  result.node_ = SharedNode<PropertyKeys>(makeNode(ordered, node()->changesInARow + 1));
  const Change* newest = node()->changes.load(std::memory_order_acquire);
  std::uint32_t count = 0;
  for (const Change* change = newest; change != nullptr; change = change->next) {
    ++count;
  }
  if (count < kMostChanges) {
    auto change = std::make_unique<Change>(Change{index, result, newest});
    // If another thread was quicker, its change is remembered and this one is not.
    if (node()->changes.compare_exchange_strong(newest, change.get(), std::memory_order_acq_rel)) {
      (void)change.release();
    }
  }
  return result;
}

PropertyKeys PropertyKeys::with(std::string_view key, std::size_t index) const {
  if (const PropertyKeys* known = knownChange(key, index, size() + 1)) {
    return *known;
  }
  std::vector<Text> keys(begin(), end());
  keys.insert(keys.begin() + static_cast<std::ptrdiff_t>(index), Text(key));
  return changed(keys, index);
}

PropertyKeys PropertyKeys::without(std::size_t index) const {
  if (const PropertyKeys* known = knownChange({}, index, size() - 1)) {
    return *known;
  }
  std::vector<Text> keys(begin(), end());
  keys.erase(keys.begin() + static_cast<std::ptrdiff_t>(index));
  return changed(keys, index);
}

bool operator==(const PropertyKeys& left, const PropertyKeys& right) {
  return left.isSameAs(right) || std::equal(left.begin(), left.end(), right.begin(), right.end());
}

}  // namespace accounts
