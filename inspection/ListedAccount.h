#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "inspection/StoreLayout.h"
#include "propertylist/value/PropertyValue.h"

namespace accounts {

/// An account as it stands in a file: a top-level one or a child of one.
struct ListedAccount {
  /// "3" for the third top-level account, "3.1" for its first child.
  std::string place;
  /// The index in the array, of a child its parent's.
  std::size_t index = 0;
  /// None for an element that is no dictionary and so no account.
  std::optional<PropertyDictionary> properties;
  /// The element itself.
  PropertyValue element;
  /// None when there is no text under the identifier's key.
  std::optional<Text> identifier;
  /// Of a child.
  bool isChild = false;
  std::optional<Text> parentIdentifier;
};

/// The accounts of one array of a store, each top-level one followed by its children.
std::vector<ListedAccount> listedAccounts(const PropertyArray& array, const StoreLayout& layout);

/// What stands under a key as a word for people: a text as it is, empty for no value or no key,
/// anything else as its description.
std::string wordFor(const PropertyDictionary& properties, std::string_view key);

/// How an account is named in a line, by its type or class and its name, such as "Gmail 'Work'".
std::string titleOf(const ListedAccount& account, const StoreLayout& layout);

}  // namespace accounts
