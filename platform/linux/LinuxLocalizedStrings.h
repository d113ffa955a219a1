#pragma once

#include <map>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "platform/LocalizedStrings.h"
#include "platform/linux/BundleFiles.h"
#include "propertylist/value/PropertyValue.h"

namespace accounts {

/// The string tables among the files of a bundle: property lists LANGUAGE.lproj/TABLE.strings. Each
/// is read once. For one thread.
class LinuxLocalizedStrings final : public LocalizedStrings {
 public:
  /// `languages` are tried in order. `files` must outlive this.
  LinuxLocalizedStrings(const BundleFiles& files, std::vector<std::string> languages)
      : files_(files), languages_(std::move(languages)) {}

  std::string localizedString(std::string_view key, std::string_view defaultValue,
                              std::string_view table) override;

 private:
  const PropertyDictionary& stringTable(const std::string& language, std::string_view table);

  const BundleFiles& files_;
  std::vector<std::string> languages_;
  std::map<std::string, PropertyDictionary> tablesByName_;
};

}  // namespace accounts
