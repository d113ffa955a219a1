#include "propertylist/BinaryPropertyListFile.h"

#include <algorithm>
#include <array>
#include <bit>
#include <string>
#include <string_view>
#include <type_traits>
#include <utility>
#include <vector>

#include "propertylist/BinaryPropertyListFormat.h"
#include "propertylist/GeneralisedUTF8.h"

namespace accounts::binaryplist {

namespace {

/// Small enough to stay in the processor's caches until it is taken, and so large that a kernel
/// that takes it for a file asks for few and large pages.
constexpr std::size_t kPieceSize = std::size_t{512} << 10;

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

}  // namespace

/// The encoded references of keys, which are found once for all dictionaries that have them.
class File::EncodedKeys {
 public:
  explicit EncodedKeys(const File& file)
      : file_(file), places_(file.catalogue_.keysCount(), kNotYet) {}

  /// Those with a number of the catalogue's, valid until the next call.
  [[nodiscard]] std::string_view withNumber(std::uint32_t number) {
    const CatalogueKeys& keys = file_.catalogue_.keys(number);
    const std::size_t size = keys.count * file_.referenceSize_;
    std::size_t& place = places_[number];
    if (place == kNotYet) {
      place = bytes_.size();
      bytes_.resize(place + size);
      file_.storeReferences(bytes_.data() + place, file_.catalogue_.referencesOf(keys));
    }
    return std::string_view(bytes_).substr(place, size);
  }

 private:
  static constexpr std::size_t kNotYet = SIZE_MAX;
  const File& file_;
  /// By number.
  std::vector<std::size_t> places_;
  std::string bytes_;
};

/// Puts objects down one behind the other in a piece of memory, and passes it on when it is full.
class Output {
 public:
  /// The piece has room for a trailer at least. The arguments must outlive this.
  Output(std::span<char> piece, const SerializedPropertyList::Taker& take)
      : begin_(piece.data()), place_(begin_), end_(begin_ + piece.size()), take_(take) {}

  /// How many bytes were put down.
  [[nodiscard]] std::size_t count() const {
    return passedOn_ + static_cast<std::size_t>(place_ - begin_);
  }
  /// Whether no more bytes are wanted.
  [[nodiscard]] bool isRefused() const { return isRefused_; }

  void passOn() {
    const std::string_view piece(begin_, static_cast<std::size_t>(place_ - begin_));
    passedOn_ += piece.size();
    place_ = begin_;
    isRefused_ = isRefused_ || !take_(piece);
  }

  /// Room for some of a number of things of one size, one at least: where it is, and how many
  /// they are.
  std::pair<char*, std::size_t> takeRoom(std::size_t count, std::size_t size) {
    if (count * size > room()) {
      makeRoom(size);
      count = std::min(count, room() / size);
    }
    return {std::exchange(place_, place_ + count * size), count};
  }

  void putByte(std::uint8_t byte) {
    makeRoom(1);
    *place_++ = static_cast<char>(byte);
  }

  template <std::size_t Size>
  void putNumber(std::uint64_t number) {
    makeRoom(Size);
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

  void putBytes(std::string_view bytes) {
    while (!bytes.empty()) {
      const auto [place, count] = takeRoom(bytes.size(), 1);
      std::copy_n(bytes.data(), count, place);
      bytes.remove_prefix(count);
    }
  }

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
  void makeRoom(std::size_t size) {
    if (room() < size) {
      passOn();
    }
  }
  [[nodiscard]] std::size_t room() const { return static_cast<std::size_t>(end_ - place_); }

  char* begin_;
  char* place_;
  char* end_;
  std::size_t passedOn_ = 0;
  bool isRefused_ = false;
  const SerializedPropertyList::Taker& take_;
};

File::File(const Catalogue& catalogue, Catalogue::Reference top)
    : catalogue_(catalogue),
      order_(catalogue, top),
      // Large enough for the count and, below, for the table's own offset, each one more than the
      // largest number stored: there are readers that ask for that.
      referenceSize_(sizeToHold(order_.objectCount())),
      table_(kHeader.size()) {
  for (const Catalogue::Reference number : order_.scalars()) {
    table_ += sizeOf(catalogue.scalar(number));
  }
  for (const Catalogue::Reference number : order_.containers()) {
    const CatalogueContainer& container = catalogue.container(number);
    table_ += sizeOfHead(container.childCount) +
              (container.isDictionary() ? 2 : 1) * container.childCount * referenceSize_;
  }
  offsetSize_ = sizeToHold(table_);
}

std::size_t File::size() const {
  return table_ + objectCount() * offsetSize_ + kTrailerSize;
}

bool File::giveTo(const SerializedPropertyList::Taker& take) const {
  std::string piece(std::min(size(), kPieceSize), '\0');
  Output output(piece, take);
  write(output);
  return !output.isRefused();
}

void File::write(Output& output) const {
  withConstantSize(offsetSize_, [&](auto size) { writeObjectsAndTable<size()>(output); });
  std::array<char, kTrailerSize> trailer = {};
  trailer[kOffsetSizePosition] = static_cast<char>(offsetSize_);
  trailer[kReferenceSizePosition] = static_cast<char>(referenceSize_);
  store(trailer.data() + kObjectCountPosition, objectCount(), 8);
  store(trailer.data() + kTopObjectPosition, 0, 8);
  store(trailer.data() + kTablePosition, table_, 8);
  output.putBytes({trailer.data(), trailer.size()});
  output.passOn();
}

template <std::size_t OffsetSize>
void File::writeObjectsAndTable(Output& output) const {
  std::string table(objectCount() * OffsetSize, '\0');
  char* containerOffset = table.data();
  char* scalarOffset = containerOffset + order_.containers().size() * OffsetSize;
  const auto noteOffset = [&output](char*& place) {
    store(place, output.count(), OffsetSize);
    place += OffsetSize;
  };
  output.putBytes(kHeader);
  for (const Catalogue::Reference number : order_.scalars()) {
    noteOffset(scalarOffset);
    output.putScalar(catalogue_.scalar(number));
    if (output.isRefused()) {
      return;
    }
  }
  EncodedKeys encodedKeys(*this);
  const auto& containers = order_.containers();
  for (auto number = containers.rbegin(); number != containers.rend(); ++number) {
    noteOffset(containerOffset);
    const CatalogueContainer& container = catalogue_.container(*number);
    output.putHead(container.isDictionary() ? Kind::Dictionary : Kind::Array, container.childCount);
    if (container.isDictionary()) {
      output.putBytes(encodedKeys.withNumber(container.keys));
    }
    putReferences(output, catalogue_.childrenOf(container));
    if (output.isRefused()) {
      return;
    }
  }
  output.putBytes(table);
}

void File::putReferences(Output& output, std::span<const Catalogue::Reference> references) const {
  while (!references.empty()) {
    const auto [place, count] = output.takeRoom(references.size(), referenceSize_);
    storeReferences(place, references.first(count));
    references = references.subspan(count);
  }
}

void File::storeReferences(char* place, std::span<const Catalogue::Reference> references) const {
  withConstantSize(referenceSize_, [&](auto size) {
    for (const Catalogue::Reference reference : references) {
      store(place, order_.numberInFile(reference), size());
      place += size();
    }
  });
}

}  // namespace accounts::binaryplist
