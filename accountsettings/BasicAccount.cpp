#include "accountsettings/BasicAccount.h"

#include "accountsettings/Log.h"
#include "accountsettings/Process.h"

namespace accounts {

namespace {

std::optional<Text> textOrNone(std::optional<std::string_view> text) {
  return text ? std::optional<Text>(*text) : std::nullopt;
}

}  // namespace

BasicAccountReference BasicAccount::initWithProperties(const PropertyDictionary& properties) {
  // Only the class itself may call its constructor; a record shares its memory with its counts.
  struct Record final : BasicAccount {};
  const BasicAccountReference account = std::make_shared<Record>();
  return account->acceptProperties(properties) ? account : nullptr;
}

bool BasicAccount::accepts(const PropertyDictionary& properties) {
  return _isValidAccountType(properties.textForKey(kAccountType)) &&
         !properties.textForKey(kAccountClass).value_or(Text()).empty();
}

bool BasicAccount::acceptProperties(const PropertyDictionary& properties) {
  static constexpr std::string_view kOperation = "-[BasicAccount initWithProperties:]";
  const std::optional<Text> type = properties.textForKey(kAccountType);
  const std::optional<Text> accountClass = properties.textForKey(kAccountClass);
  const bool isValidType = _isValidAccountType(type);
  if (!isValidType) {
    logToChannel(kOperation, "Invalid account type: %@", [&] { return logArguments(type); });
  }
  if (!accountClass || accountClass->empty()) {
    logToChannel(kOperation, "Missing account class.");
    return false;
  }
  if (!isValidType) {
    return false;
  }
  _originalProperties = properties;
  _properties = properties;
  _ownType = *type;
  _ownClass = *accountClass;
  if (const std::optional<Text> own = properties.textForKey(kAccountIdentifier)) {
    _ownIdentifier = *own;
  } else if (const std::optional<Text> identifier = createNewAccountUID()) {
    _ownIdentifier = *identifier;
    _properties.set(kAccountIdentifier, *identifier);
    if (!_properties.textForKey(kAccountSyncIdentifier)) {
      _properties.set(kAccountSyncIdentifier, *identifier);
    }
  }
  return true;
}

std::string_view BasicAccount::whyRefused(const PropertyValue& element) {
  const PropertyDictionary* const properties = element.asDictionary();
  if (properties == nullptr) {
    return "it is no dictionary";
  }
  const std::optional<Text> type = properties->textForKey(kAccountType);
  if (_isValidAccountType(type)) {
    return "it has no class";
  }
  return type ? "its type is unknown" : "it has no type";
}

BasicAccountReference BasicAccount::_initWithType_class(
    std::optional<std::string_view> type, std::optional<std::string_view> accountClass) {
  static constexpr std::string_view kOperation = "-[BasicAccount _initWithType:class:]";
  if (!accountClass || accountClass->empty()) {
    failAssertion(kOperation, kAccountSourceFile, "The account class is required.");
  }
  if (!_isValidAccountType(type)) {
    failAssertion(kOperation, kAccountSourceFile, "The account type (%@) is not supported",
                  {textOrNone(type)});
  }
  PropertyDictionary properties = {{kAccountType, *type}, {kAccountClass, *accountClass}};
  if (const std::optional<Text> identifier = createNewAccountUID()) {
    properties.set(kAccountIdentifier, *identifier);
    properties.set(kAccountSyncIdentifier, *identifier);
  }
  return initWithProperties(properties);
}

BasicAccountReference BasicAccount::init() {
  failAssertion("-[BasicAccount init]", kAccountSourceFile, "Don't use this method");
}

BasicAccountReference BasicAccount::accountWithType_class(
    std::optional<std::string_view> type, std::optional<std::string_view> accountClass) {
  return _initWithType_class(type, accountClass);
}

BasicAccountReference BasicAccount::accountWithProperties(const PropertyDictionary& properties) {
  return initWithProperties(properties);
}

std::optional<Text> BasicAccount::createNewAccountUID() {
  const std::optional<std::string> uuid = Process::current().platform.uuidGenerator.randomUUID();
  return uuid ? std::optional<Text>(*uuid) : std::nullopt;
}

}  // namespace accounts
