#include "propertylist/binary/BinaryPropertyListObjects.h"

#include <bit>

#include "propertylist/PropertyListLimits.h"

namespace accounts::binaryplist {

// A value has at most so many parts, each with a key at most, and no reference reaches the bit.
static_assert(2 * kMaximumExpandedValueCount <= Objects::kContainerBit);

namespace {

bool holdsBytes(Kind kind) {
  return kind == Kind::ASCIIText || kind == Kind::Data;
}

Scalar number(Kind kind, std::uint64_t bits, std::uint32_t byteCount = sizeof(std::uint64_t)) {
  return {.kind = kind, .byteCount = byteCount, .bits = bits};
}

Scalar scalarOf(Kind kind, const SharedBytes& bytes) {
  const std::string_view view = bytes.view();
  return {.kind = kind, .byteCount = static_cast<std::uint32_t>(view.size()), .bytes = view.data()};
}

/// Of any value but a container.
Scalar scalarOf(const PropertyValue& value) {
  if (const Text* text = value.asText()) {
    return scalarOf(Kind::ASCIIText, text->bytes());
  }
  if (const PropertyData* data = value.asData()) {
    return scalarOf(Kind::Data, data->bytes);
  }
  if (const std::int64_t* integer = value.asSigned()) {
    return number(Kind::Integer, static_cast<std::uint64_t>(*integer));
  }
  if (const bool* boolean = value.asBoolean()) {
    return number(Kind::Simple, *boolean ? 1 : 0);
  }
  if (const double* real = value.asReal()) {
    return number(Kind::Real, std::bit_cast<std::uint64_t>(*real));
  }
  if (const PropertyDate* date = value.asDate()) {
    return number(Kind::Date, std::bit_cast<std::uint64_t>(date->secondsSinceReferenceDate));
  }
  return number(Kind::Integer, *value.asLargeUnsigned(), 2 * sizeof(std::uint64_t));
}

bool areEqual(const Scalar& left, const Scalar& right) {
  return left.kind == right.kind && left.byteCount == right.byteCount &&
         (holdsBytes(left.kind) ? left.view() == right.view() : left.bits == right.bits);
}

std::string_view asBytes(std::span<const Objects::Reference> references) {
  return {reinterpret_cast<const char*>(references.data()), references.size_bytes()};
}

}  // namespace

void Objects::visit(const PropertyValue& value) {
  const std::size_t firstPending = pending_.size();
  ++expandedCount_;
  if (const PropertyDictionary* dictionary = value.asDictionary()) {
    for (const PropertyEntry& entry : *dictionary) {
      leave(scalarOf(Kind::ASCIIText, entry.key.bytes()));
    }
    for (const PropertyEntry& entry : *dictionary) {
      visit(entry.value);
    }
    leaveContainer(/*isDictionary=*/true, firstPending);
  } else if (const PropertyArray* array = value.asArray()) {
    for (const PropertyValue& element : *array) {
      visit(element);
    }
    leaveContainer(/*isDictionary=*/false, firstPending);
  } else {
    leave(scalarOf(value));
  }
}

/// Puts a container's number in the place of the pending references from one on, which are its own.
void Objects::leaveContainer(bool isDictionary, std::size_t firstPending) {
  const std::span<const Reference> own = std::span(pending_).subspan(firstPending);
  const auto newNumber = static_cast<Reference>(containers_.size());
  const Reference found =
      containerTable_.findOrAdd(hash_(asBytes(own)), newNumber, [&](Reference candidate) {
        const Container& container = containers_[candidate];
        return container.isDictionary == isDictionary &&
               asBytes(referencesOf(container)) == asBytes(own);
      });
  if (found == newNumber) {
    containers_.push_back({.isDictionary = isDictionary,
                           .firstReference = static_cast<std::uint32_t>(references_.size()),
                           .referenceCount = static_cast<std::uint32_t>(own.size())});
    references_.insert(references_.end(), own.begin(), own.end());
  } else {
    ++repeatedContainerCount_;
  }
  pending_.resize(firstPending);
  pending_.push_back(found | kContainerBit);
}

/// Makes a scalar's number the newest pending reference.
void Objects::leave(const Scalar& scalar) {
  const std::uint32_t hash = holdsBytes(scalar.kind) ? hash_(scalar.view()) : hash_(scalar.bits);
  const auto newNumber = static_cast<Reference>(scalars_.size());
  const Reference found = scalarTable_.findOrAdd(
      hash, newNumber, [&](Reference candidate) { return areEqual(scalars_[candidate], scalar); });
  if (found == newNumber) {
    scalars_.push_back(scalar);
  }
  pending_.push_back(found);
  expandedCount_ += holdsBytes(scalar.kind) ? expandedCountOfBytes(scalar.byteCount) : 0;
}

}  // namespace accounts::binaryplist
