#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "accountsettings/BasicAccount.h"
#include "propertylist/value/Description.h"
#include "tests/fakes/FakePlatform.h"

namespace accounts {

/// A list of dataclasses as a test reads it: the names without their common beginning, separated by
/// blanks; whatever else a list holds as in a log line; "none" for no list at all.
inline std::string shortNames(const std::optional<PropertyArray>& list) {
  constexpr std::string_view kCommonBeginning = "com.quarx.Dataclass.";
  if (!list) {
    return "none";
  }
  std::string names;
  for (const PropertyValue& member : *list) {
    std::string name;
    appendDescription(name, member);
    names += names.empty() ? "" : " ";
    names += name.starts_with(kCommonBeginning) ? name.substr(kCommonBeginning.size()) : name;
  }
  return names;
}

/// The description of a value, "none" for none.
inline std::string described(const std::optional<PropertyValue>& value) {
  std::string description = value ? "" : "none";
  if (value) {
    appendDescription(description, *value);
  }
  return description;
}

/// An account dictionary with further entries; of two entries with one key the later one holds.
inline PropertyDictionary with(PropertyDictionary properties, const PropertyDictionary& further) {
  for (const auto& [key, value] : further) {
    properties.set(key, value);
  }
  return properties;
}

/// A mail account with the identifier "mail-1" and further properties.
inline BasicAccountReference mailAccount(const PropertyDictionary& further = {}) {
  return BasicAccount::initWithProperties(with({{kAccountType, kMailAccountType},
                                                {kAccountClass, "IMAPAccount"},
                                                {kAccountIdentifier, "mail-1"}},
                                               further));
}

/// A primary cloud account, whose type supports nearly all dataclasses, with the identifier
/// "cloud-1" and further properties.
inline BasicAccountReference cloudAccount(const PropertyDictionary& further = {}) {
  return BasicAccount::initWithProperties(with({{kAccountType, kQuarxAccountType},
                                                {kAccountClass, "ZQAccount"},
                                                {kAccountIdentifier, "cloud-1"}},
                                               further));
}

/// Makes an account-types configuration with a single type, whose properties these are, the one of
/// a fake device. To be called before the first use of the configuration.
inline void configureType(FakePlatform& device, std::string_view type,
                          const PropertyDictionary& properties) {
  device.bundleResources.replaced["AccountTypesProperties"] =
      PropertyDictionary{{type, properties}};
}

}  // namespace accounts
