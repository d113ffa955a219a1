#pragma once

#include <string>

#include "propertylist/value/OrError.h"

namespace accounts {

/// Why a property list could not be read or written, for an engineer.
struct PropertyListError {
  /// What is wrong and where: an offset in bytes, or a line of an XML file.
  std::string text;
};

/// What reading or writing a property list gives back.
template <class Value>
using OrPropertyListError = OrError<Value, PropertyListError>;

}  // namespace accounts
