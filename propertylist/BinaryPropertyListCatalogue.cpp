#include "propertylist/BinaryPropertyListCatalogue.h"

#include <algorithm>
#include <bit>
#include <optional>

#include "propertylist/GeneralisedUTF8.h"
#include "propertylist/PropertyListLimits.h"

namespace accounts::binaryplist {

static_assert(kMaximumObjectCount < Catalogue::kContainerBit);

namespace {

bool isGeneralisedUTF8(std::string_view text) {
  while (!text.empty()) {
    const std::size_t length = decodeCodePoint(text).length;
    if (length == 0) {
      return false;
    }
    text.remove_prefix(length);
  }
  return true;
}

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
  return visit(value, 0, size) ? std::optional(pending_.back()) : std::nullopt;
}

bool Catalogue::fail(std::string_view what) const {
  error_->text = "binary property list: cannot write ";
  error_->text.append(what);
  return false;
}

/// Appends a value's reference to the pending ones and adds the value to its parent's size. `depth`
/// is the number of containers around it; it bounds the recursion.
bool Catalogue::visit(const PropertyValue& value, std::size_t depth, Size& parent) {
  switch (value.kind()) {
    case PropertyKind::String:
      ++parent.expandedCount;
      return visitText(*value.asText(), parent);
    case PropertyKind::Dictionary:
      return visitContainer(*value.asDictionary(), value.asDictionary()->values(), depth, parent);
    case PropertyKind::Array:
      return visitContainer(*value.asArray(), {value.asArray()->begin(), value.asArray()->end()},
                            depth, parent);
    case PropertyKind::Integer:
      return value.asSigned() != nullptr
                 ? visitNumber(ScalarKind::SignedInteger,
                               static_cast<std::uint64_t>(*value.asSigned()), parent)
                 : visitNumber(ScalarKind::LargeInteger, *value.asLargeUnsigned(), parent);
    case PropertyKind::Boolean:
      return visitNumber(ScalarKind::Boolean, *value.asBoolean() ? 1 : 0, parent);
    case PropertyKind::Real:
      return visitNumber(ScalarKind::Real, std::bit_cast<std::uint64_t>(*value.asReal()), parent);
    case PropertyKind::Date:
      return visitNumber(ScalarKind::Date,
                         std::bit_cast<std::uint64_t>(value.asDate()->secondsSinceReferenceDate),
                         parent);
    case PropertyKind::Data:
      return visitData(value.asData()->bytes, parent);
  }
  return false;
}

bool Catalogue::visitNumber(ScalarKind kind, std::uint64_t bits, Size& parent) {
  ++parent.expandedCount;
  const auto newNumber = static_cast<Reference>(scalars_.size());
  const Reference number = numberTable_.findOrAdd(hash_(bits), newNumber, [&](Reference candidate) {
    return scalars_[candidate].kind() == kind && scalars_[candidate].bits() == bits;
  });
  pending_.push_back(number);
  if (number != newNumber) {
    return true;
  }
  scalars_.emplace_back(kind, bits);
  return checkObjectCount();
}

bool Catalogue::visitData(const SharedBytes& bytes, Size& parent) {
  parent.expandedCount += 1 + expandedCountOfBytes(bytes.view().size());
  return addBytes(ScalarKind::Data, bytes);
}

bool Catalogue::visitText(const Text& text, Size& parent) {
  parent.expandedCount += expandedCountOfBytes(text.view().size());
  return addBytes(ScalarKind::ASCIIText, text.bytes());
}

bool Catalogue::isKnown(const SharedNodeBase* bytes) const {
  return bytes != nullptr && bytes->note() < scalars_.size() &&
         scalars_[bytes->note()].isNode(bytes);
}

/// Finds or adds a data or a text. Of a text the kind given is ASCII, and may become the other one.
bool Catalogue::addBytes(ScalarKind kind, const SharedBytes& bytes) {
  const SharedNodeBase* const node = bytes.sharedNode();
  const bool isData = kind == ScalarKind::Data;
  const auto isOfKind = [&](Reference candidate) {
    return (scalars_[candidate].kind() == ScalarKind::Data) == isData;
  };
  if (isKnown(node) && isOfKind(node->note())) {
    pending_.push_back(node->note());
    return true;
  }
  const std::string_view content = bytes.view();
  if (expandedCountOfBytes(content.size()) > kMaximumExpandedValueCount) {
    return fail("a text or data longer than the limit");
  }
  const auto newNumber = static_cast<Reference>(scalars_.size());
  const Reference number =
      bytesTable_.findOrAdd(hash_(content), newNumber, [&](Reference candidate) {
        return isOfKind(candidate) && scalars_[candidate].view() == content;
      });
  pending_.push_back(number);
  if (number != newNumber) {
    return true;
  }
  if (!isData && !isASCII(content)) {
    if (!isGeneralisedUTF8(content)) {
      return fail("a text that is not well-formed UTF-8");
    }
    kind = ScalarKind::UTF16Text;
  }
  scalars_.emplace_back(kind, bytes);
  if (node != nullptr) {
    node->setNote(number);
  }
  return checkObjectCount();
}

template <class Container>
bool Catalogue::visitContainer(const Container& container, std::span<const PropertyValue> children,
                               std::size_t depth, Size& parent) {
  if (depth == kMaximumNestingDepth) {
    return fail("containers nested deeper than the limit");
  }
  const SharedNodeBase* const node = container.sharedNode();
  if (isKnownContainer(node)) {
    containers_[node->note()].walk = walk_;
    return addToParent(node->note(), depth, parent);
  }
  Size size;
  const std::optional<std::uint32_t> keys = visitKeys(container, size);
  const std::size_t firstPending = pending_.size();
  if (!keys || !visitChildren(children, depth + 1, size)) {
    return false;
  }
  const std::optional<Reference> number = findOrAddContainer(*keys, firstPending, size);
  if (!number) {
    return false;
  }
  if (node != nullptr) {
    containers_[*number].walk = walk_;
    containers_[*number].node = node;
    node->setNote(*number);
  }
  return addToParent(*number, depth, parent);
}

bool Catalogue::isKnownContainer(const SharedNodeBase* node) const {
  if (node == nullptr || node->note() >= containers_.size()) {
    return false;
  }
  const CatalogueContainer& container = containers_[node->note()];
  return container.node == node && walk_ - container.walk <= 1;
}

std::optional<std::uint32_t> Catalogue::visitKeys(const PropertyArray&, Size&) {
  return CatalogueContainer::kArray;
}

std::optional<std::uint32_t> Catalogue::visitKeys(const PropertyDictionary& dictionary,
                                                  Size& size) {
  const std::optional<std::uint32_t> number = findOrAddKeys(dictionary.keys());
  size.expandedCount += number ? keys_[*number].expandedCount : 0;
  return number;
}

std::optional<std::uint32_t> Catalogue::findOrAddKeys(const PropertyKeys& keys) {
  const SharedNodeBase* const node = keys.sharedNode();
  if (node != nullptr && node->note() < sharedKeys_.size() &&
      sharedKeys_[node->note()].first.isSameAs(keys)) {
    return sharedKeys_[node->note()].second;
  }
  const std::size_t firstPending = pending_.size();
  Size size{.expandedCount = 0};
  if (!std::all_of(keys.begin(), keys.end(),
                   [&](const Text& key) { return visitText(key, size); })) {
    return std::nullopt;
  }
  if (size.expandedCount > kMaximumExpandedValueCount) {
    fail("a container that stands for more values than the limit");
    return std::nullopt;
  }
  const std::span<const Reference> content = std::span(pending_).subspan(firstPending);
  const auto newNumber = static_cast<std::uint32_t>(keys_.size());
  const std::uint32_t number =
      keysTable_.findOrAdd(hash_(asBytes(content)), newNumber, [&](std::uint32_t candidate) {
        return asBytes(referencesOf(keys_[candidate])) == asBytes(content);
      });
  if (number == newNumber) {
    keys_.push_back({.firstReference = static_cast<std::uint32_t>(references_.size()),
                     .count = static_cast<std::uint32_t>(content.size()),
                     .expandedCount = static_cast<std::uint32_t>(size.expandedCount)});
    if (!moveToReferences(firstPending)) {
      return std::nullopt;
    }
  }
  pending_.resize(firstPending);
  // Keys of one dictionary alone are not worth the memory that they would keep.
  if (node != nullptr && !node->isUnshared()) {
    node->setNote(static_cast<std::uint32_t>(sharedKeys_.size()));
    sharedKeys_.emplace_back(keys, number);
  }
  return number;
}

bool Catalogue::visitChildren(std::span<const PropertyValue> children, std::size_t depth,
                              Size& size) {
  // Tables are looked into for a handful of values at once, which saves a seventh of the time for
  // a large file: the memory's answers come while others are waited for.
  constexpr std::size_t kAnnouncedAtOnce = 16;
  while (!children.empty()) {
    const std::span<const PropertyValue> next =
        children.first(std::min(kAnnouncedAtOnce, children.size()));
    std::ranges::for_each(next, [&](const PropertyValue& child) { announce(child); });
    if (!std::ranges::all_of(
            next, [&](const PropertyValue& child) { return visit(child, depth, size); })) {
      return false;
    }
    children = children.subspan(next.size());
  }
  return true;
}

void Catalogue::announce(const PropertyValue& value) const {
  constexpr std::size_t kLongestAnnounced = 128;
  const Text* text = value.asText();
  if (text == nullptr || isKnown(text->bytes().sharedNode())) {
    return;
  }
  if (const std::string_view bytes = *text; bytes.size() <= kLongestAnnounced) {
    bytesTable_.announce(hash_(bytes));
  }
}

/// The number of the container whose children's references are the last pending ones, which it
/// takes away.
std::optional<Catalogue::Reference> Catalogue::findOrAddContainer(std::uint32_t keys,
                                                                  std::size_t firstPending,
                                                                  const Size& size) {
  if (size.expandedCount > kMaximumExpandedValueCount) {
    fail("a container that stands for more values than the limit");
    return std::nullopt;
  }
  const std::span<const Reference> content = std::span(pending_).subspan(firstPending);
  const auto newNumber = static_cast<Reference>(containers_.size());
  const std::uint32_t hash = hash_(asBytes(content)) ^ hash_(std::uint64_t{keys});
  const Reference number = containerTable_.findOrAdd(hash, newNumber, [&](Reference candidate) {
    const CatalogueContainer& other = containers_[candidate];
    return other.keys == keys && asBytes(childrenOf(other)) == asBytes(content);
  });
  if (number == newNumber) {
    containers_.push_back({.firstReference = static_cast<std::uint32_t>(references_.size()),
                           .childCount = static_cast<std::uint32_t>(content.size()),
                           .keys = keys,
                           .expandedCount = static_cast<std::uint32_t>(size.expandedCount),
                           .height = size.height});
    if (!moveToReferences(firstPending)) {
      return std::nullopt;
    }
  }
  pending_.resize(firstPending);
  return checkObjectCount() ? std::optional(number) : std::nullopt;
}

/// Keeps the last pending references. They are counted in 32 bits, of which a fresh catalogue never
/// comes near the end.
bool Catalogue::moveToReferences(std::size_t firstPending) {
  references_.insert(references_.end(),
                     pending_.begin() + static_cast<std::ptrdiff_t>(firstPending), pending_.end());
  return references_.size() <= UINT32_MAX || fail("more references than the limit");
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
