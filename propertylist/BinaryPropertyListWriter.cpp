#include <algorithm>
#include <bit>
#include <span>
#include <string>
#include <type_traits>
#include <utility>

#include "propertylist/BinaryPropertyList.h"
#include "propertylist/BinaryPropertyListCatalogue.h"
#include "propertylist/BinaryPropertyListFileOrder.h"
#include "propertylist/BinaryPropertyListFormat.h"
#include "propertylist/GeneralisedUTF8.h"

namespace accounts {

namespace binaryplist {
namespace {

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

std::size_t sizeOf(const CatalogueScalar& scalar) {
  switch (scalar.kind()) {
    case ScalarKind::Boolean:
      return 1;
    case ScalarKind::SignedInteger:
      return 1 + sizeOfInteger(scalar.bits());
    case ScalarKind::LargeInteger:
      return 17;
    case ScalarKind::Real:
    case ScalarKind::Date:
      return 9;
    case ScalarKind::UTF16Text: {
      const std::size_t unitCount = unitCountOf(scalar.view());
      return sizeOfHead(unitCount) + kUTF16UnitSize * unitCount;
    }
    case ScalarKind::Data:
    case ScalarKind::ASCIIText:
      return sizeOfHead(scalar.byteCount()) + scalar.byteCount();
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
        putNumber<kUTF16UnitSize>(0xD800 + ((decoded.value - 0x10000) >> 10));
        putNumber<kUTF16UnitSize>(0xDC00 + ((decoded.value - 0x10000) & 0x3FF));
      } else {
        putNumber<kUTF16UnitSize>(decoded.value);
      }
      text.remove_prefix(decoded.length);
    }
  }

  void putScalar(const CatalogueScalar& scalar) {
    switch (scalar.kind()) {
      case ScalarKind::Boolean:
        return putByte(scalar.bits() != 0 ? kMarkerOfTrue : kMarkerOfFalse);
      case ScalarKind::SignedInteger: {
        const std::size_t size = sizeOfInteger(scalar.bits());
        putByte(numberMarker(Kind::Integer, size));
        return putNumber(scalar.bits(), size);
      }
      case ScalarKind::LargeInteger:
        // Eight bytes are signed; a larger number takes sixteen.
        putByte(numberMarker(Kind::Integer, 16));
        putNumber<8>(0);
        return putNumber<8>(scalar.bits());
      case ScalarKind::Real:
        putByte(numberMarker(Kind::Real, 8));
        return putNumber<8>(scalar.bits());
      case ScalarKind::Date:
        putByte(kMarkerOfDate);
        return putNumber<8>(scalar.bits());
      case ScalarKind::Data:
        putHead(Kind::Data, scalar.byteCount());
        return putBytes(scalar.view());
      case ScalarKind::ASCIIText:
        putHead(Kind::ASCIIText, scalar.byteCount());
        return putBytes(scalar.view());
      case ScalarKind::UTF16Text:
        putHead(Kind::UTF16Text, unitCountOf(scalar.view()));
        return putUTF16(scalar.view());
    }
  }

 private:
  char* place_;
};

/// A file to be: containers come first in the count of objects, the outermost as 0, and scalars
/// first in the file.
class File {
 public:
  File(const Catalogue& catalogue, const FileOrder& order) : catalogue_(catalogue), order_(order) {
    // Large enough for the count and for the table's own offset, each one more than the largest
    // number stored: there are readers that ask for that.
    referenceSize_ = sizeToHold(order.objectCount());
    table_ = kHeader.size();
    for (const Catalogue::Reference number : order.scalars()) {
      table_ += sizeOf(catalogue.scalar(number));
    }
    for (const Catalogue::Reference number : order.containers()) {
      const CatalogueContainer& container = catalogue.container(number);
      table_ += sizeOfHead(container.childCount) +
                (container.isDictionary() ? 2 : 1) * container.childCount * referenceSize_;
    }
    offsetSize_ = sizeToHold(table_);
  }

