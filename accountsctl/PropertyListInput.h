#pragma once

#include <string>
#include <vector>

#include "accountsctl/CommandWorker.h"
#include "commandline/ExitStatus.h"
#include "propertylist/value/PropertyValue.h"

namespace accounts {

/// The values of property-list files of this machine, pipes or standard input ("-"), in either
/// format. An error when one is missing, unreadable, too large (kLargestFileSize) or malformed.
/// The worker gives up its rights once all are read.
OrProgramError<std::vector<PropertyValue>> readPropertyListInputs(
    const std::vector<std::string>& files, const CommandWorker& worker);

}  // namespace accounts
