#pragma once

#include "platform/Platform.h"

namespace accounts {

/// What a platform has in the place of another one's; null for the other one's own.
struct ReplacedParts {
  ConsoleLog* consoleLog = nullptr;
  FileSystem* fileSystem = nullptr;
  FrameworkLoader* frameworkLoader = nullptr;
  LogSystem* logSystem = nullptr;
  PreferenceDomain* preferenceDomain = nullptr;
  PropertyLists* propertyLists = nullptr;
  SharedResources* sharedResources = nullptr;
  MigrationObserver* migrationObserver = nullptr;
};

/// A platform like another one but for some of its parts, which must outlive it.
inline Platform platformWith(const Platform& original, const ReplacedParts& parts) {
  const auto chosen = [](auto* replacement, auto& own) -> auto& {
    return replacement != nullptr ? *replacement : own;
  };
  return {.bundleResources = original.bundleResources,
          .cloudAccountService = original.cloudAccountService,
          .cloudTabService = original.cloudTabService,
          .consoleLog = chosen(parts.consoleLog, original.consoleLog),
          .dateFormatter = original.dateFormatter,
          .deviceInfoService = original.deviceInfoService,
          .externalSyncSources = original.externalSyncSources,
          .fileSystem = chosen(parts.fileSystem, original.fileSystem),
          .frameworkLoader = chosen(parts.frameworkLoader, original.frameworkLoader),
          .homeDirectory = original.homeDirectory,
          .localizedStrings = original.localizedStrings,
          .logSystem = chosen(parts.logSystem, original.logSystem),
          .mailDirectory = original.mailDirectory,
          .pairingValueStore = original.pairingValueStore,
          .preferenceDomain = chosen(parts.preferenceDomain, original.preferenceDomain),
          .preferencesBroadcast = original.preferencesBroadcast,
          .profileRestrictions = original.profileRestrictions,
          .propertyLists = chosen(parts.propertyLists, original.propertyLists),
          .sharedResources = chosen(parts.sharedResources, original.sharedResources),
          .uuidGenerator = original.uuidGenerator,
          .migrationObserver = parts.migrationObserver != nullptr ? parts.migrationObserver
                                                                  : original.migrationObserver};
}

}  // namespace accounts