  [[nodiscard]] std::string write(std::string bytes) const {
    const std::size_t trailer = table_ + order_.objectCount() * offsetSize_;
    const std::size_t fileSize = trailer + kTrailerSize;
    if (bytes.capacity() < fileSize) {
      bytes = std::string();
      // The next stage of the same file is often a little larger.
      bytes.reserve(fileSize + fileSize / 16);
    }
    bytes.resize(fileSize);
    std::fill_n(bytes.data() + trailer, kTrailerSize, '\0');
    withConstantSize(offsetSize_, [&](auto size) { writeObjects<size()>(bytes.data()); });
    char* const place = bytes.data() + trailer;
    place[kOffsetSizePosition] = static_cast<char>(offsetSize_);
    place[kReferenceSizePosition] = static_cast<char>(referenceSize_);
    store(place + kObjectCountPosition, order_.objectCount(), 8);
    store(place + kTopObjectPosition, 0, 8);
    store(place + kTablePosition, table_, 8);
    return bytes;
  }

 private:
  template <std::size_t OffsetSize>
  void writeObjects(char* bytes) const {
    Output output(bytes);
    Output containerOffsets(bytes + table_);
    Output scalarOffsets(bytes + table_ + order_.containers().size() * OffsetSize);
    const auto offset = [&] { return static_cast<std::uint64_t>(output.place() - bytes); };
    output.putBytes(kHeader);
    for (const Catalogue::Reference number : order_.scalars()) {
      scalarOffsets.putNumber<OffsetSize>(offset());
      output.putScalar(catalogue_.scalar(number));
    }
    std::vector<const char*> placesOfKeys(catalogue_.keysCount());
    const auto& containers = order_.containers();
    for (auto number = containers.rbegin(); number != containers.rend(); ++number) {
      const CatalogueContainer& container = catalogue_.container(*number);
      containerOffsets.putNumber<OffsetSize>(offset());
      output.putHead(container.isDictionary() ? Kind::Dictionary : Kind::Array,
                     container.childCount);
      if (container.isDictionary()) {
        putKeys(output, container.keys, placesOfKeys[container.keys]);
      }
      putReferences(output, catalogue_.childrenOf(container));
    }
  }

  /// Puts the keys with a number down, as they stand in a place if they were put down before.
  void putKeys(Output& output, std::uint32_t number, const char*& place) const {
    const CatalogueKeys& keys = catalogue_.keys(number);
    if (place != nullptr) {
      return output.putBytes({place, keys.count * referenceSize_});
    }
    place = output.place();
    putReferences(output, catalogue_.referencesOf(keys));
  }

  void putReferences(Output& output, std::span<const Catalogue::Reference> references) const {
    withConstantSize(referenceSize_, [&](auto size) {
      for (const Catalogue::Reference reference : references) {
        output.putNumber<size()>(order_.numberInFile(reference));
      }
    });
  }

  const Catalogue& catalogue_;
  const FileOrder& order_;
  std::size_t referenceSize_ = 0;
  std::size_t offsetSize_ = 0;
  std::size_t table_ = 0;
};

}  // namespace
}  // namespace binaryplist

std::optional<std::string> writeBinaryPropertyList(const PropertyValue& value,
                                                   PropertyListError& error) {
  return BinaryPropertyListWriter().write(value, error);
}

BinaryPropertyListWriter::BinaryPropertyListWriter() = default;

BinaryPropertyListWriter::~BinaryPropertyListWriter() = default;

std::optional<std::string> BinaryPropertyListWriter::write(const PropertyValue& value,
                                                           PropertyListError& error,
                                                           std::string memory) {
  using binaryplist::Catalogue;
  // Kept again only once the value is written: nothing that ends halfway leaves half of it here.
  std::unique_ptr<Catalogue> catalogue = std::move(catalogue_);
  const bool isFirst = catalogue == nullptr;
  if (isFirst) {
    catalogue = std::make_unique<Catalogue>();
  }
  const std::optional<Catalogue::Reference> top = catalogue->add(value, error);
  if (!top) {
    // What was written before may have used up the room for objects.
    return isFirst ? std::nullopt : write(value, error, std::move(memory));
  }
  const binaryplist::FileOrder order(*catalogue, *top);
  std::string bytes = binaryplist::File(*catalogue, order).write(std::move(memory));
  lastValue_ = value;
  // More than as much again that only earlier values had is not worth its memory.
  if (catalogue->objectCount() <= 2 * order.objectCount()) {
    catalogue_ = std::move(catalogue);
  }
  return bytes;
}

}  // namespace accounts
