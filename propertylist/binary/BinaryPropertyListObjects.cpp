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
  if (const PropertyDictionary* dictionary = value.asDictionary()) {
    visitContainer(&dictionary->keys(), dictionary->values());
  } else if (const PropertyArray* array = value.asArray()) {
    visitContainer(nullptr, {array->begin(), array->end()});
  } else {
    leave(scalarOf(value));
  }
}

/// `keys` are those of a dictionary, null for an array.
void Objects::visitContainer(const PropertyKeys* keys, std::span<const PropertyValue> children) {
  const std::size_t firstPending = pending_.size();
  if (keys != nullptr) {
    visitKeys(*keys);
  }
  for (const PropertyValue& child : children) {
    visit(child);
  }
  const bool isDictionary = keys != nullptr;
  const std::string_view content = asBytes(std::span(pending_).subspan(firstPending));
  const auto newNumber = static_cast<Reference>(containers_.size());
  const Reference found =
      containerTable_.findOrAdd(hash_(content), newNumber, [&](Reference candidate) {
        const Container& container = containers_[candidate];
        return container.isDictionary == isDictionary &&
               asBytes(referencesOf(container)) == content;
      });
  if (found == newNumber) {
    const Run run = keepPending(firstPending);
    containers_.push_back({.isDictionary = isDictionary,
                           .firstReference = static_cast<std::uint32_t>(run.first),
                           .referenceCount = static_cast<std::uint32_t>(run.count)});
  }
  pending_.resize(firstPending);
  pending_.push_back(found | kContainerBit);
}

void Objects::visitKeys(const PropertyKeys& keys) {
  const auto [known, isNew] = knownKeys_.try_emplace(keys.sharedNode());
  if (!isNew) {
    const auto references =
        std::span(references_).subspan(known->second.first, known->second.count);
    pending_.insert(pending_.end(), references.begin(), references.end());
    return;
  }
  const std::size_t firstPending = pending_.size();
  for (const Text& key : keys) {
    leave(scalarOf(Kind::ASCIIText, key.bytes()));
  }
  known->second = keepPending(firstPending);
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
}

/// Keeps a copy of the newest pending references.
Objects::Run Objects::keepPending(std::size_t first) {
  const Run run = {.first = references_.size(), .count = pending_.size() - first};
  references_.insert(references_.end(), pending_.begin() + static_cast<std::ptrdiff_t>(first),
                     pending_.end());
  return run;
}

}  // namespace accounts::binaryplist
