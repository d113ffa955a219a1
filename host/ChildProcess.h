#pragma once

#include <functional>
#include <string>
#include <variant>

#include "commandline/ExitStatus.h"

namespace accounts {

/// Runs a function in a child process of its own and gives the text that it returns. The child's
/// standard output is its standard error, so that nothing that runs there can spoil what the host
/// writes; it is killed when the host ends first. An error, with the way the child ended in its
/// message, when the child ends by a signal or in any other way than by returning the text; an
/// error too when no child can be made.
std::variant<std::string, ProgramError> runInChildProcess(
    const std::function<std::string()>& function);

}  // namespace accounts
