#pragma once

#include <string>
#include <string_view>

#include "platform/Platform.h"
#include "propertylist/value/PropertyValue.h"
#include "safetynet/ToldFates.h"

namespace accounts {

/// What of a device decides which keys the rules change.
struct DeviceFacts {
  /// The keys that the cloud account's own framework supplies.
  std::string cloudStatusKey = {};
  std::string cloudPrimaryAccountKey = {};
  /// Whether the device has the oldest processor, on which notes are kept on the device.
  bool hasOldestProcessor = false;
};

/// Those of the device that a platform stands for.
DeviceFacts factsOf(const Platform& platform);

/// Knows which keys of an account the rules of a migration may have changed.
class ChangedKeys {
 public:
  /// Both must outlive this.
  ChangedKeys(const ToldFates& told, const DeviceFacts& facts) : told_(told), facts_(facts) {}

  /// Whether a value under a key of a top-level account may be another one, be gone or be new.
  /// `before` is the account as it was, under today's keys, `after` as it is.
  [[nodiscard]] bool mayDiffer(std::string_view key, AccountOrigin::Kind origin,
                               const PropertyDictionary& before,
                               const PropertyDictionary& after) const;

  /// The same for a child of a top-level account.
  [[nodiscard]] bool mayDifferInChild(std::string_view key, const PropertyDictionary& parent,
                                      const PropertyDictionary& before) const;

 private:
  [[nodiscard]] std::string_view named(std::string_view key) const;

  const ToldFates& told_;
  const DeviceFacts& facts_;
};

}  // namespace accounts
