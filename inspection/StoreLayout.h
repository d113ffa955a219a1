#pragma once

#include <cstdint>
#include <optional>
#include <string_view>
#include <vector>

#include "propertylist/value/PropertyValue.h"

namespace accounts {

/// The kinds of file that engineers meet.
enum class FileKind : std::uint8_t {
  AccountSettings,
  MailStore,
  ExchangeStore,
  MigrationInformation,
  DeviceDescription,
  Other
};

/// What a file is, by the keys that it holds.
FileKind kindOf(const PropertyValue& content);

/// A kind in words for people, such as "account settings".
std::string_view nameOf(FileKind kind);
/// A kind as one word for programs, such as "accountSettings".
std::string_view identifierOf(FileKind kind);

/// An array of account dictionaries in the root of a store's file.
struct AccountArray {
  std::string_view key;
  /// What its accounts are called, one and several.
  std::string_view singular;
  std::string_view plural;
};

/// How a kind of file holds accounts. A key is empty where the kind has none.
struct StoreLayout {
  std::vector<AccountArray> arrays;
  std::string_view identifierKey;
  std::string_view typeKey;
  std::string_view classKey;
  std::string_view nameKey;
  std::string_view userKey;
  std::string_view childrenKey;
};

/// None for a kind that holds no accounts.
std::optional<StoreLayout> layoutOf(FileKind kind);

/// A part of a migration-information file: a whole store under a key.
struct InformationPart {
  std::string_view key;
  FileKind kind;
};
/// The parts in the order in which a migration makes them.
const std::vector<InformationPart>& informationParts();

}  // namespace accounts
