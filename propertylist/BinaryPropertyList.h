#pragma once

#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include "propertylist/BytesInPieces.h"
#include "propertylist/PropertyListError.h"
#include "propertylist/PropertyValue.h"

namespace accounts {

/// Whether bytes begin as a binary property list does.
bool isBinaryPropertyList(std::string_view bytes);

/// The value that a binary property list, version 1.0 ("bplist00"), holds. None, with `error`
/// saying what is wrong and at which offset, when the bytes are malformed or pass one of the limits
/// in PropertyListLimits.h.
std::optional<PropertyValue> readBinaryPropertyList(std::string_view bytes,
                                                    PropertyListError& error);

/// A value as a binary property list, each distinct scalar and container written once. The same
/// value always gives the same bytes. None, with `error` saying why, for a value that the reader
/// would not take back.
std::optional<std::string> writeBinaryPropertyList(const PropertyValue& value,
                                                   PropertyListError& error);

namespace binaryplist {
class Catalogue;
class File;
}  // namespace binaryplist

/// Writes values that have most of their parts in common, such as the stages of one file: it
/// remembers what it has met, so that a part in the same memory as before costs little more than
/// the copying of its bytes, and a value that is equal to the last one nothing. The bytes are those
/// of `writeBinaryPropertyList`. It keeps the value that it wrote last alive, and the texts and
/// data of earlier ones.
class BinaryPropertyListWriter {
 public:
  BinaryPropertyListWriter();
  BinaryPropertyListWriter(const BinaryPropertyListWriter&) = delete;
  BinaryPropertyListWriter& operator=(const BinaryPropertyListWriter&) = delete;
  ~BinaryPropertyListWriter();

  /// The bytes of a value, made whenever they are asked for and valid until the next call. None,
  /// with `error` saying why, for a value that the reader would not take back.
  std::optional<BytesInPieces> write(const PropertyValue& value, PropertyListError& error);

 private:
  /// Null when nothing is remembered.
  std::unique_ptr<binaryplist::Catalogue> catalogue_;
  std::optional<PropertyValue> lastValue_;
  /// That of the last value; null when it could not be written.
  std::unique_ptr<binaryplist::File> file_;
};

}  // namespace accounts
