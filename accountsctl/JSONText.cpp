#include "accountsctl/JSONText.h"

#include <cmath>
#include <utility>

#include "propertylist/Description.h"

namespace accounts {
namespace {

JSON jsonOfDictionary(const PropertyDictionary& dictionary) {
  JSON object = JSON::object();
  // An ordered object looks through all its keys for each that is put in; these are all different.
  auto& entries = object.get_ref<JSON::object_t&>();
  entries.reserve(dictionary.size());
  for (const PropertyEntry& entry : dictionary) {
    entries.push_back({entry.key.string(), jsonOf(entry.value)});
  }
  return object;
}

JSON jsonOfArray(const PropertyArray& array) {
  JSON list = JSON::array();
  for (const PropertyValue& element : array) {
    list.push_back(jsonOf(element));
  }
  return list;
}

/// The description of a value that has none of its own in JSON, which is a quoted text.
JSON jsonOfDescription(const PropertyValue& value) {
  std::string description;
  appendDescription(description, value);
  return description.substr(1, description.size() - 2);
}

}  // namespace

JSON jsonOf(const PropertyValue& value) {
  switch (value.kind()) {
    case PropertyKind::Dictionary:
      return jsonOfDictionary(*value.asDictionary());
    case PropertyKind::Array:
      return jsonOfArray(*value.asArray());
    case PropertyKind::String:
      return value.asText()->string();
    case PropertyKind::Integer:
      return value.asSigned() != nullptr ? JSON(*value.asSigned()) : JSON(*value.asLargeUnsigned());
    case PropertyKind::Boolean:
      return *value.asBoolean();
    case PropertyKind::Real:
      return std::isfinite(*value.asReal()) ? JSON(*value.asReal()) : jsonOfDescription(value);
    case PropertyKind::Date:
    case PropertyKind::Data:
      return jsonOfDescription(value);
  }
  return nullptr;
}

JSON reportObject(std::string_view subcommand) {
  return {{"command", subcommand}};
}

std::string lineOf(JSON object, ExitStatus exitStatus) {
  object["exitStatus"] = static_cast<int>(exitStatus);
  constexpr int onOneLine = -1;
  constexpr bool keepUnicode = false;
  return object.dump(onOneLine, ' ', keepUnicode, JSON::error_handler_t::replace) + "\n";
}

}  // namespace accounts
