#pragma once

#include <string>
#include <vector>

#include "tests/program/DeviceRootFixture.h"

namespace accounts {

/// The smallest device with everything that a migration carries over: old settings and both legacy
/// stores. Every account has an identifier, so that each migration of it ends the same.
class InterruptedDevice : public DeviceRootFixture {
 protected:
  /// Migrates one such device without a disturbance, to know how it ends.
  InterruptedDevice();

  /// Makes the device anew, as it is before its first migration.
  void makeDevice() const;

  /// Expects what holds whenever a migration ended, wherever it stopped: the settings are wholly
  /// old or wholly new, and no legacy store is gone unless its accounts are in the settings.
  void expectNothingLost() const;

  /// Expects that nobody holds the migration's lock any more.
  void expectLockIsFree() const;

  /// Expects the device as an undisturbed migration leaves it, no file more or less but for the
  /// inputs that a killed run had kept.
  void expectMigrated() const;

  /// Migrates the device to the end and expects that it is as if nothing had happened.
  void expectNextRunFinishes(const std::vector<std::string>& arguments) const;

  [[nodiscard]] static PropertyDictionary settingsBefore();
  [[nodiscard]] const PropertyDictionary& settingsAfter() const { return settingsAfter_; }

 private:
  PropertyDictionary settingsAfter_;
  std::vector<std::string> filesAfter_;
};

}  // namespace accounts
