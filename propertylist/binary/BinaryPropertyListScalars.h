#pragma once

#include <cstddef>
#include <optional>
#include <string_view>

#include "propertylist/PropertyListError.h"
#include "propertylist/binary/BinaryPropertyListFormat.h"
#include "propertylist/value/PropertyValue.h"

namespace accounts::binaryplist {

/// Sets an error of the reader: what is wrong and at which offset of the file. Returns false.
bool failAt(PropertyListError& error, std::string_view what, std::size_t offset);

/// The beginning of one object.
struct ObjectHead {
  Kind kind = Kind::Simple;
  /// The marker's low four bits.
  std::uint8_t detail = 0;
  /// The length that the marker or the number behind it states; 0 for kinds that have none.
  std::uint64_t length = 0;
  /// Where the content begins; never past the end of the objects.
  std::size_t content = 0;
};

/// Reads the head of the object at an offset. `objects` is the file up to the end of its objects;
/// `offset` must be within it. False, with `error` set, for a head that is cut off or malformed.
bool readHead(std::string_view objects, std::size_t offset, ObjectHead& head,
              PropertyListError& error);

/// Reads scalars.
class ScalarReader {
 public:
  /// `objects` as for `readHead`.
  ScalarReader(std::string_view objects, PropertyListError& error)
      : objects_(objects), error_(error) {}

  /// Reads the object whose head was read at an offset and which is no container; `end` becomes
  /// the offset behind its last byte. None, with the error set, for a malformed object or one of
  /// a kind that property lists do not have.
  std::optional<PropertyValue> read(std::size_t offset, const ObjectHead& head, std::size_t& end);

 private:
  using Value = std::optional<PropertyValue>;

  Value fail(std::string_view what, std::size_t offset);
  [[nodiscard]] std::size_t bytesLeft(const ObjectHead& head) const {
    return objects_.size() - head.content;
  }
  Value readInteger(std::size_t offset, const ObjectHead& head, std::size_t& end);
  Value readReal(std::size_t offset, const ObjectHead& head, std::size_t& end);
  Value readDate(std::size_t offset, const ObjectHead& head, std::size_t& end);
  Value readBytes(std::size_t offset, const ObjectHead& head, std::size_t& end);

  std::string_view objects_;
  PropertyListError& error_;
};

}  // namespace accounts::binaryplist
