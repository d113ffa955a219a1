#pragma once

#include <string>

#include "platform/AccountFate.h"
#include "propertylist/value/PropertyValue.h"

namespace accounts {

/// A description of a legacy store under the keys of an account.
struct ConvertedDescription {
  PropertyDictionary account;
  /// A clause about a value that has no place there, since another one has it; empty for none.
  std::string loss;
};

/// What of a description must be found in the account that was made of it. An account of the
/// settings file stays as it is.
ConvertedDescription convertedDescription(const PropertyDictionary& description,
                                          AccountOrigin::Kind kind);

}  // namespace accounts
