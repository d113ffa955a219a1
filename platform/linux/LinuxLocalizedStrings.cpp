#include "platform/linux/LinuxLocalizedStrings.h"

#include <utility>

#include "platform/linux/DictionaryFile.h"
#include "vocabulary/DevicePath.h"

namespace accounts {

LinuxLocalizedStrings::LinuxLocalizedStrings(std::string resourcesDirectory,
                                             std::vector<std::string> languages)
    : resourcesDirectory_(std::move(resourcesDirectory)), languages_(std::move(languages)) {}

std::string LinuxLocalizedStrings::localizedString(std::string_view key,
                                                   std::string_view defaultValue,
                                                   std::string_view table) {
  for (const std::string& language : languages_) {
    if (const auto text = stringTable(language, table).textForKey(key)) {
      return text->string();
    }
  }
  return std::string(defaultValue.empty() ? key : defaultValue);
}

const PropertyDictionary& LinuxLocalizedStrings::stringTable(const std::string& language,
                                                             std::string_view table) {
  std::string path = joinedPath(joinedPath(resourcesDirectory_, language + ".lproj"), table);
  path += ".strings";
  const auto known = tablesByPath_.find(path);
  if (known != tablesByPath_.end()) {
    return known->second;
  }
  PathError error;
  auto read = readHostDictionaryFile(path, error, Pipes::Refuse);
  // A table that cannot be read translates nothing.
  return tablesByPath_.emplace(std::move(path), std::move(read).value_or(PropertyDictionary()))
      .first->second;
}

}  // namespace accounts
