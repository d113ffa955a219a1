#include "propertylist/BinaryPropertyListScalarCatalogue.h"

#include <bit>

#include "propertylist/GeneralisedUTF8.h"
#include "propertylist/PropertyListLimits.h"

namespace accounts::binaryplist {

namespace {

/// A number as it is written.
struct Number {
  ScalarKind kind;
  std::uint64_t bits;
};

Number numberOf(const PropertyValue& value) {
  if (const std::int64_t* integer = value.asSigned()) {
    return {ScalarKind::SignedInteger, static_cast<std::uint64_t>(*integer)};
  }
  if (const bool* boolean = value.asBoolean()) {
    return {ScalarKind::Boolean, *boolean ? std::uint64_t{1} : 0};
  }
  if (const double* real = value.asReal()) {
    return {ScalarKind::Real, std::bit_cast<std::uint64_t>(*real)};
  }
  if (const PropertyDate* date = value.asDate()) {
    return {ScalarKind::Date, std::bit_cast<std::uint64_t>(date->secondsSinceReferenceDate)};
  }
  return {ScalarKind::LargeInteger, *value.asLargeUnsigned()};
}

}  // namespace

ScalarCatalogue::Announced ScalarCatalogue::announce(const PropertyValue& scalar) const {
  if (const Text* text = scalar.asText()) {
    return announce(*text);
  }
  if (const PropertyData* data = scalar.asData()) {
    return announceBytes(ScalarKind::Data, data->bytes);
  }
  return announceHash(hash_(numberOf(scalar).bits));
}

ScalarCatalogue::Announced ScalarCatalogue::announce(const Text& text) const {
  return announceBytes(ScalarKind::ASCIIText, text.bytes());
}

ScalarCatalogue::Announced ScalarCatalogue::announceBytes(ScalarKind kind,
                                                          const SharedBytes& bytes) const {
  const SharedNodeBase* const node = bytes.sharedNode();
  if (node != nullptr && node->note() < scalars_.size()) {
    const CatalogueScalar& scalar = scalars_[node->note()];
    if (scalar.isNode(node) && scalar.isAlike(kind)) {
      return {.number = node->note()};
    }
  }
  return announceHash(hash_(bytes.view()));
}

ScalarCatalogue::Announced ScalarCatalogue::announceHash(std::uint32_t hash) const {
  table_.announce(hash);
  return {.hash = hash};
}

std::uint32_t ScalarCatalogue::findOrAdd(const PropertyValue& scalar, Announced announced,
                                         std::string_view& problem) {
  if (const Text* text = scalar.asText()) {
    return findOrAdd(*text, announced, problem);
  }
  if (const PropertyData* data = scalar.asData()) {
    return findOrAddBytes(ScalarKind::Data, data->bytes, announced, problem);
  }
  const Number number = numberOf(scalar);
  const auto newNumber = static_cast<std::uint32_t>(scalars_.size());
  const std::uint32_t found =
      table_.findOrAdd(announced.hash, newNumber, [&](std::uint32_t candidate) {
        return scalars_[candidate].kind() == number.kind &&
               scalars_[candidate].bits() == number.bits;
      });
  if (found == newNumber) {
    scalars_.emplaceBack(number.kind, number.bits);
  }
  return found;
}

std::uint32_t ScalarCatalogue::findOrAdd(const Text& text, Announced announced,
                                         std::string_view& problem) {
  return findOrAddBytes(ScalarKind::ASCIIText, text.bytes(), announced, problem);
}

/// Of a text the kind given is ASCII, and may become the other one.
std::uint32_t ScalarCatalogue::findOrAddBytes(ScalarKind kind, const SharedBytes& bytes,
                                              Announced announced, std::string_view& problem) {
  if (announced.number != ContentTable::kNone) {
    return announced.number;
  }
  const std::string_view content = bytes.view();
  if (expandedCountOfBytes(content.size()) > kMaximumExpandedValueCount) {
    problem = "a text or data longer than the limit";
    return ContentTable::kNone;
  }
  const auto newNumber = static_cast<std::uint32_t>(scalars_.size());
  const std::uint32_t found =
      table_.findOrAdd(announced.hash, newNumber, [&](std::uint32_t candidate) {
        return scalars_[candidate].isAlike(kind) && scalars_[candidate].view() == content;
      });
  if (found != newNumber) {
    return found;
  }
  if (kind != ScalarKind::Data && !isASCII(content)) {
    if (!isGeneralisedUTF8(content)) {
      problem = "a text that is not well-formed UTF-8";
      return ContentTable::kNone;
    }
    kind = ScalarKind::UTF16Text;
  }
  scalars_.emplaceBack(kind, bytes);
  if (const SharedNodeBase* const node = bytes.sharedNode()) {
    node->setNote(found);
  }
  return found;
}

}  // namespace accounts::binaryplist
