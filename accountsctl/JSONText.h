#pragma once

#include <nlohmann/json.hpp>
#include <string>
#include <string_view>

#include "commandline/ExitStatus.h"
#include "propertylist/PropertyValue.h"

namespace accounts {

/// Objects keep the order in which their keys are put in.
using JSON = nlohmann::ordered_json;

/// A value in JSON: a date as ISO 8601 text, data as "<hex>", NaN and infinities as texts.
JSON jsonOf(const PropertyValue& value);

/// The object that a subcommand reports, with its name, before what is its own.
JSON reportObject(std::string_view subcommand);

/// An object on one line with its line end, the exit status last. Bytes that are no UTF-8 are
/// replaced.
std::string lineOf(JSON object, ExitStatus exitStatus);

}  // namespace accounts
