#pragma once

#include <gtest/gtest.h>

#include <cstdint>
#include <limits>
#include <string>
#include <string_view>
#include <vector>

#include "propertylist/binary/BinaryPropertyList.h"
#include "propertylist/value/SerializedPropertyList.h"
#include "propertylist/xml/XMLPropertyList.h"

namespace accounts {

inline constexpr double kInfinity = std::numeric_limits<double>::infinity();
inline constexpr double kNaN = std::numeric_limits<double>::quiet_NaN();

// Markers of containers in binary files.
inline constexpr char kArrayOfOne = '\xA1';
inline constexpr char kArrayOfTwo = '\xA2';
inline constexpr char kArrayOfFourteen = '\xAE';
inline constexpr char kDictionaryOfOne = '\xD1';

/// Makes binary property lists object by object, right ones and wrong ones.
class BinaryFile {
 public:
  /// Adds an object as it stands in the file; returns its number.
  std::size_t add(std::string_view encoded) {
    offsets_.push_back(bytes_.size());
    bytes_.append(encoded);
    return offsets_.size() - 1;
  }

  /// Adds an array or dictionary with the given marker, whose references are one byte each.
  std::size_t addContainer(char marker, const std::vector<std::size_t>& references) {
    std::string encoded(1, marker);
    for (const std::size_t reference : references) {
      encoded.push_back(static_cast<char>(reference));
    }
    return add(encoded);
  }

  void setOffset(std::size_t object, std::uint64_t offset) { offsets_.at(object) = offset; }
  void setTopObject(std::uint64_t object) { topObject_ = object; }
  void setReferenceSize(std::size_t size) { referenceSize_ = size; }
  void setOffsetSize(std::size_t size) { offsetSize_ = size; }

  /// The file, its top object the last one added unless another was set.
  [[nodiscard]] std::string build() const {
    std::string file = bytes_;
    for (const std::uint64_t offset : offsets_) {
      appendNumber(file, offset, offsetSize_);
    }
    file.append(6, '\0');
    file.push_back(static_cast<char>(offsetSize_));
    file.push_back(static_cast<char>(referenceSize_));
    appendNumber(file, offsets_.size(), 8);
    appendNumber(file, topObject_ != kLastObject ? topObject_ : offsets_.size() - 1, 8);
    appendNumber(file, bytes_.size(), 8);
    return file;
  }

  static void appendNumber(std::string& bytes, std::uint64_t number, std::size_t size) {
    while (size > 0) {
      --size;
      bytes.push_back(size < 8 ? static_cast<char>(number >> (8 * size) & 0xFF) : '\0');
    }
  }

 private:
  static constexpr std::uint64_t kLastObject = ~std::uint64_t{0};

  std::string bytes_ = "bplist00";
  std::vector<std::uint64_t> offsets_;
  std::uint64_t topObject_ = kLastObject;
  std::size_t referenceSize_ = 1;
  std::size_t offsetSize_ = 8;
};

/// A file whose only object is the given one.
inline std::string fileWithObject(std::string_view encoded) {
  BinaryFile file;
  file.add(encoded);
  return file.build();
}

/// The value of a file that must be readable.
inline PropertyValue readBinary(std::string_view bytes) {
  auto value = readBinaryPropertyList(bytes);
  EXPECT_TRUE(value) << value.error().text;
  return value.value_or(PropertyValue("unreadable"));
}

/// The error of a file that must not be readable.
inline std::string errorOfReadingBinary(std::string_view bytes) {
  const auto value = readBinaryPropertyList(bytes);
  EXPECT_FALSE(value);
  return value ? "" : value.error().text;
}

inline std::string writeBinary(const PropertyValue& value) {
  auto bytes = writeBinaryPropertyList(value);
  EXPECT_TRUE(bytes) << bytes.error().text;
  return bytes.value_or("");
}

inline std::vector<std::string> piecesOf(const SerializedPropertyList& serialized) {
  std::vector<std::string> pieces;
  EXPECT_TRUE(serialized.giveTo([&pieces](std::string_view piece) {
    pieces.emplace_back(piece);
    return true;
  }));
  return pieces;
}

/// A number in a binary file's trailer.
inline std::uint64_t trailerNumber(std::string_view file, std::size_t position, std::size_t size) {
  std::uint64_t number = 0;
  for (const char byte : file.substr(file.size() - 32 + position, size)) {
    number = number << 8 | static_cast<unsigned char>(byte);
  }
  return number;
}

/// How many objects a binary file says it has.
inline std::uint64_t objectCount(std::string_view file) {
  return trailerNumber(file, 8, 8);
}

inline std::string writeXML(const PropertyValue& value) {
  auto bytes = writeXMLPropertyList(value);
  EXPECT_TRUE(bytes) << bytes.error().text;
  return bytes.value_or("");
}

inline std::string inPropertyList(std::string_view content) {
  return "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<plist version=\"1.0\">" +
         std::string(content) + "</plist>\n";
}

inline PropertyValue readXML(std::string_view bytes) {
  auto value = readXMLPropertyList(bytes);
  EXPECT_TRUE(value) << value.error().text;
  return value.value_or(PropertyValue("unreadable"));
}

inline std::string errorOfReadingXML(std::string_view bytes) {
  const auto value = readXMLPropertyList(bytes);
  EXPECT_FALSE(value);
  return value ? "" : value.error().text;
}

/// A value with every kind in it, the awkward ones of each too.
PropertyValue valueOfEveryKind();
/// The same without what XML cannot hold.
PropertyValue valueOfEveryKindInXML();

/// An array in an array and so on; `depth` 1 is an empty array alone.
PropertyValue nestedArrays(std::size_t depth);

/// Passes when the text contains the part, and its last word as a whole; prints both otherwise.
testing::AssertionResult contains(std::string_view text, std::string_view part);

}  // namespace accounts
