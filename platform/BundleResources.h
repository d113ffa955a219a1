#pragma once

#include <optional>
#include <string_view>

#include "propertylist/value/PropertyValue.h"

namespace accounts {

/// The resources that travel inside the plug-in's bundle.
class BundleResources {
 public:
  virtual ~BundleResources() = default;

  /// Whether the bundle holds the resource `name` of type "plist".
  virtual bool hasPropertyList(std::string_view name) = 0;
  /// The dictionary that the resource `name` of type "plist" holds; none when it is missing,
  /// unreadable or no dictionary.
  virtual std::optional<PropertyDictionary> readPropertyList(std::string_view name) = 0;
};

}  // namespace accounts
