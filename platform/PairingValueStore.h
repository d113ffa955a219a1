#pragma once

#include <memory>
#include <optional>
#include <string_view>

#include "propertylist/value/PropertyValue.h"

namespace accounts {

/// An open connection to the device-pairing service. Destroying it disconnects.
class PairingConnection {
 public:
  virtual ~PairingConnection() = default;

  /// The value of a key in a domain; without a key, the domain's whole dictionary. None when there
  /// is no such value.
  virtual std::optional<PropertyValue> copyValue(std::string_view domain,
                                                 std::optional<std::string_view> key) = 0;
};

/// Values that the device-pairing service holds by domain and key.
class PairingValueStore {
 public:
  virtual ~PairingValueStore() = default;

  /// Connects to the service; null when it cannot be reached.
  virtual std::unique_ptr<PairingConnection> connect() = 0;
};

}  // namespace accounts
