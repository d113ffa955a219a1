#pragma once

#include <random>

#include "tests/ledger/LedgerFixture.h"

namespace accounts {

/// A device that a seed decides, of any stored version, with and without legacy stores. Every
/// account is one that devices have, and none stands where a rule replaces it.
class OrdinaryDevice {
 public:
  explicit OrdinaryDevice(unsigned seed) : random_(seed) {}

  DeviceFiles make();

  /// One of the numbers below a limit.
  unsigned below(unsigned limit) { return static_cast<unsigned>(random_() % limit); }
  bool chance(unsigned percent) { return below(100) < percent; }

 private:
  PropertyDictionary account(bool mailStore, bool exchangeStore);
  PropertyDictionary filled(PropertyDictionary account);
  PropertyDictionary description(std::string_view identifierKey, std::string_view classKey,
                                 std::string_view accountClass, std::string_view nameKey);
  std::string freshText();
  PropertyValue value(int depth);
  PropertyArray dataclasses();

  std::mt19937 random_;
  unsigned texts_ = 0;
};

}  // namespace accounts
