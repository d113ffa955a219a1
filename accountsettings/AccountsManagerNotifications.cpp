#include <algorithm>

#include "accountsettings/AccountCreators.h"
#include "accountsettings/AccountsManager.h"
#include "accountsettings/Log.h"
#include "accountsettings/Process.h"
#include "vocabulary/AccountClasses.h"

namespace accounts {

namespace {

constexpr std::string_view kNotifierCreator = "NotifierAccount";

constexpr std::string_view kNotifierClassNamesOperation =
    "+[AccountsManager _notifierClassNamesForAccountType:dataclass:]";
constexpr std::string_view kWillChangeOperation =
    "+[AccountsManager accountWillChange:forDataclass:]";
constexpr std::string_view kDidChangeOperation =
    "+[AccountsManager accountDidChange:forDataclass:]";
constexpr std::string_view kSendOperation =
    "-[AccountsManager _sendNotificationsForChangedAccounts]";

const AccountClass& notifierClassNamed(std::string_view name, std::string_view operation) {
  const AccountClass* notifier = creatorClassNamed(name);
  if (notifier == nullptr) {
    failAssertion(operation, kManagerSourceFile, "Could not find a class for class name %@",
                  {name});
  }
  return *notifier;
}

using DictionaryOrNone = std::optional<PropertyDictionary>;

PropertyArray enabledDataclassesOf(const DictionaryOrNone& properties) {
  return (properties ? properties->arrayForKey(kAccountEnabledDataclasses) : std::nullopt)
      .value_or(PropertyArray());
}

/// The text under a key in the current properties, or the original's where the current has none.
std::optional<Text> currentOrOriginalText(const DictionaryOrNone& current,
                                          const DictionaryOrNone& original, std::string_view key) {
  const std::optional<Text> text = current ? current->textForKey(key) : std::nullopt;
  return text || !original ? text : original->textForKey(key);
}

/// The properties whose change concerns every enabled dataclass: not the switches themselves, which
/// are compared one by one, not the children, and not the activity flag.
PropertyDictionary comparableProperties(const DictionaryOrNone& properties) {
  PropertyDictionary result = properties.value_or(PropertyDictionary());
  for (const std::string_view key :
       {kAccountEnabledDataclasses, kAccountChildAccounts, kIsActiveKey}) {
    result.remove(key);
  }
  return result;
}

/// The texts of a list, each once and sorted.
std::vector<Text> asSet(const PropertyArray& dataclasses) {
  std::vector<Text> result;
  for (const PropertyValue& dataclass : dataclasses) {
    if (const Text* text = dataclass.asText()) {
      result.push_back(*text);
    }
  }
  std::sort(result.begin(), result.end());
  result.erase(std::unique(result.begin(), result.end()), result.end());
  return result;
}

std::vector<Text> affectedDataclasses(AccountChangeType changeType,
                                      const DictionaryOrNone& original,
                                      const DictionaryOrNone& current) {
  const std::vector<Text> before = asSet(enabledDataclassesOf(original));
  const std::vector<Text> after = asSet(enabledDataclassesOf(current));
  switch (changeType) {
    case AccountChangeType::Added:
      return after;
    case AccountChangeType::Deleted:
      return before;
    case AccountChangeType::Modified:
      break;
  }
  std::vector<Text> affected;
  if (comparableProperties(original) == comparableProperties(current)) {
    std::set_symmetric_difference(before.begin(), before.end(), after.begin(), after.end(),
                                  std::back_inserter(affected));
  } else {
    // The switched ones and all that are on now: together, all that were or are on.
    std::set_union(before.begin(), before.end(), after.begin(), after.end(),
                   std::back_inserter(affected));
  }
  return affected;
}

using NotifierOperation = std::function<void(std::string_view, std::string_view)>;

/// Calls an optional operation of every notifier that is concerned with a dataclass of an account.
void callNotifiers(const BasicAccount& account, std::string_view dataclass,
                   NotifierOperation AccountClass::*notifierOperation, std::string_view operation) {
  const std::optional<Text> type = account.type();
  const Text identifier = account.identifier().value_or(Text());
  for (const Text& name :
       AccountsManager::_notifierClassNamesForAccountType_dataclass(type, dataclass)) {
    const NotifierOperation& notify = notifierClassNamed(name, operation).*notifierOperation;
    if (notify) {
      answerOf(name, operation, kManagerSourceFile, [&] { notify(identifier, dataclass); });
    }
  }
}

}  // namespace

std::vector<Text> AccountsManager::_notifierClassNamesForAccountType_dataclass(
    const std::optional<Text>& type, std::string_view dataclass) {
  std::vector<Text> classNames;
  for (const PropertyValue& element :
       creatorEntriesForType(type, kNotifierClassNamesOperation, kManagerSourceFile)) {
    const PropertyDictionary* creator = element.asDictionary();
    if (creator == nullptr || creator->textForKey(kCreatorTypeKey) != kNotifierCreator) {
      continue;
    }
    const PropertyDictionary description =
        creator->dictionaryForKey(kCreatorDescriptionKey).value_or(PropertyDictionary());
    const std::optional<PropertyArray> dataclasses =
        description.arrayForKey(kAccountSupportedDataclasses);
    if (!dataclasses || !dataclasses->containsText(dataclass)) {
      continue;
    }
    const std::optional<Text> framework = description.textForKey(kCreatorFrameworkKey);
    if (!framework) {
      failAssertion(kNotifierClassNamesOperation, kManagerSourceFile,
                    "Malformed AccountCreators information. Could not find the path to the "
                    "framework for the notifier with type %@",
                    {type});
    }
    loadCreatorFramework(*framework, kNotifierClassNamesOperation, kManagerSourceFile);
    const std::optional<Text> className = description.textForKey(kCreatorClassKey);
    if (!className || className->empty()) {
      // Kept on purpose: "notificatinos" is the text that engineers search for.
      failAssertion(kNotifierClassNamesOperation, kManagerSourceFile,
                    "Malformed AccountCreators information. Could not find the name of the class "
                    "for notificatinos with the type %@",
                    {type});
    }
    classNames.push_back(*className);
  }
  return classNames;
}

void AccountsManager::accountWillChange_forDataclass(const BasicAccount& account,
                                                     std::string_view dataclass) {
  callNotifiers(account, dataclass, &AccountClass::accountWillChange_forDataclass,
                kWillChangeOperation);
}

void AccountsManager::accountDidChange_forDataclass(const BasicAccount& account,
                                                    std::string_view dataclass) {
  callNotifiers(account, dataclass, &AccountClass::accountDidChange_forDataclass,
                kDidChangeOperation);
}

std::optional<std::string> AccountsManager::displayNameForGroupOfAccountType_forBeginningOfSentence(
    std::string_view type, bool beginningOfSentence) {
  if (type != kSubscribedCalendarAccountType) {
    return std::nullopt;
  }
  return Process::current().platform.localizedStrings.localizedString(
      beginningOfSentence ? "SUBSCRIBED_CALENDAR_GROUP_TITLE"
                          : "SUBSCRIBED_CALENDAR_GROUP_MID_SENTENCE_TITLE",
      "", "AccountsManager");
}

void AccountsManager::
    _addNotificationToDictionary_forChangeType_originalProperties_currentProperties(
        NotificationBatch& batch, AccountChangeType changeType, const DictionaryOrNone& original,
        const DictionaryOrNone& current) {
  const std::optional<Text> type = currentOrOriginalText(current, original, kAccountType);
  const Text identifier =
      currentOrOriginalText(current, original, kAccountIdentifier).value_or(Text());
  std::vector<Text> classNames;
  for (const Text& dataclass : affectedDataclasses(changeType, original, current)) {
    for (Text& name : _notifierClassNamesForAccountType_dataclass(type, dataclass)) {
      if (std::find(classNames.begin(), classNames.end(), name) == classNames.end()) {
        classNames.push_back(std::move(name));
      }
    }
  }
  if (classNames.empty()) {
    return;
  }
  // No type has no classes.
  const PropertyDictionary record{
      {kASChangeAccountChangeTypeKey, static_cast<std::int32_t>(changeType)},
      {kASChangeAccountIdentifierKey, identifier},
      {kASChangeAccountTypeKey, *type},
      {kASChangeAccountOriginallyEnabledDataclassesKey, enabledDataclassesOf(original)}};
  for (const Text& name : classNames) {
    batch[name].emplace_back(record);
  }
}

void AccountsManager::_sendNotificationsForChangedAccounts() const {
  NotificationBatch batch;
  const auto add = [&](AccountChangeType changeType, const DictionaryOrNone& original,
                       const DictionaryOrNone& current) {
    _addNotificationToDictionary_forChangeType_originalProperties_currentProperties(
        batch, changeType, original, current);
  };
  // Only top-level accounts are compared, and only those in the identifier index.
  const auto originals = _originalAccountsByID.inOrder();
  for (const auto& [identifier, original] : originals) {
    if (!_topLevelAccountsByID.contains(identifier)) {
      add(AccountChangeType::Deleted, original, std::nullopt);
    }
  }
  for (const auto& [identifier, account] : _topLevelAccountsByID.inOrder()) {
    if (!_originalAccountsByID.contains(identifier)) {
      add(AccountChangeType::Added, std::nullopt, account->propertiesToSave());
    }
  }
  for (const auto& [identifier, original] : originals) {
    if (const BasicAccountReference* account = _topLevelAccountsByID.find(identifier)) {
      add(AccountChangeType::Modified, original, (*account)->propertiesToSave());
    }
  }
  for (auto& [name, changes] : batch) {
    const AccountClass& notifier = notifierClassNamed(name, kSendOperation);
    if (!notifier.noteAccountChanges) {
      failAssertion(kSendOperation, kManagerSourceFile,
                    "The class %@ does not answer noteAccountChanges:", {name});
    }
    answerOf(name, kSendOperation, kManagerSourceFile,
             [&] { notifier.noteAccountChanges(PropertyArray(std::move(changes))); });
  }
}

}  // namespace accounts
