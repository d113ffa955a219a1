#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <string_view>

/// The layout that the reader and the writer of binary property lists share: a header, the encoded
/// objects, a table with each object's offset, and a trailer. Every number is big-endian. An object
/// begins with a marker: its kind in the high four bits, a length or a detail in the low four.
namespace accounts::binaryplist {

inline constexpr std::string_view kSignature = "bplist";
inline constexpr std::string_view kHeader = "bplist00";

/// The trailer: six bytes without meaning here, then the size of an entry of the offset table, the
/// size of a reference, and three eight-byte numbers: object count, top object, offset of the
/// table.
inline constexpr std::size_t kTrailerSize = 32;
inline constexpr std::size_t kOffsetSizePosition = 6;
inline constexpr std::size_t kReferenceSizePosition = 7;
inline constexpr std::size_t kObjectCountPosition = 8;
inline constexpr std::size_t kTopObjectPosition = 16;
inline constexpr std::size_t kTablePosition = 24;

/// The size of a unit of a UTF-16 text.
inline constexpr std::size_t kUTF16UnitSize = 2;

/// Kinds, as the marker's high four bits.
enum class Kind : std::uint8_t {
  Simple = 0x0,
  Integer = 0x1,
  Real = 0x2,
  Date = 0x3,
  Data = 0x4,
  ASCIIText = 0x5,
  UTF16Text = 0x6,
  UID = 0x8,
  Array = 0xA,
  OrderedSet = 0xB,
  Set = 0xC,
  Dictionary = 0xD
};

inline constexpr std::uint8_t kMarkerOfFalse = 0x08;
inline constexpr std::uint8_t kMarkerOfTrue = 0x09;
/// The low four bits that say that the length follows as an integer object of its own.
inline constexpr std::uint8_t kLengthFollows = 0xF;
/// Reals and integers: the low four bits are the size's binary logarithm.
inline constexpr unsigned kLogarithmOf8Bytes = 3;

constexpr std::uint8_t marker(Kind kind, std::size_t detail) {
  return static_cast<std::uint8_t>(static_cast<unsigned>(kind) << 4 | detail);
}
constexpr Kind kindOf(std::uint8_t marker) {
  return static_cast<Kind>(marker >> 4);
}
constexpr std::uint8_t detailOf(std::uint8_t marker) {
  return marker & 0xF;
}

/// The unsigned number in `size` bytes, from 1 to 8.
inline std::uint64_t load(const char* bytes, std::size_t size) {
  switch (size) {
    case 1:
      return static_cast<unsigned char>(*bytes);
    case 2: {
      std::uint16_t number;
      std::memcpy(&number, bytes, sizeof number);
      return __builtin_bswap16(number);
    }
    case 4: {
      std::uint32_t number;
      std::memcpy(&number, bytes, sizeof number);
      return __builtin_bswap32(number);
    }
    case 8: {
      std::uint64_t number;
      std::memcpy(&number, bytes, sizeof number);
      return __builtin_bswap64(number);
    }
    default: {
      std::uint64_t number = 0;
      for (std::size_t index = 0; index < size; ++index) {
        number = number << 8 | static_cast<unsigned char>(bytes[index]);
      }
      return number;
    }
  }
}

/// Stores the low `size` bytes of a number, 1, 2, 4 or 8.
inline void store(char* bytes, std::uint64_t number, std::size_t size) {
  const std::uint64_t leading = __builtin_bswap64(number << (64 - 8 * size));
  std::memcpy(bytes, &leading, size);
}

/// The smallest of the sizes 1, 2, 4 and 8 that holds a number.
constexpr std::size_t sizeToHold(std::uint64_t number) {
  return number <= 0xFF ? 1 : number <= 0xFFFF ? 2 : number <= 0xFFFFFFFF ? 4 : 8;
}

}  // namespace accounts::binaryplist
