#pragma once

#include <array>
#include <cstddef>
#include <string>
#include <string_view>
#include <unordered_map>

#include "propertylist/value/PropertyValue.h"
#include "safetynet/AccountLedger.h"

namespace accounts {

/// Knows which identifiers several accounts of all inputs of a migration have.
class SharedIdentifiers {
 public:
  /// `inputs` are the arrays of accounts by kind of origin; children count, too.
  explicit SharedIdentifiers(const std::array<PropertyArray, 5>& inputs);

  [[nodiscard]] bool isShared(const Text& identifier) const;

 private:
  void count(const PropertyValue& element, std::string_view key);

  std::unordered_map<std::string, std::size_t> counts_;
};

}  // namespace accounts
