#include "inspection/StoreLayout.h"

#include <algorithm>
#include <iterator>

#include "platform/linux/DeviceDescription.h"
#include "vocabulary/AccountVocabulary.h"
#include "vocabulary/LegacyStoreKeys.h"

namespace accounts {
namespace {

struct KindName {
  FileKind kind;
  std::string_view name;
  std::string_view identifier;
};

constexpr KindName kKindNames[] = {
    {FileKind::AccountSettings, "account settings", "accountSettings"},
    {FileKind::MailStore, "legacy mail accounts", "mailStore"},
    {FileKind::ExchangeStore, "legacy Exchange accounts", "exchangeStore"},
    {FileKind::MigrationInformation, "migration information", "migrationInformation"},
    {FileKind::DeviceDescription, "device description", "deviceDescription"},
    {FileKind::Other, "property list of another kind", "other"},
};

const KindName& entryOf(FileKind kind) {
  return *std::find_if(std::begin(kKindNames), std::end(kKindNames),
                       [&](const KindName& entry) { return entry.kind == kind; });
}

struct TellingKey {
  std::string_view key;
  PropertyKind valueKind;
  FileKind fileKind;
};

/// The first of these keys that a file has tells its kind.
const std::vector<TellingKey>& tellingKeys() {
  static const std::vector<TellingKey> keys = [] {
    std::vector<TellingKey> table = {
        {kPlistAccountsKey, PropertyKind::Array, FileKind::AccountSettings},
        {kLegacyIncomingAccounts, PropertyKind::Array, FileKind::MailStore},
        {kLegacyOutgoingAccounts, PropertyKind::Array, FileKind::MailStore},
        {kLegacyExchangeAccounts, PropertyKind::Array, FileKind::ExchangeStore},
    };
    for (const InformationPart& part : informationParts()) {
      table.push_back({part.key, PropertyKind::Dictionary, FileKind::MigrationInformation});
    }
    for (const std::string_view key : kDeviceDescriptionKeys) {
      table.push_back({key, PropertyKind::Dictionary, FileKind::DeviceDescription});
    }
    // A settings file without accounts.
    table.push_back({kPlistVersionKey, PropertyKind::Integer, FileKind::AccountSettings});
    return table;
  }();
  return keys;
}

}  // namespace

FileKind kindOf(const PropertyValue& content) {
  const PropertyDictionary* root = content.asDictionary();
  if (root == nullptr) {
    return FileKind::Other;
  }
  for (const TellingKey& telling : tellingKeys()) {
    const PropertyValue* value = root->find(telling.key);
    if (value != nullptr && value->kind() == telling.valueKind) {
      return telling.fileKind;
    }
  }
  return FileKind::Other;
}

std::string_view nameOf(FileKind kind) {
  return entryOf(kind).name;
}

std::string_view identifierOf(FileKind kind) {
  return entryOf(kind).identifier;
}

std::optional<StoreLayout> layoutOf(FileKind kind) {
  switch (kind) {
    case FileKind::AccountSettings:
      return StoreLayout{.arrays = {{kPlistAccountsKey, "account", "accounts"}},
                         .identifierKey = kAccountIdentifier,
                         .typeKey = kAccountType,
                         .classKey = kAccountClass,
                         .nameKey = kAccountDisplayName,
                         .userKey = kAccountUsername,
                         .childrenKey = kAccountChildAccounts};
    case FileKind::MailStore:
      return StoreLayout{
          .arrays = {{kLegacyIncomingAccounts, "incoming account", "incoming accounts"},
                     {kLegacyOutgoingAccounts, "outgoing account", "outgoing accounts"}},
          .identifierKey = kLegacyMailIdentifier,
          .typeKey = {},
          .classKey = kLegacyMailClass,
          .nameKey = kLegacyMailDisplayName,
          .userKey = kAccountUsername,
          .childrenKey = {}};
    case FileKind::ExchangeStore:
      return StoreLayout{.arrays = {{kLegacyExchangeAccounts, "account", "accounts"}},
                         .identifierKey = kLegacyExchangeIdentifier,
                         .typeKey = {},
                         .classKey = kLegacyExchangeClass,
                         .nameKey = kLegacyExchangeDisplayName,
                         .userKey = kAccountUsername,
                         .childrenKey = {}};
    default:
      return std::nullopt;
  }
}

const std::vector<InformationPart>& informationParts() {
  static const std::vector<InformationPart> parts = {
      {kInformationOldMailAccounts, FileKind::MailStore},
      {kInformationOldExchangeAccounts, FileKind::ExchangeStore},
      {kInformationOldSettings, FileKind::AccountSettings},
      {kInformationNewSettings, FileKind::AccountSettings}};
  return parts;
}

}  // namespace accounts
