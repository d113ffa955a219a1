#include "propertylist/binary/BinaryPropertyListFile.h"

#include <algorithm>
#include <array>
#include <bit>
#include <memory>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "propertylist/PropertyListLimits.h"
#include "propertylist/binary/BinaryPropertyListFormat.h"
#include "propertylist/binary/BinaryPropertyListObjects.h"
#include "propertylist/value/GeneralisedUTF8.h"

namespace accounts::binaryplist {

namespace {

/// Small enough to stay in the processor's caches until it is taken, and so large that a kernel
/// that takes it for a file asks for few and large pages.
constexpr std::size_t kPieceSize = std::size_t{512} << 10;

/// Puts objects down one behind the other in a piece of memory, and passes it on when it is full.
class Output {
 public:
  explicit Output(const SerializedPropertyList::Taker& take) : take_(take) {}

  /// How many bytes were put down.
  [[nodiscard]] std::size_t count() const { return passedOn_ + size_; }
  /// Whether no more bytes are wanted, or more than a file may have.
  [[nodiscard]] bool isRefused() const { return isRefused_; }

  void passOn() {
    isRefused_ = isRefused_ || count() > kMaximumFileSize || !take_({piece_.get(), size_});
    passedOn_ += std::exchange(size_, 0);
  }

  void putByte(std::uint8_t byte) { *takeRoom(1) = static_cast<char>(byte); }
  /// Stores eight bytes whatever the size, which spares a look at it for each of millions of
  /// references: what comes next replaces those that are too many.
  void putNumber(std::uint64_t number, std::size_t size) {
    store(takeRoom(size), number << (64 - 8 * size), kLargestNumber);
  }

  /// Fewer bytes than eight are unsigned, so a negative number, large as unsigned, takes all eight.
  void putInteger(std::uint64_t bits) {
    const std::size_t size = sizeToHold(bits);
    putByte(marker(Kind::Integer, static_cast<std::size_t>(std::countr_zero(size))));
    putNumber(bits, size);
  }

  void putHead(Kind kind, std::size_t length) {
    if (length < kLengthFollows) {
      putByte(marker(kind, length));
    } else {
      putByte(marker(kind, kLengthFollows));
      putInteger(length);
    }
  }

  void putBytes(std::string_view bytes) {
    while (!bytes.empty()) {
      if (size_ == kPieceSize) {
        passOn();
      }
      const std::size_t count = std::min(bytes.size(), kPieceSize - size_);
      std::copy_n(bytes.data(), count, takeRoom(count));
      bytes.remove_prefix(count);
    }
  }

 private:
  static constexpr std::size_t kLargestNumber = 8;

  /// `size` is much less than a piece's, or no more than is left of this one.
  char* takeRoom(std::size_t size) {
    if (kPieceSize - size_ < size) {
      passOn();
    }
    return piece_.get() + std::exchange(size_, size_ + size);
  }

