#pragma once

#include <optional>
#include <string_view>

#include "propertylist/value/PropertyValue.h"

namespace accounts {

/// Reads the preferences of applications.
class PreferenceDomain {
 public:
  virtual ~PreferenceDomain() = default;

  /// Makes later reads of a domain see what other processes wrote to it.
  virtual void synchronize(std::string_view domain) = 0;
  /// The value of a key in a domain; none when the key or the whole domain is missing.
  virtual std::optional<PropertyValue> copyValue(std::string_view key, std::string_view domain) = 0;
};

}  // namespace accounts
