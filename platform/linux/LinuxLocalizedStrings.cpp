#include "platform/linux/LinuxLocalizedStrings.h"

#include <utility>

#include "platform/linux/DictionaryFile.h"
#include "vocabulary/DevicePath.h"

namespace accounts {

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
  std::string name = joinedPath(language + ".lproj", table) + ".strings";
  const auto known = tablesByName_.find(name);
  if (known != tablesByName_.end()) {
    return known->second;
  }
  const auto bytes = files_.read(name);
  auto read = bytes ? dictionaryFromBytes(*bytes, name) : bytes.error();
  // A table that cannot be read translates nothing.
  return tablesByName_.emplace(std::move(name), std::move(read).value_or(PropertyDictionary()))
      .first->second;
}

}  // namespace accounts
