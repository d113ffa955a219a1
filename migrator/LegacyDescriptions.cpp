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

void tellOutWithItsStore(AccountOrigin::Kind array, std::size_t count,
                         std::optional<std::size_t> refused) {
  if (Process::current().platform.migrationObserver == nullptr) {
    return;
  }
  for (std::size_t index = 0; index < count; ++index) {
    if (index != refused) {
      tellFate({{array, static_cast<std::uint32_t>(index)}, ToldFate::OutWithItsStore});
    }
  }
}

void removeOriginalBeside(std::string_view legacyPath) {
  static_cast<void>(
      Process::current().platform.fileSystem.removeFile(std::string(legacyPath) + ".original"));
}

}  // namespace accounts