  const SerializedPropertyList::Taker& take_;
  std::unique_ptr<char[]> piece_ =
      std::make_unique_for_overwrite<char[]>(kPieceSize + kLargestNumber);
  std::size_t size_ = 0;
  std::size_t passedOn_ = 0;
  bool isRefused_ = false;
};

/// A text as units of two bytes each.
std::string utf16Of(std::string_view text) {
  std::string units;
  units.reserve(kUTF16UnitSize * text.size());
  const auto append = [&units](char32_t unit) {
    units.push_back(static_cast<char>(unit >> 8));
    units.push_back(static_cast<char>(unit));
  };
  while (!text.empty()) {
    const DecodedCodePoint decoded = decodeCodePoint(text);
    if (decoded.value >= 0x10000) {
      append(0xD800 + ((decoded.value - 0x10000) >> 10));
      append(0xDC00 + ((decoded.value - 0x10000) & 0x3FF));
    } else {
      append(decoded.value);
    }
    text.remove_prefix(decoded.length);
  }
  return units;
}

void putText(Output& output, std::string_view text) {
  if (isASCII(text)) {
    output.putHead(Kind::ASCIIText, text.size());
    return output.putBytes(text);
  }
  const std::string units = utf16Of(text);
  output.putHead(Kind::UTF16Text, units.size() / kUTF16UnitSize);
  output.putBytes(units);
}

void putScalar(Output& output, const Scalar& scalar) {
  switch (scalar.kind) {
    case Kind::Simple:
      return output.putByte(scalar.bits != 0 ? kMarkerOfTrue : kMarkerOfFalse);
    case Kind::Integer:
      if (scalar.byteCount == sizeof scalar.bits) {
        return output.putInteger(scalar.bits);
      }
      // Eight bytes are signed; a larger number takes sixteen.
      output.putByte(marker(Kind::Integer, kLogarithmOf8Bytes + 1));
      output.putNumber(0, sizeof scalar.bits);
      return output.putNumber(scalar.bits, sizeof scalar.bits);
    case Kind::Real:
    case Kind::Date:
      output.putByte(marker(scalar.kind, kLogarithmOf8Bytes));
      return output.putNumber(scalar.bits, sizeof scalar.bits);
    case Kind::Data:
      output.putHead(Kind::Data, scalar.byteCount);
      return output.putBytes(scalar.view());
    default:
      return putText(output, scalar.view());
  }
}

void putContainer(Output& output, const Objects& objects, const Objects::Container& container,
                  std::size_t referenceSize) {
  const std::span<const Objects::Reference> references = objects.referencesOf(container);
  if (container.isDictionary) {
    output.putHead(Kind::Dictionary, references.size() / 2);
  } else {
    output.putHead(Kind::Array, references.size());
  }
  const std::size_t containerCount = objects.containers().size();
  for (const Objects::Reference reference : references) {
    const bool isContainer = (reference & Objects::kContainerBit) != 0;
    output.putNumber(isContainer ? containerCount - 1 - (reference & ~Objects::kContainerBit)
                                 : containerCount + reference,
                     referenceSize);
  }
}

void putTableAndTrailer(Output& output, const std::vector<std::uint32_t>& offsets,
                        std::size_t referenceSize) {
  const std::size_t table = output.count();
  // Large enough for the table's own offset, as a reference is for the count of objects, each one
  // more than the largest number stored: there are readers that ask for that.
  const std::size_t offsetSize = sizeToHold(table);
  for (const std::uint32_t offset : offsets) {
    output.putNumber(offset, offsetSize);
  }
  // The top object is the first: its number is 0, as everything is that is not set here.
  std::array<char, kTrailerSize> trailer = {};
  trailer[kOffsetSizePosition] = static_cast<char>(offsetSize);
  trailer[kReferenceSizePosition] = static_cast<char>(referenceSize);
  store(trailer.data() + kObjectCountPosition, offsets.size(), 8);
  store(trailer.data() + kTablePosition, table, 8);
  output.putBytes({trailer.data(), trailer.size()});
}

}  // namespace

bool giveFile(const PropertyValue& value, const SerializedPropertyList::Taker& take) {
  const Objects objects(value);
  if (objects.count() > kMaximumObjectCount) {
    return false;
  }
  const std::size_t referenceSize = sizeToHold(objects.count());
  static_assert(kMaximumFileSize < UINT32_MAX);
  std::vector<std::uint32_t> offsets(objects.count());
  auto offset = offsets.begin() + static_cast<std::ptrdiff_t>(objects.containers().size());
  Output output(take);
  output.putBytes(kHeader);
  for (const Scalar& scalar : objects.scalars()) {
    *offset++ = static_cast<std::uint32_t>(output.count());
    putScalar(output, scalar);
    if (output.isRefused()) {
      return false;
    }
  }
  offset = offsets.begin();
  for (auto container = objects.containers().rbegin(); container != objects.containers().rend();
       ++container) {
    *offset++ = static_cast<std::uint32_t>(output.count());
    putContainer(output, objects, *container, referenceSize);
    if (output.isRefused()) {
      return false;
    }
  }
  putTableAndTrailer(output, offsets, referenceSize);
  output.passOn();
  return !output.isRefused() &&
         objects.expandedCount() <= maximumExpandedValueCount(output.count()) &&
         objects.repeatedContainerCount() <= maximumRepeatedContainerCount(output.count());
}

}  // namespace accounts::binaryplist
