#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "accountsettings/BasicAccount.h"
#include "propertylist/value/Description.h"
#include "tests/fakes/FakePlatform.h"
#include "tests/fakes/StoreContents.h"

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

/// A mail account with the identifier "mail-1" and further properties.
inline BasicAccountReference mailAccount(const PropertyDictionary& further = {}) {
  return BasicAccount::initWithProperties(
      anAccount("mail-1", kMailAccountType, "IMAPAccount").with(further));
}

/// A primary cloud account, whose type supports nearly all dataclasses, with the identifier
/// "cloud-1" and further properties.
inline BasicAccountReference cloudAccount(const PropertyDictionary& further = {}) {
  return BasicAccount::initWithProperties(
      anAccount("cloud-1", kQuarxAccountType, "ZQAccount").with(further));
}

/// Makes an account-types configuration with a single type, whose properties these are, the one of
/// a fake device. To be called before the first use of the configuration.
inline void configureType(FakePlatform& device, std::string_view type,
                          const PropertyDictionary& properties) {
  device.bundleResources.replaced["AccountTypesProperties"] =
      PropertyDictionary{{type, properties}};
}

}  // namespace accounts
