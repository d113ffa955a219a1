#include "propertylist/BinaryPropertyListPlan.h"

#include <algorithm>
#include <bit>
#include <optional>

#include "propertylist/GeneralisedUTF8.h"
#include "propertylist/PropertyListLimits.h"

namespace accounts::binaryplist {

static_assert(kMaximumObjectCount < Plan::kContainerBit);

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

std::string_view asBytes(std::span<const Plan::Reference> references) {
  return {reinterpret_cast<const char*>(references.data()), references.size_bytes()};
}

}  // namespace

bool Plan::make(const PropertyValue& value) {
  Size size;
  return visit(value, 0, size);
}

bool Plan::fail(std::string_view what) const {
  error_.text = "binary property list: cannot write ";
  error_.text.append(what);
  return false;
}

/// Appends a value's reference to the pending ones and adds the value to its parent's size. `depth`
/// is the number of containers around it; it bounds the recursion.
bool Plan::visit(const PropertyValue& value, std::size_t depth, Size& parent) {
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
      return visitData(value.asData()->bytes.view(), parent);
  }
  return false;
}

bool Plan::visitNumber(ScalarKind kind, std::uint64_t bits, Size& parent) {
  ++parent.expandedCount;
  const auto newNumber = static_cast<Reference>(scalars_.size());
  const Reference number = numberTable_.findOrAdd(hash_(bits), newNumber, [&](Reference candidate) {
    return scalars_[candidate].kind == kind && scalars_[candidate].bits == bits;
  });
  pending_.push_back(number);
  return number != newNumber || addScalar({.bits = bits, .kind = kind});
}

bool Plan::visitData(std::string_view bytes, Size& parent) {
  parent.expandedCount += 1 + expandedCountOfBytes(bytes.size());
  return addBytes(ScalarKind::Data, bytes);
}

bool Plan::visitText(const Text& text, Size& parent) {
  const std::string_view bytes = text.view();
  parent.expandedCount += expandedCountOfBytes(bytes.size());
  // A text with one holder alone is met once: to look for it would be lost labour.
  const bool isShared = text.isShared();
  if (isShared) {
    if (const std::optional<Reference> known = texts_.find(text.identity())) {
      pending_.push_back(*known);
      return true;
    }
  }
  if (!addBytes(ScalarKind::ASCIIText, bytes)) {
    return false;
  }
  if (isShared) {
    texts_.add(text.identity(), pending_.back());
  }
  return true;
}

/// Finds or adds a data or a text. Of a text the kind given is ASCII, and may become the other one.
bool Plan::addBytes(ScalarKind kind, std::string_view bytes) {
  if (expandedCountOfBytes(bytes.size()) > kMaximumExpandedValueCount) {
    return fail("a text or data longer than the limit");
  }
  const auto newNumber = static_cast<Reference>(scalars_.size());
  const Reference number = bytesTable_.findOrAdd(hash_(bytes), newNumber, [&](Reference candidate) {
    const PlannedScalar& other = scalars_[candidate];
    return (other.kind == ScalarKind::Data) == (kind == ScalarKind::Data) && other.view() == bytes;
  });
  pending_.push_back(number);
  if (number != newNumber) {
    return true;
  }
  PlannedScalar scalar{
      .bytes = bytes.data(), .byteCount = static_cast<std::uint32_t>(bytes.size()), .kind = kind};
  if (kind != ScalarKind::Data && !isASCII(bytes)) {
    if (!isGeneralisedUTF8(bytes)) {
      return fail("a text that is not well-formed UTF-8");
    }
    scalar.kind = ScalarKind::UTF16Text;
  }
  return addScalar(scalar);
}

bool Plan::addScalar(const PlannedScalar& scalar) {
  scalars_.push_back(scalar);
  return checkObjectCount();
}

template <class Container>
bool Plan::visitContainer(const Container& container, std::size_t depth, Size& parent) {
  if (depth == kMaximumNestingDepth) {
    return fail("containers nested deeper than the limit");
  }
  const bool isShared = container.isShared();
  if (isShared) {
    if (const std::optional<Reference> known = containerIdentities_.find(container.identity())) {
      return addToParent(*known, depth, parent);
    }
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
  if (isShared) {
    containerIdentities_.add(container.identity(), *number);
  }
  return addToParent(*number, depth, parent);
}

bool Plan::visitChildren(const PropertyArray& array, std::size_t depth, Size& size) {
  return visitEach(array, depth, size,
                   [](const PropertyValue& element) -> const PropertyValue& { return element; });
}

bool Plan::visitChildren(const PropertyDictionary& dictionary, std::size_t depth, Size& size) {
  return std::all_of(dictionary.begin(), dictionary.end(),
                     [&](const PropertyEntry& entry) { return visitText(entry.key, size); }) &&
         visitEach(dictionary, depth, size,
                   [](const PropertyEntry& entry) -> const PropertyValue& { return entry.value; });
}

template <class Container, class ValueOf>
bool Plan::visitEach(const Container& container, std::size_t depth, Size& size,
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

void Plan::announce(const PropertyValue& value) const {
  constexpr std::size_t kLongestAnnounced = 128;
  const Text* text = value.asText();
  if (text == nullptr) {
    return;
  }
  if (text->isShared()) {
    texts_.announce(text->identity());
  } else if (const std::string_view bytes = *text; bytes.size() <= kLongestAnnounced) {
    bytesTable_.announce(hash_(bytes));
  }
}

/// The number of the container whose references are the last pending ones, which it takes away.
std::optional<Plan::Reference> Plan::findOrAddContainer(Kind kind, std::size_t firstPending,
                                                        const Size& size) {
  if (size.expandedCount > kMaximumExpandedValueCount) {
    fail("a container that stands for more values than the limit");
    return std::nullopt;
  }
  const std::span<const Reference> content = std::span(pending_).subspan(firstPending);
  const auto newNumber = static_cast<Reference>(containers_.size());
  const Reference number =
      containerTable_.findOrAdd(hash_(asBytes(content)), newNumber, [&](Reference candidate) {
        const PlannedContainer& other = containers_[candidate];
        return other.kind == kind && asBytes(referencesOf(other)) == asBytes(content);
      });
  if (number == newNumber) {
    containers_.push_back({kind, static_cast<std::uint32_t>(content.size()), references_.size(),
                           static_cast<std::uint32_t>(size.expandedCount), size.height});
    references_.insert(references_.end(), content.begin(), content.end());
  }
  pending_.resize(firstPending);
  return checkObjectCount() ? std::optional(number) : std::nullopt;
}

bool Plan::addToParent(Reference number, std::size_t depth, Size& parent) {
  const PlannedContainer& container = containers_[number];
  // A container that was met before, at a lower level, may be too high for this one.
  if (depth + container.height > kMaximumNestingDepth) {
    return fail("containers nested deeper than the limit");
  }
  pending_.push_back(number | kContainerBit);
  parent.expandedCount += container.expandedCount;
  parent.height = std::max(parent.height, container.height + 1);
  return true;
}

bool Plan::checkObjectCount() const {
  return objectCount() <= kMaximumObjectCount || fail("more objects than the limit");
}

}  // namespace accounts::binaryplist
