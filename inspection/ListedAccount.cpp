#include "inspection/ListedAccount.h"

#include "propertylist/value/Description.h"
#include "propertylist/value/HiddenSecrets.h"

namespace accounts {
namespace {

ListedAccount listed(std::string place, const PropertyValue& element, const StoreLayout& layout) {
  ListedAccount account{.place = std::move(place),
                        .properties = std::nullopt,
                        .element = element,
                        .identifier = std::nullopt,
                        .parentIdentifier = std::nullopt};
  if (const PropertyDictionary* properties = element.asDictionary()) {
    account.properties = *properties;
    account.identifier = properties->textForKey(layout.identifierKey);
  }
  return account;
}

void appendChildren(std::vector<ListedAccount>& accounts, const ListedAccount& parent,
                    const StoreLayout& layout) {
  if (layout.childrenKey.empty() || !parent.properties) {
    return;
  }
  std::size_t number = 0;
  const PropertyArray children =
      parent.properties->arrayForKey(layout.childrenKey).value_or(PropertyArray());
  for (const PropertyValue& element : children) {
    ListedAccount child = listed(parent.place + "." + std::to_string(++number), element, layout);
    child.index = parent.index;
    child.isChild = true;
    child.parentIdentifier = parent.identifier;
    accounts.push_back(std::move(child));
  }
}

}  // namespace

std::vector<ListedAccount> listedAccounts(const PropertyArray& array, const StoreLayout& layout) {
  std::vector<ListedAccount> accounts;
  std::size_t index = 0;
  for (const PropertyValue& element : array) {
    ListedAccount account = listed(std::to_string(index + 1), element, layout);
    account.index = index++;
    accounts.push_back(account);
    appendChildren(accounts, account, layout);
  }
  return accounts;
}

std::string wordFor(const PropertyDictionary& properties, std::string_view key) {
  const PropertyValue* value = key.empty() ? nullptr : properties.find(key);
  return value != nullptr ? describe(*value) : std::string();
}

std::string titleOf(const ListedAccount& account, const StoreLayout& layout) {
  if (!account.properties) {
    return "no account";
  }
  const std::string type = wordFor(*account.properties, layout.typeKey);
  const std::string name = wordFor(*account.properties, layout.nameKey);
  const std::string kind = type.empty() ? wordFor(*account.properties, layout.classKey) : type;
  // Feeds are named after their addresses.
  return textWithSecretsHidden(name.empty() ? kind
                                            : (kind.empty() ? "" : kind + " ") + "'" + name + "'");
}

}  // namespace accounts
