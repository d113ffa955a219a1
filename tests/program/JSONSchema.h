#pragma once

#include <nlohmann/json.hpp>
#include <string>

namespace accounts {

/// What keeps a JSON text that one of the programs wrote from being what its schema in docs/schema
/// says, with the place; empty when it is. Which schema it has, the object itself tells.
std::string problemWithSchema(const nlohmann::json& object);

/// The file name of that schema, without its ending.
std::string schemaOf(const nlohmann::json& object);

}  // namespace accounts
