#pragma once

#include <string>
#include <string_view>

#include "propertylist/PropertyListError.h"
#include "propertylist/value/PropertyValue.h"

namespace accounts {

/// The value that an XML property list holds. A document type is skipped; entities other than XML's
/// own five and external references are refused. An error says what is wrong and at which line when
/// the bytes are malformed or pass one of the limits in PropertyListLimits.h.
OrPropertyListError<PropertyValue> readXMLPropertyList(std::string_view bytes);

/// A value as an XML property list, indented for people. The same value always gives the same
/// bytes, and reading them gives the value again, bit for bit. An error says what is wrong and
/// where for a value that XML cannot hold: a text with characters that XML forbids, a
/// date that is not a whole second of the years 0 to 9999, a NaN with bits of its own; or that
/// passes one of the limits in PropertyListLimits.h.
OrPropertyListError<std::string> writeXMLPropertyList(const PropertyValue& value);

}  // namespace accounts
