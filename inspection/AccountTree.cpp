#include "inspection/AccountTree.h"

#include <algorithm>
#include <utility>
#include <vector>

#include "inspection/ListedAccount.h"
#include "propertylist/value/HiddenSecrets.h"
#include "vocabulary/AccountVocabulary.h"
#include "vocabulary/ElementName.h"

namespace accounts {
namespace {

std::optional<std::string> wordOrNone(const PropertyDictionary& properties, std::string_view key) {
  std::string word = wordFor(properties, key);
  return word.empty() ? std::nullopt : std::optional(std::move(word));
}

/// The dataclasses of both lists, the enabled ones first, each once.
JSON dataclassesOf(const PropertyDictionary& properties) {
  const PropertyArray enabled =
      properties.arrayForKey(kAccountEnabledDataclasses).value_or(PropertyArray());
  const PropertyArray provisioned =
      properties.arrayForKey(kAccountProvisionedDataclasses).value_or(PropertyArray());
  JSON list = JSON::array();
  std::vector<Text> seen;
  for (const PropertyArray& names : {enabled, provisioned}) {
    for (const PropertyValue& name : names) {
      const Text* const text = name.asText();
      if (text != nullptr && std::find(seen.begin(), seen.end(), *text) == seen.end()) {
        seen.push_back(*text);
        list.push_back({{"name", text->string()},
                        {"enabled", enabled.containsText(*text)},
                        {"provisioned", provisioned.containsText(*text)}});
      }
    }
  }
  return list;
}

JSON objectFor(const ListedAccount& account, const std::string& element, const StoreLayout& layout,
               FileKind kind, Secrets secrets) {
  PropertyDictionary properties = account.properties.value_or(PropertyDictionary());
  if (!account.isChild && properties.arrayForKey(layout.childrenKey)) {
    properties.remove(layout.childrenKey);
  }
  const PropertyValue shown =
      secrets == Secrets::Hide ? withSecretsHidden(properties) : PropertyValue(properties);
  return {{"source", identifierOf(kind)},
          {"place", account.place},
          {"element", element},
          {"identifier", textOrNull(account.identifier)},
          {"title", titleOf(account, layout)},
          {"type", textOrNull(wordOrNone(properties, layout.typeKey))},
          {"class", textOrNull(wordOrNone(properties, layout.classKey))},
          {"dataclasses", dataclassesOf(properties)},
          {"properties", jsonOf(shown)},
          {"children", JSON::array()}};
}

}  // namespace

void appendAccountTree(JSON& list, const PropertyDictionary& root, FileKind kind, Secrets secrets) {
  const std::optional<StoreLayout> layout = layoutOf(kind);
  if (!layout) {
    return;
  }
  for (const AccountArray& array : layout->arrays) {
    const PropertyArray accounts = root.arrayForKey(array.key).value_or(PropertyArray());
    std::size_t count = 0;
    for (const ListedAccount& account : listedAccounts(accounts, *layout)) {
      if (account.isChild) {
        JSON& siblings = list.back()["children"];
        const std::string element = elementName(array.key, count - 1, siblings.size());
        siblings.push_back(objectFor(account, element, *layout, kind, secrets));
      } else {
        list.push_back(objectFor(account, elementName(array.key, count), *layout, kind, secrets));
        ++count;
      }
    }
  }
}

}  // namespace accounts
