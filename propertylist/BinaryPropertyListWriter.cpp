#include <algorithm>
#include <bit>
#include <string>
#include <type_traits>

#include "propertylist/BinaryPropertyList.h"
#include "propertylist/BinaryPropertyListFormat.h"
#include "propertylist/BinaryPropertyListPlan.h"
#include "propertylist/GeneralisedUTF8.h"

namespace accounts {

namespace binaryplist {
namespace {

constexpr std::size_t kUnitSize = 2;

/// Calls a function with a size of 1, 2, 4 or 8 as a constant: a loop that stores numbers of one
/// size then does so without a look at it.
template <class Function>
void withConstantSize(std::size_t size, const Function& function) {
  switch (size) {
    case 1:
      return function(std::integral_constant<std::size_t, 1>());
    case 2:
      return function(std::integral_constant<std::size_t, 2>());
    case 4:
      return function(std::integral_constant<std::size_t, 4>());
    default:
      return function(std::integral_constant<std::size_t, 8>());
  }
}

/// How many bytes the marker and the length of an object with so many units take.
std::size_t sizeOfHead(std::size_t unitCount) {
  return unitCount < kLengthFollows ? 1 : 2 + sizeToHold(unitCount);
}

std::uint8_t numberMarker(Kind kind, std::size_t size) {
  return marker(kind, static_cast<std::size_t>(std::countr_zero(size)));
}

/// Fewer bytes than eight are unsigned, so a negative number, large as unsigned, takes all eight.
std::size_t sizeOfInteger(std::uint64_t bits) {
  return sizeToHold(bits);
}

/// The number of UTF-16 units that a text takes.
std::size_t unitCountOf(std::string_view text) {
  std::size_t count = 0;
  while (!text.empty()) {
    const DecodedCodePoint decoded = decodeCodePoint(text);
    count += decoded.value >= 0x10000 ? 2 : 1;
    text.remove_prefix(decoded.length);
  }
  return count;
}

std::size_t sizeOf(const PlannedScalar& scalar) {
  switch (scalar.kind) {
    case ScalarKind::Boolean:
      return 1;
    case ScalarKind::SignedInteger:
      return 1 + sizeOfInteger(scalar.bits);
    case ScalarKind::LargeInteger:
      return 17;
    case ScalarKind::Real:
    case ScalarKind::Date:
      return 9;
    case ScalarKind::UTF16Text: {
      const std::size_t unitCount = unitCountOf(scalar.view());
      return sizeOfHead(unitCount) + kUnitSize * unitCount;
    }
    case ScalarKind::Data:
    case ScalarKind::ASCIIText:
      return sizeOfHead(scalar.byteCount) + scalar.byteCount;
  }
  return 0;
}

/// Puts objects down one behind the other, in memory that has room for them.
class Output {
 public:
  explicit Output(char* place) : place_(place) {}

  [[nodiscard]] char* place() const { return place_; }

  void putByte(std::uint8_t byte) { *place_++ = static_cast<char>(byte); }

  template <std::size_t Size>
  void putNumber(std::uint64_t number) {
    store(place_, number, Size);
    place_ += Size;
  }

  void putNumber(std::uint64_t number, std::size_t size) {
    withConstantSize(size, [&](auto constantSize) { putNumber<constantSize()>(number); });
  }

  void putHead(Kind kind, std::size_t unitCount) {
    if (unitCount < kLengthFollows) {
      putByte(marker(kind, unitCount));
      return;
    }
    const std::size_t size = sizeToHold(unitCount);
    putByte(marker(kind, kLengthFollows));
    putByte(numberMarker(Kind::Integer, size));
    putNumber(unitCount, size);
  }

  void putBytes(std::string_view bytes) { place_ = std::copy(bytes.begin(), bytes.end(), place_); }

  void putUTF16(std::string_view text) {
    while (!text.empty()) {
      const DecodedCodePoint decoded = decodeCodePoint(text);
      if (decoded.value >= 0x10000) {
        putNumber<kUnitSize>(0xD800 + ((decoded.value - 0x10000) >> 10));
        putNumber<kUnitSize>(0xDC00 + ((decoded.value - 0x10000) & 0x3FF));
      } else {
        putNumber<kUnitSize>(decoded.value);
      }
      text.remove_prefix(decoded.length);
    }
  }

