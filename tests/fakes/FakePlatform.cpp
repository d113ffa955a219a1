#include "tests/fakes/FakePlatform.h"

#include "propertylist/PropertyListFile.h"
#include "propertylist/binary/BinaryPropertyList.h"

namespace accounts {

FakePlatform::FakePlatform()
    : platform{bundleResources,     cloudAccountService, cloudTabService,     consoleLog,
               dateFormatter,       deviceInfoService,   externalSyncSources, fileSystem,
               frameworkLoader,     homeDirectory,       localizedStrings,    logSystem,
               mailDirectory,       pairingValueStore,   preferenceDomain,    preferencesBroadcast,
               profileRestrictions, propertyLists,       sharedResources,     uuidGenerator} {
  for (const std::string_view path :
       {"/tmp", "/var/mobile/tmp", "/var/mobile/Library/Preferences", "/var/mobile/Library/Mail",
        "/var/mobile/Library/Logs/CrashReporter"}) {
    fileSystem.addDirectory(path);
  }
}

void FakePlatform::addPropertyList(std::string_view path, const PropertyValue& value) {
  fileSystem.addFile(path, writeBinaryPropertyList(value).value());
}

std::optional<PropertyDictionary> FakePlatform::dictionaryAt(std::string_view path) const {
  const std::optional<std::string> bytes = fileSystem.contentsOf(path);
  const auto value = readPropertyList(bytes.value_or(""));
  const PropertyDictionary* dictionary = value ? value->asDictionary() : nullptr;
  return dictionary != nullptr ? std::optional(*dictionary) : std::nullopt;
}

}  // namespace accounts
