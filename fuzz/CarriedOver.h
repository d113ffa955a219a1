#pragma once

#include <vector>

#include "fuzz/FuzzedDevice.h"
#include "propertylist/value/PropertyValue.h"

namespace accounts {

/// What a migration must carry over of a device's account settings. It looks at devices alone whose
/// rules are plain: without legacy stores, whose accounts replace others, and without identifiers
/// that several accounts share, the on-device account among them, which a migration makes.
class CarriedOver {
 public:
  /// Looks at a device before its migration. The account settings file is rewritten with a mark in
  /// each account, under a key that nobody knows.
  explicit CarriedOver(FuzzedDevice& device);

  /// Ends the process with a complaint unless all that must be is in the file after a migration
  /// that saved it.
  void checkAfterMigration(const FuzzedDevice& device) const;

 private:
  bool isPlain_ = false;
  bool isUpToDate_ = false;
  /// The accounts that the store loads.
  PropertyArray accounts_;
  /// The marks of those that no step takes away.
  std::vector<PropertyValue> marks_;
};

}  // namespace accounts
