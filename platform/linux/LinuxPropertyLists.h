#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "platform/PropertyLists.h"
#include "platform/linux/BytesDigest.h"
#include "platform/linux/DeviceRoot.h"
#include "platform/linux/PathError.h"
#include "propertylist/BinaryPropertyList.h"

namespace accounts {

/// The property-list files beneath a device root, which must outlive this. The digest of the bytes
/// that were read or given away last is remembered with their value: a file that is found to have
/// it again, as every save finds the file of the save before, is read but not decoded.
class LinuxPropertyLists final : public PropertyLists {
 public:
  explicit LinuxPropertyLists(const DeviceRoot& root) : root_(root) {}

  std::optional<PropertyDictionary> readDictionary(std::string_view path) override;
  Result serializeBinary(const PropertyValue& value, BytesInPieces& bytes) override;

  /// Like `readDictionary`, and says in `error` why there is none: `error.isMissing()` tells a
  /// missing file from an unreadable one.
  std::optional<PropertyDictionary> readDictionary(std::string_view path, PathError& error);

 private:
  /// What is known of bytes that are not kept.
  struct KnownBytes {
    PropertyDictionary value;
    std::size_t size = 0;
    BytesDigest::Value digest;
  };

  std::optional<PropertyDictionary> decode(const std::optional<std::string>& bytes,
                                           std::string_view path, PathError& error);
  /// Bytes that are remembered with the value that they stand for once they are given away.
  BytesInPieces remembering(const PropertyDictionary& value, const BytesInPieces& bytes);

  const DeviceRoot& root_;
  BinaryPropertyListWriter writer_;
  /// None when nothing can be remembered.
  std::optional<DigestSecret> secret_ = DigestSecret::makeRandom();
  std::optional<KnownBytes> remembered_;
};

}  // namespace accounts
