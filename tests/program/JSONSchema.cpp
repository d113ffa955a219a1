#include "tests/program/JSONSchema.h"

#include <algorithm>
#include <fstream>
#include <set>

namespace accounts {
namespace {

using JSON = nlohmann::json;

/// Validates against the part of JSON Schema that docs/schema uses. A validator of Debian's says
/// the same of samples (SchemaTest.cpp), but takes too long to be asked of every text.
class Validator {
 public:
  explicit Validator(const JSON& root) : root_(root) {}

  /// What is wrong with a value; empty when nothing is.
  [[nodiscard]] std::string problem(const JSON& schema, const JSON& value,
                                    const std::string& place) const {
    for (const auto& [keyword, content] : schema.items()) {
      const std::string found = problemWith(keyword, content, schema, value, place);
      if (!found.empty()) {
        return found;
      }
    }
    return "";
  }

 private:
  [[nodiscard]] std::string problemWith(const std::string& keyword, const JSON& content,
                                        const JSON& schema, const JSON& value,
                                        const std::string& place) const {
    static const std::set<std::string> kAnnotations = {"$schema", "$defs", "title", "description"};
    if (kAnnotations.contains(keyword)) {
      return "";
    }
    if (keyword == "$ref") {
      return problem(root_.at(JSON::json_pointer(content.get<std::string>().substr(1))), value,
                     place);
    }
    if (keyword == "type") {
      return hasType(content, value) ? "" : place + " is no " + content.dump();
    }
    if (keyword == "enum" || keyword == "const") {
      const JSON allowed = keyword == "enum" ? content : JSON::array({content});
      return std::find(allowed.begin(), allowed.end(), value) != allowed.end()
                 ? ""
                 : place + " is none of " + allowed.dump();
    }
    if (keyword == "minimum") {
      return !value.is_number() || value >= content ? "" : place + " is too small";
    }
    if (keyword == "anyOf") {
      std::string problems;
      for (const JSON& one : content) {
        const std::string found = problem(one, value, place);
        if (found.empty()) {
          return "";
        }
        problems += (problems.empty() ? "" : ", and ") + found;
      }
      return problems;
    }
    if (keyword == "required") {
      for (const JSON& key : content) {
        if (value.is_object() && !value.contains(key.get<std::string>())) {
          return place + " has no " + key.dump();
        }
      }
      return "";
    }
    if (keyword == "properties" || keyword == "items") {
      return problemInside(keyword == "items", schema, value, place);
    }
    return "the schema has the unknown keyword " + keyword;
  }

  [[nodiscard]] std::string problemInside(bool isArray, const JSON& schema, const JSON& value,
                                          const std::string& place) const {
    if (isArray ? !value.is_array() : !value.is_object()) {
      return "";
    }
    std::string found;
    for (const auto& [key, member] : value.items()) {
      if (found.empty() && (isArray || schema["properties"].contains(key))) {
        found = problem(isArray ? schema["items"] : schema["properties"][key], member,
                        place + "/" + key);
      }
    }
    return found;
  }

  static bool hasType(const JSON& type, const JSON& value) {
    if (type.is_array()) {
      return std::any_of(type.begin(), type.end(),
                         [&](const JSON& one) { return hasType(one, value); });
    }
    return (type == "string" && value.is_string()) || (type == "boolean" && value.is_boolean()) ||
           (type == "integer" && value.is_number_integer()) ||
           (type == "number" && value.is_number()) || (type == "null" && value.is_null()) ||
           (type == "array" && value.is_array()) || (type == "object" && value.is_object());
  }

  const JSON& root_;
};

}  // namespace

std::string schemaOf(const JSON& object) {
  const auto command = object.find("command");
  if (command == object.end()) {
    return object.contains("restored") ? "restore" : "run";
  }
  if (!command->is_string()) {
    // A refusal of accountsctl before there is a subcommand.
    return "refusal";
  }
  return *command == "run" || *command == "plan" ? "report" : command->get<std::string>();
}

std::string problemWithSchema(const JSON& object) {
  const std::string name = schemaOf(object);
  std::ifstream stream(SCHEMA_DIRECTORY "/" + name + ".json");
  const JSON schema = JSON::parse(stream, nullptr, /*allow_exceptions=*/false);
  return schema.is_object() ? Validator(schema).problem(schema, object, name) : "no schema " + name;
}

}  // namespace accounts
