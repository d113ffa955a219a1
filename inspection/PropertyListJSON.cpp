#include "inspection/PropertyListJSON.h"

#include <cmath>

#include "propertylist/value/Description.h"

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
  const std::string description = describe(value);
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

std::string lineOf(const JSON& value) {
  constexpr int kOnOneLine = -1;
  constexpr bool kKeepUnicode = false;
  return escapedJSON(value.dump(kOnOneLine, ' ', kKeepUnicode, JSON::error_handler_t::replace));
}

JSON textOrNull(const std::optional<Text>& text) {
  return text ? JSON(text->string()) : JSON(nullptr);
}

JSON textOrNull(const std::optional<std::string>& text) {
  return text ? JSON(*text) : JSON(nullptr);
}

}  // namespace accounts
