#pragma once

#include <set>
#include <string>
#include <vector>

#include "propertylist/value/PropertyValue.h"

namespace accounts {

/// Adds every text that a value holds, at any depth, to a set; the keys of dictionaries are not
/// among them.
void collectTexts(std::set<std::string>& texts, const PropertyValue& value);

/// A value in which every identifier that a migration made up has a name. A made-up identifier is a
/// text in the form of a UUID that is not among `knownTexts`, the texts that were there before. The
/// first one met, going through arrays in order and through dictionaries in the order of their
/// keys, becomes "NEW-1", the next one "NEW-2" and so on; names that are known texts are passed
/// over. The same identifier gets the same name everywhere.
PropertyValue withNamedIdentifiers(const PropertyValue& value,
                                   const std::set<std::string>& knownTexts);

/// One line for every difference between two values, none when they are equal. A line names the
/// place from outside in (an account by its position and identifier) and gives what is expected and
/// what was found there.
std::vector<std::string> differences(const PropertyValue& expected, const PropertyValue& found);

}  // namespace accounts
