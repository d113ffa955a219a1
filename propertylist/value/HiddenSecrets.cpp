#include "propertylist/value/HiddenSecrets.h"

#include <optional>
#include <string>

#include "propertylist/value/SecretKeys.h"

namespace accounts {

namespace {

constexpr std::string_view kBeforeAuthority = "://";
/// What ends the part of a URL that says where: the characters that cannot stand in it unescaped.
constexpr std::string_view kAfterAuthority = "/?# \t\r\n\"'<>\\";

bool canBeSecret(const PropertyValue& value) {
  switch (value.kind()) {
    case PropertyKind::Dictionary:
      return !value.asDictionary()->empty();
    case PropertyKind::Array:
      return !value.asArray()->empty();
    case PropertyKind::String:
      return !value.asText()->empty();
    case PropertyKind::Data:
      return !value.asData()->bytes.view().empty();
    case PropertyKind::Integer:
    case PropertyKind::Real:
      return true;
    case PropertyKind::Boolean:
    case PropertyKind::Date:
      return false;
  }
  return true;
}

/// The text with the user information of its URLs hidden; none when it has none.
std::optional<std::string> textShownInstead(std::string_view text) {
  std::optional<std::string> shown;
  std::size_t taken = 0;
  for (std::size_t found = text.find(kBeforeAuthority); found != std::string_view::npos;
       found = text.find(kBeforeAuthority, found)) {
    found += kBeforeAuthority.size();
    const std::string_view authority =
        text.substr(found, text.substr(found).find_first_of(kAfterAuthority));
    // An "@" within the user information should be escaped, but people forget it.
    const std::size_t at = authority.rfind('@');
    if (at != std::string_view::npos && at > 0) {
      shown = shown.value_or("");
      shown->append(text.substr(taken, found - taken)).append(kHiddenValue);
      taken = found + at;
    }
  }
  if (shown) {
    shown->append(text.substr(taken));
  }
  return shown;
}

std::optional<PropertyValue> shownInstead(std::string_view key, const PropertyValue& value);

/// The value with its secrets hidden; none when it has none, as nearly all values do.
std::optional<PropertyValue> shownInstead(const PropertyValue& value) {
  if (const PropertyDictionary* dictionary = value.asDictionary()) {
    std::optional<PropertyDictionary> changed;
    for (const PropertyEntry& entry : *dictionary) {
      if (std::optional<PropertyValue> shown = shownInstead(entry.key, entry.value)) {
        if (!changed) {
          changed = *dictionary;
        }
        changed->set(entry.key, *std::move(shown));
      }
    }
    return changed ? std::optional<PropertyValue>(*std::move(changed)) : std::nullopt;
  }
  if (const PropertyArray* array = value.asArray()) {
    std::optional<PropertyArray> changed;
    for (std::size_t index = 0; index < array->size(); ++index) {
      if (std::optional<PropertyValue> shown = shownInstead(array->at(index))) {
        if (!changed) {
          changed = *array;
        }
        changed->replace(index, *std::move(shown));
      }
    }
    return changed ? std::optional<PropertyValue>(*std::move(changed)) : std::nullopt;
  }
  if (const Text* text = value.asText()) {
    const std::optional<std::string> shown = textShownInstead(text->view());
    return shown ? std::optional<PropertyValue>(*shown) : std::nullopt;
  }
  return std::nullopt;
}

std::optional<PropertyValue> shownInstead(std::string_view key, const PropertyValue& value) {
  return isSecretKey(key) && canBeSecret(value) ? std::optional<PropertyValue>(kHiddenValue)
                                                : shownInstead(value);
}

}  // namespace

PropertyValue withSecretsHidden(std::string_view key, const PropertyValue& value) {
  return shownInstead(key, value).value_or(value);
}

PropertyValue withSecretsHidden(const PropertyValue& value) {
  return shownInstead(value).value_or(value);
}

std::string textWithSecretsHidden(std::string_view text) {
  return textShownInstead(text).value_or(std::string(text));
}

}  // namespace accounts
