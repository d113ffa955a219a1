#pragma once

#include <map>
#include <string>
#include <string_view>
#include <vector>

#include "platform/LocalizedStrings.h"
#include "propertylist/value/PropertyValue.h"

namespace accounts {

/// The string tables of a bundle: property lists LANGUAGE.lproj/TABLE.strings in its Resources
/// directory. Each is read once. For one thread.
class LinuxLocalizedStrings final : public LocalizedStrings {
 public:
  /// `languages` are tried in order. `resourcesDirectory` is a path of the host.
  LinuxLocalizedStrings(std::string resourcesDirectory, std::vector<std::string> languages);

  std::string localizedString(std::string_view key, std::string_view defaultValue,
                              std::string_view table) override;

 private:
  const PropertyDictionary& stringTable(const std::string& language, std::string_view table);

  std::string resourcesDirectory_;
  std::vector<std::string> languages_;
  std::map<std::string, PropertyDictionary> tablesByPath_;
};

}  // namespace accounts
