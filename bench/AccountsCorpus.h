#pragma once

#include <string>

#include "propertylist/value/PropertyValue.h"

namespace accounts::bench {

/// A settings file's content: a root dictionary with "Version" and "Accounts". Every account has
/// about twenty properties, of which half are texts of its own, like those of a large device.
PropertyValue accountsCorpus(int accountCount);

/// A value as an XML property list.
std::string xmlOf(const PropertyValue& value);

}  // namespace accounts::bench
