#include "propertylist/BinaryPropertyListCatalogue.h"

#include <algorithm>
#include <array>
#include <numeric>
#include <optional>

#include "propertylist/PropertyListLimits.h"

namespace accounts::binaryplist {

static_assert(kMaximumObjectCount < Catalogue::kContainerBit);

namespace {

std::string_view asBytes(std::span<const Catalogue::Reference> references) {
  return {reinterpret_cast<const char*>(references.data()), references.size_bytes()};
}

}  // namespace

std::optional<Catalogue::Reference> Catalogue::add(const PropertyValue& value,
                                                   PropertyListError& error) {
  error_ = &error;
  ++walk_;
  pending_.clear();
  Size size;
  return visit(value, announce(value), 0, size) ? std::optional(pending_.back()) : std::nullopt;
}

bool Catalogue::fail(std::string_view what) const {
  error_->text = "binary property list: cannot write ";
  error_->text.append(what);
  return false;
}

/// Appends the references of values or texts to the pending ones and adds them to their parent's
/// size.
template <class Element>
bool Catalogue::visitAll(std::span<const Element> elements, std::size_t depth, Size& parent) {
  // Memory is asked for a handful of elements at once, which saves a seventh of the time for a
  // large file: its answers come while others are waited for.
  std::array<ScalarCatalogue::Announced, 16> announced;
  while (!elements.empty()) {
    const std::size_t count = std::min(announced.size(), elements.size());
    for (std::size_t index = 0; index < count; ++index) {
      announced[index] = announce(elements[index]);
    }
    for (std::size_t index = 0; index < count; ++index) {
      if (!visit(elements[index], announced[index], depth, parent)) {
        return false;
      }
    }
    elements = elements.subspan(count);
  }
  return true;
}

ScalarCatalogue::Announced Catalogue::announce(const PropertyValue& value) const {
  if (const PropertyDictionary* dictionary = value.asDictionary()) {
    __builtin_prefetch(dictionary->sharedNode());
    return {};
  }
  if (const PropertyArray* array = value.asArray()) {
    __builtin_prefetch(array->sharedNode());
    return {};
  }
  return scalars_.announce(value);
}

ScalarCatalogue::Announced Catalogue::announce(const Text& key) const {
  return scalars_.announce(key);
}

/// `depth` is the number of containers around the value; it bounds the recursion.
bool Catalogue::visit(const PropertyValue& value, ScalarCatalogue::Announced announced,
                      std::size_t depth, Size& parent) {
  if (const PropertyDictionary* dictionary = value.asDictionary()) {
    return visitContainer(dictionary->sharedNode(), &dictionary->keys(), dictionary->values(),
                          depth, parent);
  }
  if (const PropertyArray* array = value.asArray()) {
    return visitContainer(array->sharedNode(), nullptr, {array->begin(), array->end()}, depth,
                          parent);
  }
  ++parent.expandedCount;
  std::string_view problem;
  return addScalarToParent(scalars_.findOrAdd(value, announced, problem), problem, parent);
}

/// A key counts its bytes alone.
bool Catalogue::visit(const Text& key, ScalarCatalogue::Announced announced, std::size_t /*depth*/,
                      Size& parent) {
  std::string_view problem;
  return addScalarToParent(scalars_.findOrAdd(key, announced, problem), problem, parent);
}

bool Catalogue::addScalarToParent(Reference number, std::string_view problem, Size& parent) {
  if (number == ContentTable::kNone) {
    return fail(problem);
  }
  pending_.push_back(number);
  parent.expandedCount += expandedCountOfBytes(scalars_[number].byteCount());
  return checkObjectCount();
}

/// `keys` are those of a dictionary, null for an array; `node` is null for an empty container.
bool Catalogue::visitContainer(const SharedNodeBase* node, const PropertyKeys* keys,
                               std::span<const PropertyValue> children, std::size_t depth,
                               Size& parent) {
  if (depth == kMaximumNestingDepth) {
    return fail("containers nested deeper than the limit");
  }
  if (isKnownContainer(node)) {
    containers_[node->note()].walk = walk_;
    return addToParent(node->note(), depth, parent);
  }
  Size size;
  std::uint32_t keysNumber = CatalogueContainer::kArray;
  if (keys != nullptr) {
    if (!findOrAddKeys(*keys, keysNumber)) {
      return false;
    }
    size.expandedCount += keys_[keysNumber].expandedCount;
  }
  const Pending pending = {.firstChild = pending_.size(), .firstNewScalar = scalars_.size()};
  Reference number = 0;
  if (!visitAll(children, depth + 1, size) ||
      !findOrAddContainer(keysNumber, pending, size, number)) {
    return false;
  }
  if (node != nullptr) {
    containers_[number].walk = walk_;
    containers_[number].node = node;
    node->setNote(number);
  }
  return addToParent(number, depth, parent);
}

bool Catalogue::isKnownContainer(const SharedNodeBase* node) const {
  if (node == nullptr || node->note() >= containers_.size()) {
    return false;
  }
  const CatalogueContainer& container = containers_[node->note()];
  return container.node == node && walk_ - container.walk <= 1;
}

bool Catalogue::findOrAddKeys(const PropertyKeys& keys, std::uint32_t& number) {
  const SharedNodeBase* const node = keys.sharedNode();
  if (node != nullptr && node->note() < sharedKeys_.size() &&
      sharedKeys_[node->note()].first.isSameAs(keys)) {
    number = sharedKeys_[node->note()].second;
    return true;
  }
  const std::size_t firstPending = pending_.size();
  Size size{.expandedCount = 0};
  if (!visitAll(std::span<const Text>(keys.begin(), keys.end()), 0, size)) {
    return false;
  }
  if (size.expandedCount > kMaximumExpandedValueCount) {
    return fail("a container that stands for more values than the limit");
  }
  const std::span<const Reference> content = std::span(pending_).subspan(firstPending);
  const auto newNumber = static_cast<std::uint32_t>(keys_.size());
  number = keysTable_.findOrAdd(hash_(asBytes(content)), newNumber, [&](std::uint32_t candidate) {
    return asBytes(referencesOf(keys_[candidate])) == asBytes(content);
  });
  if (number == newNumber) {
    CatalogueKeys fresh = {.count = static_cast<std::uint32_t>(content.size()),
                           .expandedCount = static_cast<std::uint32_t>(size.expandedCount)};
    if (!keepReferences(content, fresh.firstReference)) {
      return false;
    }
    keys_.push_back(fresh);
  }
  pending_.resize(firstPending);
  // Keys of one dictionary alone are not worth the memory that they would keep.
  if (node != nullptr && !node->isUnshared()) {
    node->setNote(static_cast<std::uint32_t>(sharedKeys_.size()));
    sharedKeys_.emplace_back(keys, number);
  }
  return true;
}

/// Takes the references of the container's children away from the pending ones.
bool Catalogue::findOrAddContainer(std::uint32_t keys, Pending pending, const Size& size,
                                   Reference& number) {
  if (size.expandedCount > kMaximumExpandedValueCount) {
    return fail("a container that stands for more values than the limit");
  }
  const std::span<const Reference> content = std::span(pending_).subspan(pending.firstChild);
  const auto newNumber = static_cast<Reference>(containers_.size());
  number = findContainer(keys, content, pending.firstNewScalar, newNumber);
  if (number == newNumber) {
    CatalogueContainer fresh = {.childCount = static_cast<std::uint32_t>(content.size()),
                                .keys = keys,
                                .expandedCount = static_cast<std::uint32_t>(size.expandedCount),
                                .height = size.height};
    if (!keepReferences(content, fresh.firstReference)) {
      return false;
    }
    containers_.emplaceBack(fresh);
  }
  pending_.resize(pending.firstChild);
  return checkObjectCount();
}

/// The number of a container with these keys and children; `newNumber`, which it has from now on,
/// if there is none.
Catalogue::Reference Catalogue::findContainer(std::uint32_t keys,
                                              std::span<const Reference> content,
                                              std::size_t firstNewScalar, Reference newNumber) {
  const auto isSought = [&](Reference candidate) {
    const CatalogueContainer& other = containers_[candidate];
    return other.keys == keys && asBytes(childrenOf(other)) == asBytes(content);
  };
  // Most containers hold a scalar that nothing before them held. No other one is equal to such a
  // container, and it is found again by that scalar: it needs no place in a table, of which the
  // memory would be waited for. References to containers are negative here.
  const auto largest = std::accumulate(content.begin(), content.end(), std::int32_t{-1},
                                       [](std::int32_t known, Reference child) {
                                         return std::max(known, static_cast<std::int32_t>(child));
                                       });
  if (largest >= 0) {
    while (firstHolders_.size() <= static_cast<std::size_t>(largest)) {
      firstHolders_.emplaceBack(ContentTable::kNone);
    }
    Reference& holder = firstHolders_[static_cast<std::size_t>(largest)];
    if (holder != ContentTable::kNone && isSought(holder)) {
      return holder;
    }
    if (holder == ContentTable::kNone && static_cast<std::size_t>(largest) >= firstNewScalar) {
      return holder = newNumber;
    }
  }
  const std::uint32_t hash = hash_(asBytes(content)) ^ hash_(std::uint64_t{keys});
  return containerTable_.findOrAdd(hash, newNumber, isSought);
}

/// Places are counted in 32 bits, of which a fresh catalogue never comes near the end.
bool Catalogue::keepReferences(std::span<const Reference> references, std::uint32_t& place) {
  const std::size_t found = references_.add(references);
  place = static_cast<std::uint32_t>(found);
  return found <= UINT32_MAX || fail("more references than the limit");
}

bool Catalogue::addToParent(Reference number, std::size_t depth, Size& parent) {
  const CatalogueContainer& container = containers_[number];
  // A container that was met before, at a lower level, may be too high for this one.
  if (depth + container.height > kMaximumNestingDepth) {
    return fail("containers nested deeper than the limit");
  }
  pending_.push_back(number | kContainerBit);
  parent.expandedCount += container.expandedCount;
  parent.height = std::max(parent.height, std::uint32_t{container.height} + 1);
  return true;
}

bool Catalogue::checkObjectCount() const {
  return objectCount() <= kMaximumObjectCount || fail("more objects than the limit");
}

}  // namespace accounts::binaryplist
