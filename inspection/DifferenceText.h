#pragma once

#include <string>
#include <string_view>

#include "commandline/Terminal.h"
#include "inspection/PropertyListJSON.h"

namespace accounts {

/// A difference, as differenceObject() gives it, in lines for people, each after an indentation. No
/// line for no difference.
std::string differenceText(const JSON& difference, const Terminal& terminal,
                           std::string_view indentation = "");

}  // namespace accounts
