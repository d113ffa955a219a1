#include "accountsettings/BasicAccount.h"
#include "accountsettings/Process.h"

namespace accounts {

const PropertyValue* BasicAccount::valueForKey(std::string_view key) const {
  for (const BasicAccount* account = this; account != nullptr;
       account = account->_parentAccount.get()) {
    if (const PropertyValue* value = account->_properties.find(key)) {
      return value;
    }
  }
  return nullptr;
}

std::optional<PropertyValue> BasicAccount::accountPropertyForKey(std::string_view key) const {
  const PropertyValue* value = valueForKey(key);
  return value != nullptr ? std::optional(*value) : std::nullopt;
}

std::optional<Text> BasicAccount::textPropertyForKey(std::string_view key) const {
  const PropertyValue* value = valueForKey(key);
  const Text* text = value != nullptr ? value->asText() : nullptr;
  return text != nullptr ? std::optional(*text) : std::nullopt;
}

std::optional<PropertyArray> BasicAccount::arrayPropertyForKey(std::string_view key) const {
  const PropertyValue* value = valueForKey(key);
  const PropertyArray* array = value != nullptr ? value->asArray() : nullptr;
  return array != nullptr ? std::optional(*array) : std::nullopt;
}

std::optional<PropertyDictionary> BasicAccount::dictionaryPropertyForKey(
    std::string_view key) const {
  const PropertyValue* value = valueForKey(key);
  const PropertyDictionary* dictionary = value != nullptr ? value->asDictionary() : nullptr;
  return dictionary != nullptr ? std::optional(*dictionary) : std::nullopt;
}

std::optional<bool> BasicAccount::booleanPropertyForKey(std::string_view key) const {
  const PropertyValue* value = valueForKey(key);
  return value != nullptr ? value->booleanValue() : std::nullopt;
}

std::optional<std::int64_t> BasicAccount::integerPropertyForKey(std::string_view key) const {
  const PropertyValue* value = valueForKey(key);
  return value != nullptr ? value->integerValue() : std::nullopt;
}

void BasicAccount::setAccountProperty_forKey(std::optional<PropertyValue> value,
                                             std::string_view key) {
  if (key != kAccountClass && key != kAccountType) {
    _forcedSetAccountProperty_forKey(std::move(value), key);
  }
}

void BasicAccount::_forcedSetAccountProperty_forKey(std::optional<PropertyValue> value,
                                                    std::string_view key) {
  if (!value) {
    removeAccountPropertyForKey(key);
    return;
  }
  const PropertyValue* present = _properties.find(key);
  if (present != nullptr && *present == *value) {
    return;
  }
  _properties.set(key, *std::move(value));
  noteChangeOfKey(key);
}

void BasicAccount::removeAccountPropertyForKey(std::string_view key) {
  if (_properties.take(key)) {
    noteChangeOfKey(key);
  }
}

void BasicAccount::noteChangeOfKey(std::string_view key) {
  if (key == kAccountIdentifier) {
    _ownIdentifier = _properties.textForKey(key).value_or(Text());
    ++Process::current().identifierChanges;
  } else if (key == kAccountSyncIdentifier) {
    ++Process::current().syncIdentifierChanges;
  } else if (key == kAccountType) {
    _ownType = _properties.textForKey(key).value_or(Text());
  } else if (key == kAccountClass) {
    _ownClass = _properties.textForKey(key).value_or(Text());
  }
}

void BasicAccount::setOriginalProperties(std::optional<PropertyDictionary> properties) {
  _originalProperties = std::move(properties);
}

std::optional<Text> BasicAccount::ownTextOrProperty(const Text& own, std::string_view key) const {
  return !own.empty() ? own : textPropertyForKey(key);
}

std::optional<Text> BasicAccount::type() const {
  return ownTextOrProperty(_ownType, kAccountType);
}

std::optional<Text> BasicAccount::identifier() const {
  return identifierProperty();
}

std::optional<Text> BasicAccount::identifierProperty() const {
  return ownTextOrProperty(_ownIdentifier, kAccountIdentifier);
}

std::optional<Text> BasicAccount::syncStoreIdentifier() const {
  return textPropertyForKey(kAccountSyncIdentifier);
}

std::optional<Text> BasicAccount::accountClass() const {
  return ownTextOrProperty(_ownClass, kAccountClass);
}

std::optional<Text> BasicAccount::displayName() const {
  return textPropertyForKey(kAccountDisplayName);
}

std::optional<Text> BasicAccount::typeString() const {
  return textPropertyForKey(kAccountTypeString);
}

std::optional<Text> BasicAccount::shortTypeString() const {
  return textPropertyForKey(kAccountShortTypeString);
}

void BasicAccount::setAccountClass(std::string_view newClass) {
  if (accountClass() != newClass) {
    _forcedSetAccountProperty_forKey(newClass, kAccountClass);
  }
}

void BasicAccount::setDisplayName(std::optional<Text> newName) {
  if (_properties.textForKey(kAccountDisplayName) != newName) {
    setAccountProperty_forKey(std::move(newName), kAccountDisplayName);
  }
}

void BasicAccount::setParentAccount(BasicAccountReference parent) {
  _parentAccount = std::move(parent);
  if (!_properties.textForKey(kAccountIdentifier)) {
    // Until now the old parent's identifier was this record's own as well.
    ++Process::current().identifierChanges;
  }
  if (!_properties.textForKey(kAccountSyncIdentifier)) {
    ++Process::current().syncIdentifierChanges;
  }
}

std::optional<Text> BasicAccount::parentAccountIdentifier() const {
  return _parentAccount ? _parentAccount->identifier() : std::nullopt;
}

}  // namespace accounts
