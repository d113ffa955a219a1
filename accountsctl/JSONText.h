#pragma once

#include <string>
#include <string_view>

#include "commandline/ExitStatus.h"
#include "inspection/PropertyListJSON.h"

namespace accounts {

/// The object that a subcommand reports, with its name, before what is its own.
JSON reportObject(std::string_view subcommand);

/// An object on one line with its line end, the exit status last. Bytes that are no UTF-8 are
/// replaced.
std::string lineOf(JSON object, ExitStatus exitStatus);

}  // namespace accounts