  void putScalar(const PlannedScalar& scalar) {
    switch (scalar.kind) {
      case ScalarKind::Boolean:
        return putByte(scalar.bits != 0 ? kMarkerOfTrue : kMarkerOfFalse);
      case ScalarKind::SignedInteger: {
        const std::size_t size = sizeOfInteger(scalar.bits);
        putByte(numberMarker(Kind::Integer, size));
        return putNumber(scalar.bits, size);
      }
      case ScalarKind::LargeInteger:
        // Eight bytes are signed; a larger number takes sixteen.
        putByte(numberMarker(Kind::Integer, 16));
        putNumber<8>(0);
        return putNumber<8>(scalar.bits);
      case ScalarKind::Real:
        putByte(numberMarker(Kind::Real, 8));
        return putNumber<8>(scalar.bits);
      case ScalarKind::Date:
        putByte(kMarkerOfDate);
        return putNumber<8>(scalar.bits);
      case ScalarKind::Data:
        putHead(Kind::Data, scalar.byteCount);
        return putBytes(scalar.view());
      case ScalarKind::ASCIIText:
        putHead(Kind::ASCIIText, scalar.byteCount);
        return putBytes(scalar.view());
      case ScalarKind::UTF16Text:
        putHead(Kind::UTF16Text, unitCountOf(scalar.view()));
        return putUTF16(scalar.view());
    }
  }

 private:
  char* place_;
};

/// A planned file: containers come first in the count of objects, the outermost as 0, and scalars
/// first in the file.
class File {
 public:
  explicit File(const Plan& plan) : plan_(plan) {
    // Large enough for the count and for the table's own offset, each one more than the largest
    // number stored: there are readers that ask for that.
    referenceSize_ = sizeToHold(plan.objectCount());
    table_ = kHeader.size();
    for (const PlannedScalar& scalar : plan.scalars()) {
      table_ += sizeOf(scalar);
    }
    for (const PlannedContainer& container : plan.containers()) {
      table_ += sizeOfHead(container.childCount()) + container.referenceCount * referenceSize_;
    }
    offsetSize_ = sizeToHold(table_);
  }

  [[nodiscard]] std::string write() const {
    const std::size_t trailer = table_ + plan_.objectCount() * offsetSize_;
    std::string bytes(trailer + kTrailerSize, '\0');
    withConstantSize(offsetSize_, [&](auto size) { writeObjects<size()>(bytes.data()); });
    char* const place = bytes.data() + trailer;
    place[kOffsetSizePosition] = static_cast<char>(offsetSize_);
    place[kReferenceSizePosition] = static_cast<char>(referenceSize_);
    store(place + kObjectCountPosition, plan_.objectCount(), 8);
    store(place + kTopObjectPosition, 0, 8);
    store(place + kTablePosition, table_, 8);
    return bytes;
  }

 private:
  template <std::size_t OffsetSize>
  void writeObjects(char* bytes) const {
    Output output(bytes);
    Output containerOffsets(bytes + table_);
    Output scalarOffsets(bytes + table_ + plan_.containers().size() * OffsetSize);
    const auto offset = [&] { return static_cast<std::uint64_t>(output.place() - bytes); };
    output.putBytes(kHeader);
    for (const PlannedScalar& scalar : plan_.scalars()) {
      scalarOffsets.putNumber<OffsetSize>(offset());
      output.putScalar(scalar);
    }
    const auto& containers = plan_.containers();
    for (auto container = containers.rbegin(); container != containers.rend(); ++container) {
      containerOffsets.putNumber<OffsetSize>(offset());
      output.putHead(container->kind, container->childCount());
      withConstantSize(referenceSize_, [&](auto size) {
        for (const Plan::Reference reference : plan_.referencesOf(*container)) {
          output.putNumber<size()>(numberInFile(reference));
        }
      });
    }
  }

  [[nodiscard]] std::uint32_t numberInFile(Plan::Reference reference) const {
    const auto containerCount = static_cast<std::uint32_t>(plan_.containers().size());
    return (reference & Plan::kContainerBit) != 0
               ? containerCount - 1 - (reference & ~Plan::kContainerBit)
               : containerCount + reference;
  }

  const Plan& plan_;
  std::size_t referenceSize_ = 0;
  std::size_t offsetSize_ = 0;
  std::size_t table_ = 0;
};

}  // namespace
}  // namespace binaryplist

std::optional<std::string> writeBinaryPropertyList(const PropertyValue& value,
                                                   PropertyListError& error) {
  binaryplist::Plan plan(error);
  if (!plan.make(value)) {
    return std::nullopt;
  }
  return binaryplist::File(plan).write();
}

}  // namespace accounts
