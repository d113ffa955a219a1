#include "propertylist/BinaryPropertyListCatalogue.h"

#include <algorithm>
#include <bit>
#include <optional>

#include "propertylist/GeneralisedUTF8.h"
#include "propertylist/PropertyListLimits.h"

namespace accounts::binaryplist {

static_assert(kMaximumObjectCount < Catalogue::kContainerBit);

namespace {

Kind kindOfContainer(const PropertyArray&) {
  return Kind::Array;
}
Kind kindOfContainer(const PropertyDictionary&) {
  return Kind::Dictionary;
}

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
      return visitContainer(*value.asDictionary(), depth, parent);
    case PropertyKind::Array:
      return visitContainer(*value.asArray(), depth, parent);
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
bool Catalogue::visitContainer(const Container& container, std::size_t depth, Size& parent) {
  if (depth == kMaximumNestingDepth) {
    return fail("containers nested deeper than the limit");
  }
  const SharedNodeBase* const node = container.sharedNode();
  if (isKnownContainer(node)) {
    containers_[node->note()].walk = walk_;
    return addToParent(node->note(), depth, parent);
  }
  const std::size_t firstPending = pending_.size();
  Size size;
  if (!visitChildren(container, depth + 1, size)) {
    return false;
  }
  const std::optional<Reference> number =
      findOrAddContainer(kindOfContainer(container), firstPending, size);
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

bool Catalogue::visitChildren(const PropertyArray& array, std::size_t depth, Size& size) {
  return visitEach(array, depth, size,
                   [](const PropertyValue& element) -> const PropertyValue& { return element; });
}

bool Catalogue::visitChildren(const PropertyDictionary& dictionary, std::size_t depth, Size& size) {
  return std::all_of(dictionary.begin(), dictionary.end(),
                     [&](const PropertyEntry& entry) { return visitText(entry.key, size); }) &&
         visitEach(dictionary, depth, size,
                   [](const PropertyEntry& entry) -> const PropertyValue& { return entry.value; });
}

template <class Container, class ValueOf>
bool Catalogue::visitEach(const Container& container, std::size_t depth, Size& size,
                          const ValueOf& valueOf) {
  // Tables are looked into for a handful of values at once, which saves a seventh of the time for
  // a large file: the memory's answers come while others are waited for.
  constexpr std::ptrdiff_t kAnnouncedAtOnce = 16;
  const auto* next = container.begin();
  while (next != container.end()) {
    const auto* const end = next + std::min(kAnnouncedAtOnce, container.end() - next);
    std::for_each(next, end, [&](const auto& child) { announce(valueOf(child)); });
    for (; next != end; ++next) {
      if (!visit(valueOf(*next), depth, size)) {
        return false;
      }
    }
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

/// The number of the container whose references are the last pending ones, which it takes away.
std::optional<Catalogue::Reference> Catalogue::findOrAddContainer(Kind kind,
                                                                  std::size_t firstPending,
                                                                  const Size& size) {
  if (size.expandedCount > kMaximumExpandedValueCount) {
    fail("a container that stands for more values than the limit");
    return std::nullopt;
  }
  const std::span<const Reference> content = std::span(pending_).subspan(firstPending);
  const auto newNumber = static_cast<Reference>(containers_.size());
  const Reference number =
      containerTable_.findOrAdd(hash_(asBytes(content)), newNumber, [&](Reference candidate) {
        const CatalogueContainer& other = containers_[candidate];
        return other.kind == kind && asBytes(referencesOf(other)) == asBytes(content);
      });
  if (number == newNumber) {
    containers_.push_back({.firstReference = references_.size(),
                           .referenceCount = static_cast<std::uint32_t>(content.size()),
                           .expandedCount = static_cast<std::uint32_t>(size.expandedCount),
                           .height = static_cast<std::uint16_t>(size.height),
                           .kind = kind});
    references_.insert(references_.end(), content.begin(), content.end());
  }
  pending_.resize(firstPending);
  return checkObjectCount() ? std::optional(number) : std::nullopt;
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
