#pragma once

#include "fuzz/FuzzInput.h"
#include "propertylist/value/PropertyValue.h"

namespace accounts {

/// An account dictionary that is almost right: most keys are known and most values plausible, but
/// any can be absent or of another kind.
PropertyDictionary accountFrom(FuzzInput& input);

/// The contents of an account settings file of any version, of almost right accounts.
PropertyDictionary settingsFrom(FuzzInput& input);

/// The contents of the legacy mail account preferences and of the legacy Exchange account file.
PropertyDictionary legacyMailFrom(FuzzInput& input);
PropertyDictionary legacyExchangeFrom(FuzzInput& input);

/// One of the account types, or a text that is none.
Text typeFrom(FuzzInput& input);

/// One of the dataclasses, or a text that is none.
Text dataclassFrom(FuzzInput& input);

}  // namespace accounts
