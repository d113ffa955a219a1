#include "propertylist/binary/BinaryPropertyListScalars.h"

#include <bit>

#include "propertylist/value/GeneralisedUTF8.h"

namespace accounts::binaryplist {

namespace {

/// True for kinds of which the marker states a length.
bool hasLength(Kind kind) {
  switch (kind) {
    case Kind::Data:
    case Kind::ASCIIText:
    case Kind::UTF16Text:
    case Kind::Array:
    case Kind::OrderedSet:
    case Kind::Set:
    case Kind::Dictionary:
      return true;
    default:
      return false;
  }
}

/// An unpaired unit is kept as its generalised sequence.
std::string textOfUTF16(std::string_view bytes) {
  std::string text;
  text.reserve(bytes.size());
  for (std::size_t index = 0; index < bytes.size(); index += kUTF16UnitSize) {
    auto codePoint = static_cast<char32_t>(load(bytes.data() + index, kUTF16UnitSize));
    const std::size_t next = index + kUTF16UnitSize;
    if (isHighSurrogate(codePoint) && next < bytes.size()) {
      const auto second = static_cast<char32_t>(load(bytes.data() + next, kUTF16UnitSize));
      if (isLowSurrogate(second)) {
        codePoint = 0x10000 + ((codePoint & 0x3FF) << 10 | (second & 0x3FF));
        index = next;
      }
    }
    appendCodePoint(text, codePoint);
  }
  return text;
}

std::string_view nameOfRefusedKind(Kind kind, std::uint8_t detail) {
  switch (kind) {
    case Kind::UID:
      return "a UID, which no property list of ours has";
    case Kind::OrderedSet:
      return "an ordered set, which no property list of ours has";
    case Kind::Set:
      return "a set, which no property list of ours has";
    case Kind::Simple:
      switch (detail) {
        case 0x0:
          return "a null, which no property list of ours has";
        case 0xC:
        case 0xD:
          return "a URL, which no property list of ours has";
        case 0xE:
          return "a UUID, which no property list of ours has";
        case 0xF:
          return "a fill byte in place of an object";
        default:
          return "an object of unknown kind";
      }
    default:
      return "an object of unknown kind";
  }
}

}  // namespace

bool failAt(PropertyListError& error, std::string_view what, std::size_t offset) {
  error.text = "binary property list: ";
  error.text.append(what).append(" at byte offset ").append(std::to_string(offset));
  return false;
}

bool readHead(std::string_view objects, std::size_t offset, ObjectHead& head,
              PropertyListError& error) {
  const auto marker = static_cast<std::uint8_t>(objects[offset]);
  head = {kindOf(marker), detailOf(marker), 0, offset + 1};
  if (!hasLength(head.kind)) {
    return true;
  }
  if (head.detail != kLengthFollows) {
    head.length = head.detail;
    return true;
  }
  if (head.content == objects.size()) {
    return failAt(error, "an object whose length is cut off", offset);
  }
  const auto lengthMarker = static_cast<std::uint8_t>(objects[head.content]);
  if (kindOf(lengthMarker) != Kind::Integer || detailOf(lengthMarker) > kLogarithmOf8Bytes) {
    return failAt(error, "an object whose length is no integer of 1 to 8 bytes", offset);
  }
  const std::size_t size = std::size_t{1} << detailOf(lengthMarker);
  ++head.content;
  if (size > objects.size() - head.content) {
    return failAt(error, "an object whose length is cut off", offset);
  }
  head.length = load(objects.data() + head.content, size);
  head.content += size;
  return true;
}

ScalarReader::Value ScalarReader::fail(std::string_view what, std::size_t offset) {
  failAt(error_, what, offset);
  return std::nullopt;
}

ScalarReader::Value ScalarReader::read(std::size_t offset, const ObjectHead& head,
                                       std::size_t& end) {
  switch (head.kind) {
    case Kind::ASCIIText:
    case Kind::UTF16Text:
    case Kind::Data:
      return readBytes(offset, head, end);
    case Kind::Integer:
      return readInteger(offset, head, end);
    case Kind::Real:
      return readReal(offset, head, end);
    case Kind::Date:
      return readDate(offset, head, end);
    case Kind::Simple:
      if (head.detail == kMarkerOfFalse || head.detail == kMarkerOfTrue) {
        end = head.content;
        return head.detail == kMarkerOfTrue;
      }
      break;
    default:
      break;
  }
  return fail(nameOfRefusedKind(head.kind, head.detail), offset);
}

ScalarReader::Value ScalarReader::readInteger(std::size_t offset, const ObjectHead& head,
                                              std::size_t& end) {
  if (head.detail > kLogarithmOf8Bytes + 1) {
    return fail("an integer of more than 16 bytes", offset);
  }
  const std::size_t size = std::size_t{1} << head.detail;
  if (size > bytesLeft(head)) {
    return fail("an integer that ends beyond the objects", offset);
  }
  const char* bytes = objects_.data() + head.content;
  end = head.content + size;
  if (size < 8) {
    return load(bytes, size);
  }
  if (size == 8) {
    return static_cast<std::int64_t>(load(bytes, 8));
  }
  const std::uint64_t high = load(bytes, 8);
  const std::uint64_t low = load(bytes + 8, 8);
  const auto lowAsSigned = static_cast<std::int64_t>(low);
  if (high == 0) {
    return low;
  }
  if (high == ~std::uint64_t{0} && lowAsSigned < 0) {
    return lowAsSigned;
  }
  return fail("an integer that needs more than 64 bits", offset);
}

ScalarReader::Value ScalarReader::readReal(std::size_t offset, const ObjectHead& head,
                                           std::size_t& end) {
  constexpr unsigned kLogarithmOf4Bytes = 2;
  if (head.detail != kLogarithmOf4Bytes && head.detail != kLogarithmOf8Bytes) {
    return fail("a real of neither 4 nor 8 bytes", offset);
  }
  const std::size_t size = std::size_t{1} << head.detail;
  if (size > bytesLeft(head)) {
    return fail("a real that ends beyond the objects", offset);
  }
  end = head.content + size;
  const std::uint64_t bits = load(objects_.data() + head.content, size);
  return head.detail == kLogarithmOf8Bytes
             ? std::bit_cast<double>(bits)
             : double{std::bit_cast<float>(static_cast<std::uint32_t>(bits))};
}

ScalarReader::Value ScalarReader::readDate(std::size_t offset, const ObjectHead& head,
                                           std::size_t& end) {
  constexpr std::size_t kSize = 8;
  if (head.detail != kLogarithmOf8Bytes) {
    return fail("a date of other than 8 bytes", offset);
  }
  if (kSize > bytesLeft(head)) {
    return fail("a date that ends beyond the objects", offset);
  }
  end = head.content + kSize;
  return PropertyDate{std::bit_cast<double>(load(objects_.data() + head.content, kSize))};
}

ScalarReader::Value ScalarReader::readBytes(std::size_t offset, const ObjectHead& head,
                                            std::size_t& end) {
  const std::size_t unitSize = head.kind == Kind::UTF16Text ? kUTF16UnitSize : 1;
  // Divided, not multiplied: a length of 2^63 units must not wrap round.
  if (head.length > bytesLeft(head) / unitSize) {
    return fail("a text or data that ends beyond the objects", offset);
  }
  const std::string_view bytes = objects_.substr(head.content, head.length * unitSize);
  end = head.content + bytes.size();
  if (head.kind == Kind::Data) {
    return PropertyData(bytes);
  }
  if (head.kind == Kind::UTF16Text) {
    return Text(textOfUTF16(bytes));
  }
  if (!isASCII(bytes)) {
    return fail("an ASCII text with bytes that are not ASCII", offset);
  }
  return Text(bytes);
}

}  // namespace accounts::binaryplist
