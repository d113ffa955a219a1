#include "migrator/LegacyDescriptions.h"

#include <string>

#include "accountsettings/Process.h"

namespace accounts {

void moveLegacyKeys(PropertyDictionary& description, std::span<const LegacyKey> keys) {
  for (const LegacyKey& key : keys) {
    if (std::optional<PropertyValue> value = description.take(key.legacyKey)) {
      description.set(key.accountKey, *std::move(value));
    }
  }
}

void removeOriginalBeside(std::string_view legacyPath) {
  static_cast<void>(
      Process::current().platform.fileSystem.removeFile(std::string(legacyPath) + ".original"));
}

}  // namespace accounts
