#include "accountsctl/AccountFindings.h"

#include <fmt/format.h>

#include "accountsettings/AccountsManager.h"
#include "propertylist/value/Description.h"

namespace accounts {
namespace {

/// What a key of an account dictionary holds. A value of another kind reads as absent.
struct KeyKind {
  std::string_view key;
  PropertyKind kind;
  std::string_view kindName;
};

const std::vector<KeyKind>& keyKinds() {
  static const std::vector<KeyKind> kinds = {
      {kAccountSyncIdentifier, PropertyKind::String, "text"},
      {kAccountDisplayName, PropertyKind::String, "text"},
      {kAccountUsername, PropertyKind::String, "text"},
      {kAccountTypeString, PropertyKind::String, "text"},
      {kAccountShortTypeString, PropertyKind::String, "text"},
      {kAccountEnabledDataclasses, PropertyKind::Array, "array"},
      {kAccountProvisionedDataclasses, PropertyKind::Array, "array"},
      {kAccountSupportedDataclasses, PropertyKind::Array, "array"},
      {kAccountChildAccounts, PropertyKind::Array, "array"}};
  return kinds;
}

/// Adds why no record can be made of a dictionary. `effect` is what a store does with it.
void addReasonsForRejection(const PropertyDictionary& properties, Effect effect,
                            const Finding& about, std::vector<Finding>& findings) {
  const std::optional<Text> type = properties.textForKey(kAccountType);
  if (!type) {
    addFinding(findings, about, effect, "missingType", "It has no type");
  } else if (!BasicAccount::_isValidAccountType(type)) {
    addFinding(findings, about, effect, "unknownType",
               fmt::format("The type '{}' is unknown", type->view()));
  }
  const std::optional<Text> accountClass = properties.textForKey(kAccountClass);
  if (!accountClass || accountClass->empty()) {
    addFinding(findings, about, effect, "missingClass", "It has no class");
  }
}

/// Adds what is found about a dictionary that became a record.
void addFindingsOfRecord(const BasicAccount& record, const PropertyDictionary& properties,
                         const Finding& about, std::vector<Finding>& findings) {
  if (!properties.textForKey(kAccountIdentifier)) {
    addFinding(findings, about, Effect::Repaired, "missingIdentifier",
               "It has no identifier: each loading gives it another one, until one is saved");
  }
  for (const KeyKind& expected : keyKinds()) {
    const PropertyValue* value = properties.find(expected.key);
    if (value != nullptr && value->kind() != expected.kind) {
      addFinding(
          findings, about, Effect::Ignored, "wrongKind",
          fmt::format("'{}' is no {}: it counts as missing", expected.key, expected.kindName));
    }
  }
  addDataclassFindings(record, about, findings);
}

/// The record of an account in a store that loads this account alone; null when the store leaves it
/// out.
BasicAccountReference loadedAlone(const PropertyValue& element) {
  const std::unique_ptr<AccountsManager> store =
      AccountsManager::initWithAccounsInfoArray(PropertyArray{element});
  const AccountsManager::Accounts& loaded = store->allBasicAccounts();
  return loaded.empty() ? nullptr : loaded.front();
}

std::string classOf(const PropertyDictionary& properties) {
  return properties.textForKey(kAccountClass).value_or(Text()).string();
}

}  // namespace

Finding findingAbout(const ListedAccount& account, const StoreLayout& layout) {
  Finding about;
  about.place = account.place;
  about.title = titleOf(account, layout);
  about.identifier = account.identifier;
  return about;
}

void addFinding(std::vector<Finding>& findings, const Finding& about, Effect effect,
                std::string_view code, std::string text) {
  Finding finding = about;
  finding.effect = effect;
  finding.code = code;
  finding.text = std::move(text);
  findings.push_back(std::move(finding));
}

ExaminedAccount examineAccount(const ListedAccount& account, const StoreLayout& layout,
                               Effect rejection) {
  ExaminedAccount examined;
  const Finding about = findingAbout(account, layout);
  if (!account.properties) {
    addFinding(examined.findings, about, rejection, "noDictionary",
               "It is no dictionary: " + describe(account.element));
    return examined;
  }
  if (BasicAccount::initWithProperties(*account.properties) == nullptr) {
    addReasonsForRejection(*account.properties, rejection, about, examined.findings);
    return examined;
  }
  examined.record = loadedAlone(*account.properties);
  const std::string storedClass = classOf(*account.properties);
  if (examined.record == nullptr) {
    addFinding(examined.findings, about, Effect::Dropped, "unfixableClass",
               fmt::format("The class '{}' is none of mail accounts, and the path of its mail "
                           "directory does not tell the right one",
                           storedClass));
    return examined;
  }
  const std::string loadedClass = classOf(examined.record->properties());
  if (loadedClass != storedClass) {
    addFinding(examined.findings, about, Effect::Repaired, "wrongClass",
               fmt::format("The class '{}' is none of mail accounts: it becomes '{}'", storedClass,
                           loadedClass));
  }
  addFindingsOfRecord(*examined.record, *account.properties, about, examined.findings);
  return examined;
}

ExaminedAccount examineChild(const ListedAccount& child, const BasicAccountReference& parent,
                             const StoreLayout& layout) {
  ExaminedAccount examined;
  const Finding about = findingAbout(child, layout);
  if (parent == nullptr) {
    addFinding(examined.findings, about, Effect::Dropped, "orphaned",
               "It is dropped with its parent");
    return examined;
  }
  if (!child.properties) {
    addFinding(examined.findings, about, Effect::Ignored, "noDictionary",
               "It is no dictionary: " + describe(child.element));
    return examined;
  }
  examined.record = BasicAccount::initWithProperties(*child.properties);
  if (examined.record == nullptr) {
    addReasonsForRejection(*child.properties, Effect::Ignored, about, examined.findings);
    return examined;
  }
  examined.record->setParentAccount(parent);
  if (!child.properties->arrayForKey(kAccountChildAccounts).value_or(PropertyArray()).empty()) {
    addFinding(examined.findings, about, Effect::Ignored, "childrenOfChild",
               "Its own children are carried along but are no accounts");
  }
  addFindingsOfRecord(*examined.record, *child.properties, about, examined.findings);
  return examined;
}

}  // namespace accounts
