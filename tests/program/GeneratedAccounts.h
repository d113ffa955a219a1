#pragma once

#include "propertylist/value/PropertyValue.h"
#include "tests/program/Choices.h"

namespace accounts {

// Contents of the files that hold accounts: mostly such as devices have, with everything in them
// that a rule looks for, and now and then something that does not belong there.

/// A small value of any kind.
PropertyValue anyValue(Choices& choices);

/// The root of an account settings file of any version, with up to five accounts of up to two
/// children each.
PropertyDictionary generatedSettings(Choices& choices);

/// The roots of the legacy stores, with up to three descriptions in each list.
PropertyDictionary generatedLegacyMail(Choices& choices);
PropertyDictionary generatedLegacyExchange(Choices& choices);

}  // namespace accounts
