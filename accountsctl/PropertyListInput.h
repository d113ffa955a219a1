#pragma once

#include <string>
#include <variant>

#include "commandline/ExitStatus.h"
#include "propertylist/value/PropertyValue.h"

namespace accounts {

/// The value of a property-list file of this machine, a pipe or standard input ("-"), in either
/// format. An error when it is missing, unreadable, too large (kLargestFileSize) or malformed.
std::variant<PropertyValue, ProgramError> readPropertyListInput(const std::string& file);

}  // namespace accounts
