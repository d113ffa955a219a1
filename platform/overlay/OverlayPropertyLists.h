#pragma once

#include "platform/PropertyLists.h"
#include "platform/overlay/OverlayFileSystem.h"

namespace accounts {

/// The property-list files of an overlay: those in memory are decoded from there, the others are
/// read as they are beneath it.
class OverlayPropertyLists final : public PropertyLists {
 public:
  /// The arguments must outlive this. `beneath` reads the files beneath the overlay.
  OverlayPropertyLists(const OverlayFileSystem& files, PropertyLists& beneath)
      : files_(files), beneath_(beneath) {}

  std::optional<PropertyDictionary> readDictionary(std::string_view path) override;
  Result serializeBinary(const PropertyValue& value, SerializedPropertyList& serialized) override;

 private:
  const OverlayFileSystem& files_;
  PropertyLists& beneath_;
};

}  // namespace accounts
