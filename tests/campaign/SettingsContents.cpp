#include "tests/campaign/SettingsContents.h"

#include <algorithm>
#include <array>
#include <iterator>

#include "accountsettings/AccountsManager.h"
#include "propertylist/PropertyListFile.h"
#include "propertylist/binary/BinaryPropertyList.h"
#include "tests/program/StoredVersionsComparison.h"
#include "vocabulary/AccountVocabulary.h"

namespace accounts {

namespace {

/// Adds the texts under any of the keys that name an account, at any depth.
void addIdentifiers(std::set<std::string>& identifiers, const PropertyValue& value) {
  static constexpr std::array<std::string_view, 3> keys = {"Identifier", "uniqueId",
                                                           "DAAccountConfigurationAccountID"};
  if (const PropertyDictionary* dictionary = value.asDictionary()) {
    for (const PropertyEntry& entry : *dictionary) {
      if (std::ranges::find(keys, std::string_view(entry.key)) != keys.end() &&
          entry.value.asText() != nullptr) {
        identifiers.insert(entry.value.asText()->string());
      }
      addIdentifiers(identifiers, entry.value);
    }
  } else if (const PropertyArray* array = value.asArray()) {
    for (const PropertyValue& element : *array) {
      addIdentifiers(identifiers, element);
    }
  }
}

}  // namespace

std::optional<PropertyDictionary> dictionaryIn(const std::string& bytes) {
  const auto value = readPropertyList(bytes);
  const PropertyDictionary* dictionary = value ? value->asDictionary() : nullptr;
  return dictionary != nullptr ? std::optional(*dictionary) : std::nullopt;
}

std::string propertyListOf(const PropertyDictionary& dictionary) {
  return writeBinaryPropertyList(dictionary).value();
}

std::set<std::string> identifiersOf(const std::optional<std::string>& bytes) {
  std::set<std::string> identifiers;
  if (const auto dictionary = bytes ? dictionaryIn(*bytes) : std::nullopt) {
    addIdentifiers(identifiers, *dictionary);
  }
  return identifiers;
}

bool hasDuplicates(const PropertyDictionary& settings) {
  std::set<std::string> identifiers;
  std::size_t count = 0;
  for (const PropertyValue& element :
       settings.arrayForKey(kPlistAccountsKey).value_or(PropertyArray())) {
    const PropertyDictionary* account = element.asDictionary();
    if (const auto identifier = account ? account->textForKey(kAccountIdentifier) : std::nullopt) {
      identifiers.insert(identifier->string());
      ++count;
    }
  }
  return identifiers.size() != count;
}

std::string withFurtherAccount(const std::optional<std::string>& settings,
                               std::string_view identifier) {
  PropertyDictionary root =
      (settings ? dictionaryIn(*settings) : std::nullopt)
          .value_or(PropertyDictionary{{kPlistVersionKey, AccountsManager::currentVersion()}});
  PropertyArray accounts = root.arrayForKey(kPlistAccountsKey).value_or(PropertyArray());
  accounts.append(PropertyDictionary{{kAccountIdentifier, identifier},
                                     {kAccountType, kCalDAVAccountType},
                                     {kAccountClass, "CalDAVAccount"},
                                     {kAccountUsername, "berta"}});
  root.set(kPlistAccountsKey, accounts);
  return propertyListOf(root);
}

std::set<std::string> textsOn(const SimulatedDisk& disk) {
  std::set<std::string> texts;
  for (const std::string& path : disk.filesBeneath("/")) {
    if (const auto dictionary = dictionaryIn(*disk.contentsOf(path))) {
      collectTexts(texts, *dictionary);
    }
  }
  return texts;
}

std::set<std::string> intersection(const std::set<std::string>& one,
                                   const std::set<std::string>& other) {
  std::set<std::string> both;
  std::ranges::set_intersection(one, other, std::inserter(both, both.end()));
  return both;
}

bool isTemporary(std::string_view path) {
  return path.find("/.accounts-migration-") != std::string_view::npos;
}

std::vector<std::string> temporaryFiles(const SimulatedDisk& disk) {
  std::vector<std::string> files = disk.filesBeneath("/");
  std::erase_if(files, [](const std::string& path) { return !isTemporary(path); });
  return files;
}

}  // namespace accounts
