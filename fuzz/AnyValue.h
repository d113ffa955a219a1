#pragma once

#include "fuzz/FuzzInput.h"
#include "propertylist/value/PropertyValue.h"

namespace accounts {

/// A small value of any kind, nested a few levels at most.
PropertyValue anyValue(FuzzInput& input);

/// A text that an account may hold somewhere: one of the vocabulary, one that looks like a number
/// or a boolean, or a few characters.
Text anyText(FuzzInput& input);

}  // namespace accounts
