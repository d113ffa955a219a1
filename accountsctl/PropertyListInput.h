#pragma once

#include <string>
#include <variant>

#include "commandline/ExitStatus.h"
#include "propertylist/PropertyValue.h"

namespace accounts {

/// The name that stands for standard input, or output, where a file is named.
inline constexpr const char* kStandardStream = "-";

/// The value of a property-list file of this machine, or of standard input, in either format. An
/// error when it is missing, unreadable, no regular file (standard input may be anything), too
/// large (kLargestFileSize) or malformed. Opening never waits.
std::variant<PropertyValue, ProgramError> readPropertyListInput(const std::string& file);

}  // namespace accounts
